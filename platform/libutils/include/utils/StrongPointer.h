// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <utility>

namespace android {

/** Strong reference to an object that counts its references (incStrong, decStrong). */
template <typename T>
class sp {
  public:
    sp() = default;
    sp(T* object) : mObject(object) {  // NOLINT(google-explicit-constructor): as published
        if (mObject != nullptr) mObject->incStrong(this);
    }
    sp(const sp& other) : sp(other.mObject) {}
    sp(sp&& other) noexcept : mObject(std::exchange(other.mObject, nullptr)) {}
    template <typename U>
    sp(const sp<U>& other) : sp(other.get()) {}  // NOLINT(google-explicit-constructor)
    template <typename U>
    sp(U* object) : sp(static_cast<T*>(object)) {}  // NOLINT(google-explicit-constructor)
    ~sp() {
        if (mObject != nullptr) mObject->decStrong(this);
    }

    sp& operator=(sp other) noexcept {
        std::swap(mObject, other.mObject);
        return *this;
    }

    void clear() { *this = sp(); }

    T& operator*() const { return *mObject; }
    T* operator->() const { return mObject; }
    T* get() const { return mObject; }
    explicit operator bool() const { return mObject != nullptr; }

    bool operator==(const T* other) const { return mObject == other; }
    bool operator!=(const T* other) const { return mObject != other; }
    template <typename U>
    bool operator==(const sp<U>& other) const {
        return mObject == other.get();
    }
    template <typename U>
    bool operator!=(const sp<U>& other) const {
        return mObject != other.get();
    }

  private:
    T* mObject = nullptr;
};

}  // namespace android
