// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vibrator.h"

#include <cstdint>
#include <string>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** What is private to the service object. */
struct VibratorPeer {
    static Status writeNode(Vibrator& vibrator, const std::string& node, int value) {
        return vibrator.writeNode(node, value);
    }
    static int32_t readNode(Vibrator& vibrator, const std::string& node) {
        return vibrator.readNode(node);
    }
    static bool isNodeExist(Vibrator& vibrator, const std::string& node) {
        return vibrator.isNodeExist(node);
    }
    static bool isNodeExistForRead(Vibrator& vibrator, const std::string& node) {
        return vibrator.isNodeExistForRead(node);
    }
    static bool isVibrating(Vibrator& vibrator) { return vibrator.isVibrating(); }
    static int32_t getMotorIndex(Vibrator& vibrator) { return vibrator.getMotorIndex(); }
    static int32_t getMotorIndexbyMethod(Vibrator& vibrator) {
        return vibrator.getMotorIndexbyMethod();
    }
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
