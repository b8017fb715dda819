// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cmath>
#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Full strength on the driver's scale. */
constexpr uint32_t kMaxAmplitude = 10000;

/** @return whether a number is an amplitude of the extended interface: 1 to kMaxAmplitude. */
constexpr bool isAmplitude(uint32_t number) {
    return number >= 1 && number <= kMaxAmplitude;
}

/**
 * Maps an amplitude of the standard interface on the driver's scale.
 *
 * @param amplitude 1 to 255.
 * @return 1 to kMaxAmplitude; the order of the steps fixes the rounding.
 */
inline long intensityOf(uint8_t amplitude) {
    return lround(static_cast<double>(amplitude - 1) / 254.0 * 9999.0 + 1.0);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
