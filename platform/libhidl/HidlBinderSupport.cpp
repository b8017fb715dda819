// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Driver.h"

#include <android/hidl/base/1.0/BnHwBase.h>
#include <android/hidl/base/1.0/BpHwBase.h>
#include <android/log.h>
#include <hidl/HidlBinderSupport.h>

#include <mutex>

namespace android::hardware {

using ::android::hidl::base::V1_0::BnHwBase;
using ::android::hidl::base::V1_0::IBase;

status_t writeEmbeddedToParcel(const hidl_string& text, Parcel* parcel, size_t parentHandle,
                               size_t parentOffset) {
    return parcel->writeEmbeddedBuffer(text.c_str(), text.size() + 1, nullptr, parentHandle,
                                       parentOffset + hidl_string::kOffsetOfBuffer);
}

status_t readEmbeddedFromParcel(const hidl_string& text, const Parcel& parcel, size_t parentHandle,
                                size_t parentOffset) {
    const void* buffer = nullptr;
    const status_t status =
            parcel.readEmbeddedBuffer(text.size() + 1, nullptr, parentHandle,
                                      parentOffset + hidl_string::kOffsetOfBuffer, &buffer);
    if (status != OK) return status;
    return static_cast<const char*>(buffer)[text.size()] == '\0' ? OK : BAD_VALUE;
}

namespace details {

status_t writeException(const Status& status, Parcel* parcel) {
    const status_t written = parcel->writeInt32(status.exceptionCode());
    if (written != OK) return written;
    const std::string message = status.exceptionMessage();
    return parcel->writeString16(message.data(), message.size());
}

status_t readException(int32_t code, Status* status, const Parcel& parcel) {
    std::string message;
    const status_t read = parcel.readString16(&message);
    if (read == OK) *status = Status::fromExceptionCode(code, message);
    return read;
}

sp<IBase> localObject(const sp<IBinder>& binder) {
    return static_cast<BnHwBase*>(binder->localBinder())->getImpl();
}

Return<bool> hasInterface(IBase* object, const char* interface) {
    bool isInChain = false;
    const Return<void> result = object->interfaceChain([&](const auto& chain) {
        for (const hidl_string& each : chain)
            isInChain = isInChain || each == interface;
    });
    if (!result.isOk()) return result.status();
    return isInChain;
}

Return<bool> canCastInterface(IBase* object, const char* interface, bool emitError) {
    Return<bool> result = hasInterface(object, interface);
    if (result.isOk()) return result;
    if (!emitError) return false;
    __android_log_print(ANDROID_LOG_ERROR, kLogTag, "no cast to %s: %s", interface,
                        result.description().c_str());
    return result;
}

}  // namespace details

namespace {

/** @return the remote object behind any proxy. */
sp<IBinder> remoteOf(IBase* proxy) {
    // An interface adds nothing but virtual functions to the one that it extends, so IInterface
    // lies at the same place in every proxy.
    return IInterface::asBinder(static_cast<BpInterface<IBase>*>(proxy));
}

}  // namespace

sp<IBinder> getOrCreateCachedBinder(IBase* object) {
    if (object->isRemote()) return remoteOf(object);
    // Two threads must not make two stubs of one object.
    static auto* const mutex = new std::mutex;
    const std::lock_guard<std::mutex> lock(*mutex);
    sp<IBinder> binder = details::gBnMap->get(object, nullptr).promote();
    if (binder != nullptr) return binder;

    std::string descriptor;
    object->interfaceDescriptor([&](const hidl_string& each) { descriptor = each; });
    const auto make = details::getBnConstructorMap().get(descriptor, nullptr);
    if (make == nullptr) {
        __android_log_print(ANDROID_LOG_ERROR, kLogTag, "no stub is known for %s",
                            descriptor.c_str());
        return nullptr;
    }
    binder = make(object);
    details::gBnMap->set(object, binder->localBinder());
    return binder;
}

}  // namespace android::hardware
