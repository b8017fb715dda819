// SPDX-License-Identifier: Apache-2.0
#include "CallerPermission.h"

#include "Log.h"
#include "Vibrator.h"

#include <hwbinder/IPCThreadState.h>
#include <sys/types.h>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<uint32_t> Vibrator::checkCallerPermission() {
    const uid_t uid = ::android::hardware::IPCThreadState::self()->getCallingUid();
    if (isPermittedCaller(uid)) return kCallerPermitted;
    LOG_ERROR("Pemission denied (%d)", static_cast<int>(uid));
    return kCallerRefused;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
