// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>

namespace vibratorctl {

/**
 * @param maxMiB the most that it may hold, in MiB.
 * @return what a file holds, or standard input for "-". @throw cli::UsageError
 */
std::string readInput(const std::string& name, size_t maxMiB = 64);

}  // namespace vibratorctl
