// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utils/Errors.h>
#include <utils/FunctionRef.h>
#include <utils/RefBase.h>

#include <cstdint>

namespace android::hardware {

class BHwBinder;
class BpHwBinder;
class Parcel;

/** An object that can be called, of this process or of another one. */
class IBinder : public virtual RefBase {
  public:
    /** Gets the reply while the results that it refers to still exist. */
    using TransactCallback = FunctionRef<void(Parcel& reply)>;

    /** Flag of a call that has no reply and is not waited for. */
    static constexpr uint32_t FLAG_ONEWAY = 0x01;

    /** Receives the notice that the process of a remote object has ended. */
    class DeathRecipient : public virtual RefBase {
      public:
        virtual void binderDied(const wp<IBinder>& who) = 0;
    };

    /**
     * Makes a call.
     *
     * @param reply takes the reply; left alone by a oneway call.
     * @param callback called with the reply if the operation has results.
     * @return OK, or why the call failed.
     */
    virtual status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags = 0,
                              TransactCallback callback = nullptr) = 0;

    /** @return OK; DEAD_OBJECT if the process has ended; INVALID_OPERATION for a local object. */
    virtual status_t linkToDeath(const sp<DeathRecipient>& recipient) = 0;
    /** @return OK, or NAME_NOT_FOUND if it was not linked or has had its notice. */
    virtual status_t unlinkToDeath(const sp<DeathRecipient>& recipient) = 0;

    /** @return this as an object of this process; nullptr when it is remote. */
    virtual BHwBinder* localBinder() { return nullptr; }
    /** @return this as an object of another process; nullptr when it is local. */
    virtual BpHwBinder* remoteBinder() { return nullptr; }
};

}  // namespace android::hardware
