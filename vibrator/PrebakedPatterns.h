// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** How long the motor runs for a stored pattern, in ms. */
constexpr uint32_t kPatternMs = 1000;

/** Written as the pattern number, makes the driver play its queue. */
constexpr int32_t kQueueIndex = 0xFFFE;

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
