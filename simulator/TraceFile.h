// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Folder.h"

#include <sys/types.h>

namespace simulator {

/** @return the file that every access of the driver below a directory is appended to. */
std::string traceFile(const std::string& directory);

/**
 * Appends the line of one access, as model::traceLine makes it, to the trace of a directory that is
 * marked as a driver's. Up to the limit.
 */
void trace(const Folder& directory, const std::string& path, const std::string& access, long result,
           const std::string& shown = {});

}  // namespace simulator
