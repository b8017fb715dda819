// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utils/StrongPointer.h>

#include <atomic>
#include <cstdint>
#include <utility>

namespace android {

/** Base of objects that live as long as one sp<> holds them, and that wp<> can watch. */
class RefBase {
  public:
    /** The two counts of an object, which exist as long as the object or a wp<> to it. */
    class weakref_type {
      public:
        void incWeak(const void* id);
        void decWeak(const void* id);
        /** Takes a strong reference, if there is still one. @return whether it did. */
        bool attemptIncStrong(const void* id);

      private:
        friend class RefBase;

        std::atomic<int32_t> mStrong{0};
        /** Counts each wp<>, and the object itself as one. */
        std::atomic<int32_t> mWeak{1};
    };

    RefBase(const RefBase&) = delete;
    RefBase& operator=(const RefBase&) = delete;

    void incStrong(const void* /* id */) const {
        mRefs->mStrong.fetch_add(1, std::memory_order_relaxed);
    }
    void decStrong(const void* /* id */) const {
        if (mRefs->mStrong.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
    }
    weakref_type* getWeakRefs() const { return mRefs; }

  protected:
    RefBase() : mRefs(new weakref_type) {}
    virtual ~RefBase() { mRefs->decWeak(this); }

  private:
    weakref_type* const mRefs;
};

/** Weak reference: does not keep the object alive, but tells whether it is. */
template <typename T>
class wp {
  public:
    wp() = default;
    wp(T* object) : mObject(object) {  // NOLINT(google-explicit-constructor): as published
        if (mObject != nullptr) {
            mRefs = mObject->getWeakRefs();
            mRefs->incWeak(this);
        }
    }
    template <typename U>
    wp(const sp<U>& object) : wp(object.get()) {}  // NOLINT(google-explicit-constructor)
    wp(const wp& other) : mObject(other.mObject), mRefs(other.mRefs) {
        if (mRefs != nullptr) mRefs->incWeak(this);
    }
    wp(wp&& other) noexcept
        : mObject(std::exchange(other.mObject, nullptr)),
          mRefs(std::exchange(other.mRefs, nullptr)) {}
    ~wp() {
        if (mRefs != nullptr) mRefs->decWeak(this);
    }
    wp& operator=(wp other) noexcept {
        std::swap(mObject, other.mObject);
        std::swap(mRefs, other.mRefs);
        return *this;
    }

    /** @return a strong reference; nullptr when the object is gone. */
    sp<T> promote() const {
        sp<T> result;
        if (mRefs != nullptr && mRefs->attemptIncStrong(this)) {
            result = mObject;
            mObject->decStrong(this);
        }
        return result;
    }
    /** @return where the object is or was; only for comparing. */
    T* unsafe_get() const { return mObject; }

  private:
    T* mObject = nullptr;
    RefBase::weakref_type* mRefs = nullptr;
};

}  // namespace android
