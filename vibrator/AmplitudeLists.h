// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.1/types.h>

#include <cstdint>
#include <vector>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

using AmplitudeList = std::vector<uint32_t>;

/**
 * @param motor a motor type number.
 * @param hasIndex whether the driver plays stored patterns selected by index.
 * @return the ladder of intensities that suits the motor; empty where there is none.
 */
const AmplitudeList& selectAmplitudeList(int32_t motor, DaxAmplitudeType type, bool hasIndex);

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
