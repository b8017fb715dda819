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

/** @return an attribute as a trace names it: leds/state of /sys/class/leds/vibrator/state. */
std::string traceName(std::string_view path);

/**
 * @return the line of an access that ends now, with the seconds of the monotonic clock, like
 *     `12.345678 leds/state write "1\n" = 2`, newline included.
 * @param access the attribute, the system call and what it was given: `leds/state open O_RDWR`,
 *     `leds/state read 16`, `leds/state write "1\n"`, `leds/state close`.
 * @param result what the call returned, or a negative errno.
 * @param shown bytes that a read yielded, already quoted; empty for the other calls.
 */
std::string traceLine(const std::string& access, long result, const std::string& shown = {});

}  // namespace model
