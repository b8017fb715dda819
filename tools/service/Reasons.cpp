// SPDX-License-Identifier: Apache-2.0
#include "service/Reasons.h"

#include "CallerPermission.h"
#include "service/LocalDriver.h"
#include "service/System.h"
#include "text/Text.h"

#include <unistd.h>

namespace vibratorctl {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

namespace {

const std::string kDoctor = R"("vibratorctl doctor" says what to do)";

}  // namespace

bool mayCallRestricted() {
    return isPermittedCaller(geteuid());
}

std::string permittedUsers() {
    return "root and uid " + std::to_string(AID_SYSTEM) + " (system)";
}

std::string notPermitted() {
    return "not permitted: only " + permittedUsers() + " may do this, not uid " +
           std::to_string(geteuid());
}

std::string reasonOf(const Operation& operation, VibratorStatus status, const Process& service) {
    if (operation.isRestricted && !mayCallRestricted()) return notPermitted();
    if (status == VibratorStatus::BAD_VALUE) return "the service does not take the value";
    if (status != VibratorStatus::UNKNOWN_ERROR &&
        status != VibratorStatus::UNSUPPORTED_OPERATION) {
        return "the service answered with a status that this client does not know: " +
               toString(status);
    }
    const LocalDriver driver(service);
    if (!driver.isThere()) return "no vibrator driver is found; " + kDoctor;
    for (const std::string& name : operation.nodes) {
        const LocalDriver::Node node = driver.look(name);
        if (!node.exists) return "this driver has no node \"" + name + "\"";
        if (driver.isUsable() && !(node.reads && node.writes)) {
            return "the service, uid " + std::to_string(service.uid) + ", cannot open the node \"" +
                   name + "\"; " + kDoctor;
        }
    }
    if (operation.name == "setExternalControl" && driver.isVibrating()) {
        const auto& [name, start, running, howToStop] = driver.layout();
        return std::string("refused while the motor counts as running (") + running + " is " +
               driver.look(running).firstLine() + "); first: " + howToStop;
    }
    const std::string nodes = operation.nodes.empty() ? "its nodes for the motor"
                                                      : cli::join(operation.nodes, ", ", " or ");
    return "the driver has refused it at " + nodes + ", or the service does not use the driver; " +
           kDoctor + "; the error is in the service's log: " + thisSystem().log;
}

}  // namespace vibratorctl
