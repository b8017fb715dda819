// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhidl/ServiceManagerBase.h"

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

/**
 * Knows the services of the machine by the names of their interfaces and instances.
 *
 * Everybody may look services up and be told of them. Only root, the system user and the user that
 * the manager runs as may add them: whoever adds one receives the calls for it. The last one added
 * under a name has it. A service loses its names when its process ends.
 */
class ServiceManager : public ::android::hardware::ServiceManagerBase {
  public:
    using Interface = ::android::hidl::base::V1_0::IBase;
    using Notification = ::android::hidl::manager::V1_0::IServiceNotification;
    template <typename T>
    using Return = ::android::hardware::Return<T>;
    using Text = ::android::hardware::hidl_string;

    Return<::android::sp<Interface>> get(const Text& interface, const Text& name) override;
    Return<bool> add(const Text& name, const ::android::sp<Interface>& service) override;
    Return<bool> addWithChain(const Text& name, const ::android::sp<Interface>& service,
                              const ::android::hardware::hidl_vec<Text>& chain) override;
    /** @param name empty for every instance. @return false for too many from one user, or too long
     * a name. */
    Return<bool> registerForNotifications(const Text& interface, const Text& name,
                                          const ::android::sp<Notification>& callback) override;
    /** @param interface empty for every one that the callback is registered for. */
    Return<bool> unregisterForNotifications(const Text& interface, const Text& name,
                                            const ::android::sp<Notification>& callback) override;
    /** Only the process that has added a service may take it away. */
    Return<bool> tryUnregister(const Text& interface, const Text& name,
                               const ::android::sp<Interface>& service) override;

  private:
    /** An interface and an instance. */
    using Name = std::pair<std::string, std::string>;

    /** A service with all of its names. */
    struct Service {
        ::android::sp<Interface> object;
        pid_t pid;
        ::android::sp<::android::hardware::hidl_death_recipient> recipient;

        ~Service();
    };

    /** A request for notifications. */
    struct Listener {
        Name name;
        ::android::sp<Notification> callback;
        uid_t uid;
        ::android::sp<::android::hardware::hidl_death_recipient> recipient;
    };

    std::vector<InstanceDebugInfo> services() override;
    void removeService(const Service* service);
    size_t removeListeners(const Name& name, const ::android::sp<Notification>& callback);

    std::map<Name, std::shared_ptr<Service>> mServices;
    std::vector<Listener> mListeners;
};
