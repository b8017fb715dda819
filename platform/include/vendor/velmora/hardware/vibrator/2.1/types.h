// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1 {

/** Variant of the amplitude list. */
enum class DaxAmplitudeType : uint32_t {
    TYPE_0 = 0,
    TYPE_1 = 1,
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1
