// SPDX-License-Identifier: Apache-2.0
#include <hwbinder/Binder.h>

namespace android::hardware {

status_t BHwBinder::linkToDeath(const sp<DeathRecipient>& /* recipient */) {
    return INVALID_OPERATION;
}

status_t BHwBinder::unlinkToDeath(const sp<DeathRecipient>& /* recipient */) {
    return INVALID_OPERATION;
}

}  // namespace android::hardware
