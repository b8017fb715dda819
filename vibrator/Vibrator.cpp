// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"

#include "Log.h"
#include "NodePathTable.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

void setDriverMode(uint8_t mode) {
    DriverMode = mode;
    for (const NodeInfo& node : NodePathTable) {
        if (node.path != nullptr) *node.path = node.pathIn(mode);
    }
}

void logNodePathTable() {
    for (const NodeInfo& node : NodePathTable) {
        if (node.path != nullptr) LOG_DEBUG(node.logFormat, node.path->c_str());
    }
}

}  // namespace

Vibrator::Vibrator() {
    LOG_DEBUG("!@QOR VIB HAL init");
    const auto mode = findDriverMode([this](const std::string& node) { return isNodeExist(node); });
    if (mode) {
        LOG_DEBUG(*mode == kTimedOutputMode ? "Vibrator using timed_output"
                                            : "Vibrator using LED trigger");
        setDriverMode(*mode);
    } else {
        LOG_DEBUG("Vibrator driver does not exist. Remove VIB HAL or Setup Vibrator Driver");
    }
    logNodePathTable();
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
