// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Motor type numbers; each is the index of the driver's name for it in MotorTypeNames. */
enum MotorType {
    kMotorNone = 0,
    kMotorCoinDc,
    kMotorLinear,
    kMotorCoinDcPmic,
    kMotorCoinDcIndex,
    kMotorLinearIndex,
    kMotorLinear0832Rc,
    kMotorLinear1040,
    kMotorLinearRcvMot,
    kMotorLinear1030,
    kMotorTypeCount,
};

/** The driver's names of the motor types, indexed by motor type number. */
extern const std::string MotorTypeNames[kMotorTypeCount];

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
