// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Length of the click, in ms. */
constexpr uint32_t kClickMs = 20;

/** Amplitude of the click on the scale of 1 to 255, indexed by EffectStrength. */
constexpr uint8_t kClickAmplitudes[] = {36, 128, 255};

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
