// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace android::hardware::vibrator::V1_0 {

enum class Status : uint32_t {
    OK = 0,
    UNKNOWN_ERROR = 1,
    BAD_VALUE = 2,
    UNSUPPORTED_OPERATION = 3,
};

enum class Effect : uint32_t {
    CLICK = 0,
    DOUBLE_CLICK = 1,
};

enum class EffectStrength : uint8_t {
    LIGHT = 0,
    MEDIUM = 1,
    STRONG = 2,
};

}  // namespace android::hardware::vibrator::V1_0
