// SPDX-License-Identifier: Apache-2.0
#include "Log.h"
#include "MotorType.h"
#include "NodePathTable.h"
#include "TextNode.h"
#include "Vibrator.h"

#include <cstring>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** Buffer for the motor's name; a longer text is judged by what fits. */
using MotorName = char[kMotorNameSize + 1];

}  // namespace

Return<int32_t> Vibrator::getMotorIndex() {
    LOG_DEBUG("getMotorIndex return motor type >>");
    MotorName name;
    if (!readTextNode("getMotorIndex", THE_DEVICE_MOTOR_TYPE, NodeMode::kReadWrite, name,
                      sizeof(name))) {
        return kMotorNone;
    }
    LOG_DEBUG("getMotorIndex string : %s ", name);
    LOG_DEBUG("getMotorIndex string len : %d ", static_cast<int>(strlen(name)));
    const MotorType type = motorOfName(name);
    LOG_DEBUG("getMotorIndex return motor type : %d <<", type);
    return type;
}

Return<int32_t> Vibrator::getMotorIndexbyMethod() {
    LOG_DEBUG("getMotorIndexbyMethod >> ");
    const MotorType type = motorOfFeatures(*this);
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
    if (!readTextNode("daxSupportsEnhancedVelmoraHapticPattern", THE_DEVICE_MOTOR_TYPE,
                      NodeMode::kRead, name, sizeof(name))) {
        return false;
    }
    LOG_DEBUG("daxSupportsEnhancedVelmoraHapticPattern string : %s ", name);
    LOG_DEBUG("daxSupportsEnhancedVelmoraHapticPattern string len : %lu ",
              static_cast<unsigned long>(strlen(name)));
    const bool supports = motorOfName(name) == kMotorLinear1040;
    if (supports) {
        LOG_DEBUG("daxSupportsEnhancedVelmoraHapticPattern LINEAR_1040");
    } else {
        LOG_DEBUG("daxSupportsEnhancedVelmoraHapticPattern can not supports. Out of capability");
    }
    return supports;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
