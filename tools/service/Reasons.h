// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "service/Connection.h"
#include "service/LocalDriver.h"

#include <string>
#include <vector>

namespace vibratorctl {

using VibratorStatus = ::android::hardware::vibrator::V1_0::Status;

/** An operation of the interface, and what a call of it needs. */
struct Operation {
    std::string name;
    /** Whether only root and the system user may call it. */
    bool isRestricted = false;
    /** The nodes that it needs besides those that run the motor. */
    std::vector<std::string> nodes = {};
};

/** @return whether this process's user may make the restricted calls. */
bool mayCallRestricted();

/** @return who may, in words. */
std::string permittedUsers();

/** @return why a call was refused to this process's user. */
std::string notPermitted();

/**
 * @param service the process that refused it.
 * @return why the service refused a call, judged by the driver, and what to do.
 */
std::string reasonOf(const Operation& operation, VibratorStatus status, const Process& service);

}  // namespace vibratorctl
