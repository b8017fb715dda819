// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <string>

/** What this platform offers beyond a device's: only for programs that are not for a device. */
namespace android::hardware::host {

/** @return what the calls of this process go over, and why: "/dev/hwbinder: ...". */
std::string transportDescription();

/** @return whether a service manager answers, in words. */
std::string serviceManagerDescription();

/** @return why the last getService or tryGetService of this thread gave nullptr, in words. */
std::string lookupError();

/**
 * Limits how long a call may take; one that takes longer fails with TIMED_OUT. Over sockets its
 * object then stays unusable, and the limit holds for objects that are found afterwards.
 *
 * @param limit 0 for no limit, which is the default.
 */
void setCallTimeout(std::chrono::milliseconds limit);

}  // namespace android::hardware::host
