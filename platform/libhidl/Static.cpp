// SPDX-License-Identifier: Apache-2.0
#include <hidl/Static.h>

namespace android::hardware::details {

// Generated code uses these before main and after it, so they are never destroyed.

BnConstructorMap& getBnConstructorMap() {
    static auto* const map = new BnConstructorMap;
    return *map;
}

BsConstructorMap& getBsConstructorMap() {
    static auto* const map = new BsConstructorMap;
    return *map;
}

ConcurrentMap<const ::android::hidl::base::V1_0::IBase*, wp<BHwBinder>>* const gBnMap =
        new ConcurrentMap<const ::android::hidl::base::V1_0::IBase*, wp<BHwBinder>>;
const DefaultsOnly<SchedPrio>* const gServicePrioMap = new DefaultsOnly<SchedPrio>;
const DefaultsOnly<bool>* const gServiceSidMap = new DefaultsOnly<bool>;

}  // namespace android::hardware::details
