// SPDX-License-Identifier: Apache-2.0
#include "Log.h"
#include "Vibrator.h"

#include <hwbinder/IPCThreadState.h>
#include <sys/types.h>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

constexpr uid_t kRootUid = 0;
/** AID_SYSTEM of the platform's android_filesystem_config.h. */
constexpr uid_t kSystemUid = 1000;

}  // namespace

Return<uint32_t> Vibrator::checkCallerPermission() {
    const uid_t uid = ::android::hardware::IPCThreadState::self()->getCallingUid();
    if (uid == kSystemUid || uid == kRootUid) return kCallerPermitted;
    LOG_ERROR("Pemission denied (%d)", static_cast<int>(uid));
    return kCallerRefused;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
