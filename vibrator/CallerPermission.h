// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <private/android_filesystem_config.h>
#include <sys/types.h>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** @return whether a user may call the operations named dax. */
constexpr bool isPermittedCaller(uid_t uid) {
    return uid == AID_SYSTEM || uid == AID_ROOT;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
