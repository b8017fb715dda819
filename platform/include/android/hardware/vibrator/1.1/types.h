// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace android::hardware::vibrator::V1_1 {

enum class Effect_1_1 : uint32_t {
    CLICK = 0,
    DOUBLE_CLICK = 1,
    TICK = 2,
};

}  // namespace android::hardware::vibrator::V1_1
