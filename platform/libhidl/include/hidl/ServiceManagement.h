// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlBinderSupport.h>
#include <utils/Errors.h>

#include <string>

namespace android::hidl::manager::V1_0 {
struct IServiceManager;
struct IServiceNotification;
}  // namespace android::hidl::manager::V1_0
namespace android::hidl::manager::V1_2 {
struct IServiceManager;
}

namespace android::hardware {

/**
 * Finds the service manager, and waits for at most 5 s if none answers yet.
 *
 * @return nullptr if none has answered.
 */
sp<::android::hidl::manager::V1_0::IServiceManager> defaultServiceManager();
sp<::android::hidl::manager::V1_2::IServiceManager> defaultServiceManager1_2();

namespace details {

/**
 * Finds a service, and asks it whether it has the interface.
 *
 * @param retry whether to wait for it, for at most 5 s.
 * @return nullptr if it is not there; host::findService says why.
 */
sp<::android::hidl::base::V1_0::IBase> getRawServiceInternal(const std::string& interface,
                                                             const std::string& instance,
                                                             bool retry);

template <typename Proxy>
sp<typename Proxy::Pure> getServiceInternal(const std::string& instance, bool retry,
                                            bool /* getStub */) {
    using Interface = typename Proxy::Pure;
    const sp<::android::hidl::base::V1_0::IBase> base =
            getRawServiceInternal(Interface::descriptor, instance, retry);
    if (base == nullptr) return nullptr;
    if (base->isRemote()) return new Proxy(getOrCreateCachedBinder(base.get()));
    return static_cast<Interface*>(base.get());
}

/**
 * Registers an object under the names of all of its interfaces. Waits until the service manager
 * answers. If that dies, a thread waits for the next one and registers the object again.
 *
 * @return OK; UNKNOWN_ERROR if the manager refuses it.
 */
status_t registerAsServiceInternal(const sp<::android::hidl::base::V1_0::IBase>& service,
                                   const std::string& instance);

}  // namespace details
}  // namespace android::hardware
