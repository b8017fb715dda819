// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utils/Errors.h>
#include <utils/RefBase.h>

#include <cstddef>
#include <cstdint>
#include <type_traits>

namespace android::hardware {

class BHwBinder;
class BpHwBinder;
class Parcel;

/** An object that can be called, of this process or of another one. */
class IBinder : public virtual RefBase {
  public:
    /**
     * Gets the reply while the results that it refers to still exist. Refers to a function, which
     * must live as long as the call; that is cheaper to pass on than a copy.
     */
    class TransactCallback {
      public:
        TransactCallback(std::nullptr_t = nullptr) {}  // NOLINT: implicit as published
        template <typename Function,
                  typename = std::enable_if_t<!std::is_same_v<Function, TransactCallback>>>
        TransactCallback(const Function& function)  // NOLINT: implicit as published
            : mFunction(&function), mCall([](const void* each, Parcel& reply) {
                  (*static_cast<const Function*>(each))(reply);
              }) {}

        void operator()(Parcel& reply) const {
            if (mFunction != nullptr) mCall(mFunction, reply);
        }

      private:
        const void* mFunction = nullptr;
        void (*mCall)(const void* function, Parcel& reply) = nullptr;
    };

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
