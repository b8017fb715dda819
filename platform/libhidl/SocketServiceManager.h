// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhidl/ServiceManagerBase.h"
#include "libhwbinder/SocketDriver.h"

#include <string>

namespace android::hardware {

/**
 * The service manager where calls go over sockets. It is no process of its own: each process looks
 * into the directories of sockets itself.
 */
class SocketServiceManager : public ServiceManagerBase {
  public:
    explicit SocketServiceManager(SocketDriver& driver) : mDriver(driver) {}

    /** Finds a service. @return OK, or why it is not there. */
    static Error find(SocketDriver& driver, const std::string& interface,
                      const std::string& instance, sp<IBase>* service);

    Return<sp<IBase>> get(const hidl_string& interface, const hidl_string& name) override;
    /** Has a thread look for the service ten times a second. */
    Return<bool> registerForNotifications(const hidl_string& interface, const hidl_string& name,
                                          const sp<IServiceNotification>& callback) override;
    Return<bool> unregisterForNotifications(const hidl_string& interface, const hidl_string& name,
                                            const sp<IServiceNotification>& callback) override;
    Return<bool> addWithChain(const hidl_string& name, const sp<IBase>& service,
                              const hidl_vec<hidl_string>& chain) override;
    /** Objects stay known until their process ends. */
    Return<bool> tryUnregister(const hidl_string&, const hidl_string&, const sp<IBase>&) override {
        return false;
    }

  private:
    std::vector<InstanceDebugInfo> services() override;

    SocketDriver& mDriver;
};

}  // namespace android::hardware
