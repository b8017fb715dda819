// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace android::hardware::vibrator::V1_2 {

enum class Effect : uint32_t {
    CLICK = 0,
    DOUBLE_CLICK = 1,
    TICK = 2,
    THUD = 3,
    POP = 4,
    HEAVY_CLICK = 5,
    RINGTONE_1 = 6,
    RINGTONE_2 = 7,
    RINGTONE_3 = 8,
    RINGTONE_4 = 9,
    RINGTONE_5 = 10,
    RINGTONE_6 = 11,
    RINGTONE_7 = 12,
    RINGTONE_8 = 13,
    RINGTONE_9 = 14,
    RINGTONE_10 = 15,
    RINGTONE_11 = 16,
    RINGTONE_12 = 17,
    RINGTONE_13 = 18,
    RINGTONE_14 = 19,
    RINGTONE_15 = 20,
};

}  // namespace android::hardware::vibrator::V1_2
