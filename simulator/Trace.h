// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <string_view>

namespace simulator {

/** @return the file that every access of the driver below a directory is appended to. */
std::string traceFile(const std::string& directory);

/**
 * Appends one access to the trace: seconds of the monotonic clock, and what happened, like
 * `12.345678 leds/state write "1\n" = 2`.
 *
 * @param result what the operation returned, or a negative errno.
 * @param shown bytes that a read yielded, already quoted; empty for the other operations.
 */
void trace(const std::string& directory, const std::string& access, long result,
           const std::string& shown = {});

/** @return bytes between quotation marks, escaped as in C. */
std::string quote(std::string_view bytes);

}  // namespace simulator
