// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <string>
#include <string_view>

/** The trace of a driver's accesses, which vibratorctl shows and draws: one line each. */
namespace model {

/** Size at which a trace stops growing, in bytes: about a million accesses. */
constexpr off_t kTraceLimit = off_t{64} << 20;

/** @return bytes between quotation marks, escaped as in C. */
std::string quote(std::string_view bytes);

/** @return the flag with which a file is opened to read, write or both, like "O_RDWR". */
std::string accessMode(int flags);

/**
 * @return the line of an access that ends now, with the seconds of the monotonic clock, like
 *     `12.345678 leds/state write "1\n" = 2`, newline included.
 * @param path the attribute's: of /sys/class/leds/vibrator/state the line has leds/state.
 * @param access the system call and what it was given: `open O_RDWR`, `read 16`, `write "1\n"`,
 *     `close`.
 * @param result what the call returned, or a negative errno.
 * @param shown bytes that a read yielded, already quoted; empty for the other calls.
 */
std::string traceLine(const std::string& path, const std::string& access, long result,
                      const std::string& shown);

}  // namespace model
