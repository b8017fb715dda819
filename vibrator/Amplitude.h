// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Full strength on the driver's scale. */
constexpr uint32_t kMaxAmplitude = 10000;

/** @return whether a number is an amplitude of the extended interface: 1 to kMaxAmplitude. */
constexpr bool isAmplitude(uint32_t number) {
    return number >= 1 && number <= kMaxAmplitude;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
