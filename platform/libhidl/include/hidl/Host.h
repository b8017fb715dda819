// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <chrono>
#include <string>

/** What only this platform offers, for programs that are not built for a device's runtime. */
namespace android::hardware::host {

/** @return the transport of this process's calls, and why it is used. */
std::string transportDescription();

/** @return whether a service manager answers, in words. */
std::string serviceManagerDescription();

/** Looks once for a service. @return why it is not there, in words. */
std::string lookupError(const std::string& interface, const std::string& instance = "default");

/**
 * Limits how long a call may take; one that takes longer fails with TIMED_OUT. Over sockets its
 * object then stays unusable, and the limit applies only to objects that are found afterwards.
 *
 * @param limit 0 for no limit, which is the default.
 */
void setCallTimeout(std::chrono::milliseconds limit);

}  // namespace android::hardware::host
