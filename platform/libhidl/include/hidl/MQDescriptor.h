// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlSupport.h>

namespace android::hardware {

enum MQFlavor : uint32_t { kSynchronizedReadWrite = 1, kUnsynchronizedWrite = 2 };

/** Message queue; generated code needs its size, but nothing here uses it. */
template <typename T, MQFlavor flavor>
class MQDescriptor {
    hidl_vec<T> mGrantors;
    const native_handle_t* mHandle = nullptr;
    uint32_t mQuantum = 0;
    uint32_t mFlags = flavor;
};

}  // namespace android::hardware
