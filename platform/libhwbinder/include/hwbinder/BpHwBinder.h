// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/IBinder.h>

#include <memory>
#include <mutex>
#include <vector>

namespace android::hardware {

class RemoteObject;

/** An object of another process, which the driver knows by a handle. */
class BpHwBinder : public IBinder {
  public:
    /** Made by ProcessState::getStrongProxyForHandle, which keeps one proxy for each handle. */
    explicit BpHwBinder(uint32_t handle);
    ~BpHwBinder() override;

    status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags = 0,
                      TransactCallback callback = nullptr) final;
    status_t linkToDeath(const sp<DeathRecipient>& recipient) final;
    status_t unlinkToDeath(const sp<DeathRecipient>& recipient) final;
    BpHwBinder* remoteBinder() final { return this; }

    uint32_t handle() const { return mHandle; }
    /** Tells the recipients that the process has ended; called once, by the driver. */
    void sendObituary();

  private:
    const uint32_t mHandle;
    /** The object itself; nullptr if there is none with the handle. */
    const std::unique_ptr<RemoteObject> mRemote;
    std::mutex mMutex;
    bool mAlive = true;
    std::vector<sp<DeathRecipient>> mRecipients;
};

}  // namespace android::hardware
