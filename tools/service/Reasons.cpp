// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"
#include "service/Client.h"
#include "service/LocalDriver.h"

#include <unistd.h>

namespace vibratorctl {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

namespace {

/** @return why external control is refused while the motor counts as running. */
std::string runningReason(const LocalDriver& driver) {
    const bool isLed = DriverMode == kLedTriggerMode;
    return std::string("refused while the motor counts as running (") +
           (isLed ? "duration" : "enable") + " is " +
           driver.look(isLed ? THE_DEVICE_DURATION : THE_DEVICE_ENABLE).firstLine() +
           "); first: vibratorctl " + (isLed ? "on 0" : "off");
}

}  // namespace

bool mayCallRestricted() {
    return getuid() == 0 || getuid() == 1000;
}

std::string notPermitted() {
    return "not permitted: only root and uid 1000 (system) may do this, not uid " +
           std::to_string(getuid());
}

std::string reasonOf(const Operation& operation, VibratorStatus status) {
    if (operation.isRestricted && !mayCallRestricted()) return notPermitted();
    if (status == VibratorStatus::BAD_VALUE) return "out of range: " + operation.range;
    const LocalDriver driver;
    if (!driver.isThere()) {
        return "no vibrator driver is found; \"vibratorctl doctor\" says what to do";
    }
    if (operation.name == "setExternalControl" && driver.isVibrating()) {
        return runningReason(driver);
    }
    for (const std::string& name : operation.nodes) {
        const LocalDriver::Node node = driver.look(driver.directory() + name);
        if (!node.exists) return "this driver has no node \"" + name + "\"";
        if (driver.isUsable() && !(node.reads && node.writes)) {
            return "the node \"" + name + R"(" cannot be opened; "vibratorctl doctor" says more)";
        }
    }
    return "the driver has refused it; the service's log has the error";
}

}  // namespace vibratorctl
