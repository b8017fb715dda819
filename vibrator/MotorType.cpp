// SPDX-License-Identifier: Apache-2.0
#include "MotorType.h"

#include <algorithm>
#include <iterator>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

const std::string MotorTypeNames[kMotorTypeCount] = {
        "NONE",         "COINDC",        "LINEAR",      "COINDC_PMIC",   "COINDC_INDEX",
        "LINEAR_INDEX", "LINEAR_0832RC", "LINEAR_1040", "LINEAR_RCVMOT", "LINEAR_1030",
};

MotorType motorOfName(std::string_view name) {
    const auto* found = std::find(std::begin(MotorTypeNames), std::end(MotorTypeNames), name);
    if (found == std::end(MotorTypeNames)) return kMotorNone;
    return static_cast<MotorType>(found - std::begin(MotorTypeNames));
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
