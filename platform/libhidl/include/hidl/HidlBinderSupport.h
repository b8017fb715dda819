// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hidl/base/1.0/IBase.h>
#include <hidl/HidlSupport.h>
#include <hidl/Static.h>
#include <hidl/Status.h>
#include <hwbinder/Binder.h>
#include <hwbinder/BpHwBinder.h>
#include <hwbinder/IInterface.h>
#include <hwbinder/Parcel.h>

#include <cstddef>
#include <cstdint>
#include <type_traits>

// Converts the types of interfaces to parcels and back, and objects of interfaces to binders and
// back.

namespace android::hardware {

/** Passes the death notice of a binder on to the recipient of its interface. */
class hidl_binder_death_recipient : public IBinder::DeathRecipient {
  public:
    hidl_binder_death_recipient(const sp<hidl_death_recipient>& recipient, uint64_t cookie,
                                const sp<::android::hidl::base::V1_0::IBase>& base)
        : mRecipient(recipient), mCookie(cookie), mBase(base) {}

    void binderDied(const wp<IBinder>& /* who */) override {
        mRecipient->serviceDied(mCookie, mBase);
    }
    const sp<hidl_death_recipient>& getRecipient() const { return mRecipient; }

  private:
    const sp<hidl_death_recipient> mRecipient;
    const uint64_t mCookie;
    const wp<::android::hidl::base::V1_0::IBase> mBase;
};

/** Writes the buffer of a string or list that lies in another buffer. */
status_t writeEmbeddedToParcel(const hidl_string& text, Parcel* parcel, size_t parentHandle,
                               size_t parentOffset);
template <typename T>
status_t writeEmbeddedToParcel(const hidl_vec<T>& list, Parcel* parcel, size_t parentHandle,
                               size_t parentOffset, size_t* handle) {
    return parcel->writeEmbeddedBuffer(list.data(), list.size() * sizeof(T), handle, parentHandle,
                                       parentOffset + hidl_vec<T>::kOffsetOfBuffer);
}

/**
 * Checks the buffer of a string or list that lies in another buffer of a received parcel: it is as
 * long as the string or list says, and a string ends with its zero.
 */
status_t readEmbeddedFromParcel(const hidl_string& text, const Parcel& parcel, size_t parentHandle,
                                size_t parentOffset);
template <typename T>
status_t readEmbeddedFromParcel(const hidl_vec<T>& list, const Parcel& parcel, size_t parentHandle,
                                size_t parentOffset, size_t* handle) {
    const void* buffer = nullptr;
    // Only elements that own something, strings and lists, have addresses in them.
    constexpr bool hasAddresses = !std::is_trivially_copyable_v<T>;
    // Cannot overflow: the count has 32 bits, and an element is small.
    return parcel.readEmbeddedBuffer(list.size() * sizeof(T), hasAddresses ? handle : nullptr,
                                     parentHandle, parentOffset + hidl_vec<T>::kOffsetOfBuffer,
                                     &buffer);
}

namespace details {
// The rest of the two functions below, for calls that have failed.
status_t writeException(const Status& status, Parcel* parcel);
status_t readException(int32_t code, Status* status, const Parcel& parcel);
}  // namespace details

/** Writes the exception code, and its text if it has one, with which a reply begins. */
inline status_t writeToParcel(const Status& status, Parcel* parcel) {
    if (!status.isOk()) return details::writeException(status, parcel);
    return parcel->writeInt32(Status::EX_NONE);
}
inline status_t readFromParcel(Status* status, const Parcel& parcel) {
    int32_t code = Status::EX_NONE;
    const status_t read = parcel.readInt32(&code);
    if (read != OK || code == Status::EX_NONE) return read;
    return details::readException(code, status, parcel);
}

/** @return the binder of an object: its proxy's, or its only stub. */
sp<IBinder> getOrCreateCachedBinder(::android::hidl::base::V1_0::IBase* object);

namespace details {

/** @return the object of this process behind its stub. */
sp<::android::hidl::base::V1_0::IBase> localObject(const sp<IBinder>& binder);

/** @return whether an object has an interface, going by its chain. */
Return<bool> hasInterface(::android::hidl::base::V1_0::IBase* object, const char* interface);

/**
 * As above, but a failure of the call, as of a dead object's, counts as no.
 *
 * @param emitError whether it is logged and returned instead.
 */
Return<bool> canCastInterface(::android::hidl::base::V1_0::IBase* object, const char* interface,
                              bool emitError = false);

/** @return the object as a more specific interface; nullptr if it does not have that one. */
template <typename Child, typename Parent, typename BpChild>
Return<sp<Child>> castInterface(const sp<Parent>& parent, const char* interface, bool emitError) {
    if (parent == nullptr) return sp<Child>();
    const Return<bool> canCast = canCastInterface(parent.get(), interface, emitError);
    if (!canCast.isOk()) return canCast.status();
    if (!canCast) return sp<Child>();
    if (parent->isRemote()) return sp<Child>(new BpChild(getOrCreateCachedBinder(parent.get())));
    return sp<Child>(static_cast<Child*>(parent.get()));
}

}  // namespace details

/** @return the object of an interface behind a binder: a proxy, or the object itself. */
template <typename Interface, typename Proxy, typename Stub>
sp<Interface> fromBinder(const sp<IBinder>& binder) {
    if (binder == nullptr) return nullptr;
    if (binder->localBinder() == nullptr) return new Proxy(binder);
    // A local binder is a stub, and every stub is one of the base interface.
    const sp<::android::hidl::base::V1_0::IBase> base = details::localObject(binder);
    if (!details::canCastInterface(base.get(), Interface::descriptor).withDefault(false)) {
        return nullptr;
    }
    return static_cast<Interface*>(base.get());
}

}  // namespace android::hardware
