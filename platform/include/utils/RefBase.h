// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utils/StrongPointer.h>

#include <atomic>
#include <cstdint>

namespace android {

/** Base of objects that live as long as one sp<> holds them. There are no weak references. */
class RefBase {
  public:
    RefBase(const RefBase&) = delete;
    RefBase& operator=(const RefBase&) = delete;

    void incStrong(const void* /* id */) const { mStrong.fetch_add(1, std::memory_order_relaxed); }
    void decStrong(const void* /* id */) const {
        if (mStrong.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
    }

  protected:
    RefBase() = default;
    virtual ~RefBase() = default;

  private:
    mutable std::atomic<int32_t> mStrong{0};
};

}  // namespace android
