// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhidl/ServiceManagerBase.h"

#include <sys/types.h>

#include <cstdint>
#include <map>
#include <memory>
#include <string>
#include <vector>

namespace android::hardware {

/**
 * Knows the services of the machine by the names of their interfaces and instances.
 *
 * Everybody may look services up and be told of them. Only root, the system user and the user that
 * the manager runs as may add them: whoever adds one receives the calls for it. The last one added
 * under a name has it. A service loses its names when its process ends.
 */
class ServiceManager : public ServiceManagerBase {
  public:
    Return<sp<IBase>> get(const hidl_string& interface, const hidl_string& name) override;
    Return<bool> add(const hidl_string& name, const sp<IBase>& service) override;
    Return<bool> addWithChain(const hidl_string& name, const sp<IBase>& service,
                              const hidl_vec<hidl_string>& chain) override;
    /** @param name empty for every instance. @return false for too many from one user, or too long
     * a name. */
    Return<bool> registerForNotifications(const hidl_string& interface, const hidl_string& name,
                                          const sp<IServiceNotification>& callback) override;
    /** @param interface empty for every one that the callback is registered for. */
    Return<bool> unregisterForNotifications(const hidl_string& interface, const hidl_string& name,
                                            const sp<IServiceNotification>& callback) override;
    /** Only the process that has added a service may take it away. */
    Return<bool> tryUnregister(const hidl_string& interface, const hidl_string& name,
                               const sp<IBase>& service) override;

  private:
    /** A service with all of its names. */
    struct Service {
        sp<IBase> object;
        pid_t pid;
        sp<hidl_death_recipient> recipient;

        ~Service();
    };

    /** A request for notifications. */
    struct Listener {
        Name name;
        sp<IServiceNotification> callback;
        uid_t uid;
        sp<hidl_death_recipient> recipient;
    };

    std::vector<InstanceDebugInfo> services() override;
    void removeService(const Service* service);
    size_t removeListeners(const Name& name, const sp<IServiceNotification>& callback);

    std::map<Name, std::shared_ptr<Service>> mServices;
    std::vector<Listener> mListeners;
};

}  // namespace android::hardware
