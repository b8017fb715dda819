// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/log.h>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Tag of every line that the service object logs. */
inline constexpr char kLogTag[] = "QorVibrator-HAL2.1";

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation

// Macros, so that the compiler checks the arguments against the format.
#define LOG_DEBUG(...)                                                                        \
    __android_log_print(ANDROID_LOG_DEBUG,                                                    \
                        ::vendor::velmora::hardware::vibrator::V2_1::implementation::kLogTag, \
                        __VA_ARGS__)
#define LOG_ERROR(...)                                                                        \
    __android_log_print(ANDROID_LOG_ERROR,                                                    \
                        ::vendor::velmora::hardware::vibrator::V2_1::implementation::kLogTag, \
                        __VA_ARGS__)
