// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/IBinder.h>

namespace android::hardware {

/** An object of this process that others call: the base of generated stubs. */
class BHwBinder : public IBinder {
  public:
    status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags = 0,
                      TransactCallback callback = nullptr) final {
        return onTransact(code, data, reply, flags, callback);
    }
    status_t linkToDeath(const sp<DeathRecipient>&) final { return INVALID_OPERATION; }
    status_t unlinkToDeath(const sp<DeathRecipient>&) final { return INVALID_OPERATION; }
    BHwBinder* localBinder() final { return this; }

    /** @return the least priority, as a nice value, that a call is served with. */
    int getMinSchedulingPriority() const { return mSchedPriority; }

  protected:
    /** Unpacks the arguments, calls the operation and packs its results. */
    virtual status_t onTransact(uint32_t code, const Parcel& data, Parcel* reply,
                                uint32_t flags = 0, TransactCallback callback = nullptr) = 0;

    /** There are no security contexts on this platform. */
    void setRequestingSid(bool /* requesting */) {}

    int mSchedPolicy = 0;
    int mSchedPriority = 0;
};

}  // namespace android::hardware
