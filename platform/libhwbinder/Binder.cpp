// SPDX-License-Identifier: Apache-2.0
#include <hwbinder/Binder.h>
#include <hwbinder/Parcel.h>

#include <utility>

namespace android::hardware {

status_t BHwBinder::transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags,
                             TransactCallback callback) {
    data.setDataPosition(0);
    return onTransact(code, data, reply, flags, std::move(callback));
}

status_t BHwBinder::linkToDeath(const sp<DeathRecipient>& /* recipient */) {
    return INVALID_OPERATION;
}

status_t BHwBinder::unlinkToDeath(const sp<DeathRecipient>& /* recipient */) {
    return INVALID_OPERATION;
}

}  // namespace android::hardware
