// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Folder.h"

#include <sys/types.h>

namespace simulator {

/** Size at which a trace stops growing, in bytes: about a million accesses. */
constexpr off_t kTraceLimit = off_t{64} << 20;

/** @return the file that every access of the driver below a directory is appended to. */
std::string traceFile(const std::string& directory);

/**
 * Appends one access to the trace, with the seconds of the monotonic clock, like
 * `12.345678 leds/state write "1\n" = 2`. Only in a directory that is marked as a driver's, and up
 * to the limit.
 *
 * @param result what the operation returned, or a negative errno.
 * @param shown bytes that a read yielded, already quoted; empty for the other operations.
 */
void trace(const Folder& directory, const std::string& access, long result,
           const std::string& shown = {});

/** From now on this process only looks: its accesses are not traced, and faults do not apply. */
void onlyLook();
/** @return whether this process only looks. */
bool onlyLooks();

/** @return bytes between quotation marks, escaped as in C. */
std::string quote(std::string_view bytes);

}  // namespace simulator
