// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Binder.h>
#include <utils/RefBase.h>

#include <functional>
#include <map>
#include <mutex>
#include <string>
#include <utility>

namespace android::hidl::base::V1_0 {
struct IBase;
}

/** Data that generated code keeps before main and after it, and so is never destroyed. */
namespace android::hardware::details {

/** A map that threads share. */
template <typename Key, typename Value>
class ConcurrentMap {
  public:
    void set(Key key, Value value) {
        const std::lock_guard<std::mutex> lock(mMutex);
        mMap[std::move(key)] = std::move(value);
    }
    /** @return the value of a key, or another one if it has none. */
    Value get(const Key& key, Value otherwise) const {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto found = mMap.find(key);
        return found == mMap.end() ? otherwise : found->second;
    }
    void erase(const Key& key) {
        const std::lock_guard<std::mutex> lock(mMutex);
        mMap.erase(key);
    }
    /** Erases a key, unless its value has changed. */
    void eraseIfEqual(const Key& key, const void* object) {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto found = mMap.find(key);
        if (found != mMap.end() && found->second.unsafe_get() == object) mMap.erase(found);
    }

  private:
    mutable std::mutex mMutex;
    std::map<Key, Value> mMap;
};

/** Settings of objects, which are never changed here: every object has the given default. */
template <typename Value>
struct DefaultsOnly {
    template <typename Object>
    Value get(const Object& /* object */, Value otherwise) const {
        return otherwise;
    }
};

struct SchedPrio {
    int sched_policy;
    int prio;
};

using BnConstructorMap = ConcurrentMap<std::string, std::function<sp<IBinder>(void*)>>;
using BsConstructorMap =
        ConcurrentMap<std::string, std::function<sp<::android::hidl::base::V1_0::IBase>(void*)>>;

/** @return makers of stubs, by the descriptor of their interface. */
inline BnConstructorMap& getBnConstructorMap() {
    static auto* const map = new BnConstructorMap;
    return *map;
}
/** @return makers of wrappers for objects of the same process. */
inline BsConstructorMap& getBsConstructorMap() {
    static auto* const map = new BsConstructorMap;
    return *map;
}

/** The stub of each object that has one. */
inline auto* const gBnMap =
        new ConcurrentMap<const ::android::hidl::base::V1_0::IBase*, wp<BHwBinder>>;
inline const auto* const gServicePrioMap = new DefaultsOnly<SchedPrio>;
inline const auto* const gServiceSidMap = new DefaultsOnly<bool>;

}  // namespace android::hardware::details
