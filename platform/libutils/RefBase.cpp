// SPDX-License-Identifier: Apache-2.0
#include <utils/RefBase.h>

namespace android {

void RefBase::weakref_type::incWeak(const void* /* id */) {
    mWeak.fetch_add(1, std::memory_order_relaxed);
}

void RefBase::weakref_type::decWeak(const void* /* id */) {
    if (mWeak.fetch_sub(1, std::memory_order_acq_rel) == 1) delete this;
}

bool RefBase::weakref_type::attemptIncStrong(const void* /* id */) {
    int32_t count = mStrong.load(std::memory_order_relaxed);
    while (count > 0) {
        if (mStrong.compare_exchange_weak(count, count + 1, std::memory_order_acquire)) return true;
    }
    return false;
}

}  // namespace android
