// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlTransportSupport.h>

namespace android::hardware::details {

/** @return the object itself: this platform has no implementations that need wrapping. */
template <typename Interface>
sp<Interface> wrapPassthrough(const sp<Interface>& object) {
    return object;
}

}  // namespace android::hardware::details
