// SPDX-License-Identifier: Apache-2.0
#include "MotorType.h"

#include "Log.h"
#include "NodePathTable.h"
#include "TextNode.h"
#include "Vibrator.h"

#include <fcntl.h>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

const std::string MotorTypeNames[kMotorTypeCount] = {
        "NONE",         "COINDC",        "LINEAR",      "COINDC_PMIC",   "COINDC_INDEX",
        "LINEAR_INDEX", "LINEAR_0832RC", "LINEAR_1040", "LINEAR_RCVMOT", "LINEAR_1030",
};

namespace {

/** Buffer for the motor's name; a longer text is judged by what fits. */
using MotorName = char[32];

}  // namespace

Return<int32_t> Vibrator::getMotorIndex() {
    LOG_DEBUG("getMotorIndex return motor type >>");
    MotorName name;
    if (!readTextNode("getMotorIndex", THE_DEVICE_MOTOR_TYPE, O_RDWR, name, sizeof(name))) {
        return kMotorNone;
    }
    int32_t type = kMotorTypeCount - 1;
    while (type > kMotorNone && MotorTypeNames[type] != name)
        --type;
    LOG_DEBUG("getMotorIndex return motor type : %d <<", type);
    return type;
}

Return<int32_t> Vibrator::getMotorIndexbyMethod() {
    LOG_DEBUG("getMotorIndexbyMethod >> ");
    int32_t type;
    if (daxSupportsPrebakedHapticPattern()) {
        type = daxSupportsHapticEngine() ? kMotorLinearIndex : kMotorLinear1030;
    } else if (daxSupportsHapticEngine()) {
        type = daxSupportsEnhancedVelmoraHapticPattern() ? kMotorLinear1040 : kMotorLinear0832Rc;
    } else {
        type = daxSupportsAmplitudeControl() ? kMotorLinear : kMotorCoinDc;
    }
    LOG_DEBUG("getMotorIndexbyMethod : %d <<", type);
    return type;
}

Return<bool> Vibrator::daxSupportsEnhancedVelmoraHapticPattern() {
    if (checkCallerPermission() != kCallerPermitted) return false;
    if (!isNodeExistForRead(THE_DEVICE_MOTOR_TYPE)) {
        const bool supports = daxSupportsHapticEngine();
        LOG_ERROR(supports ? "daxSupportsEnhancedVelmoraHapticPattern Enhanced supports motor"
                           : "daxSupportsEnhancedVelmoraHapticPattern not supports");
        return supports;
    }

    MotorName name;
    if (!readTextNode("daxSupportsEnhancedVelmoraHapticPattern", THE_DEVICE_MOTOR_TYPE, O_RDONLY,
                      name, sizeof(name))) {
        return false;
    }
    const bool supports = MotorTypeNames[kMotorLinear1040] == name;
    if (supports) {
        LOG_DEBUG("daxSupportsEnhancedVelmoraHapticPattern LINEAR_1040");
    } else {
        LOG_DEBUG("daxSupportsEnhancedVelmoraHapticPattern can not supports. Out of capability");
    }
    return supports;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
