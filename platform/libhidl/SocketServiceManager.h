// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhidl/ServiceManagerBase.h"
#include "libhwbinder/SocketDriver.h"

#include <sys/types.h>

#include <map>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace android::hardware {

/**
 * The service manager where calls go over sockets. It is no process of its own: each process has
 * one to its end, which looks into the directories of sockets.
 */
class SocketServiceManager : public ServiceManagerBase {
  public:
    explicit SocketServiceManager(SocketDriver& driver) : mDriver(driver) {}

    /** Finds a service. @return OK, or why it is not there. */
    Error find(const std::string& interface, const std::string& instance, sp<IBase>* service);

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
    /** What tells a socket from another one of its name: it changes with every registration. */
    using Socket = std::pair<ino_t, time_t>;
    /** Who wants to hear of which service. */
    struct Watch {
        Name name;
        sp<IServiceNotification> callback;
        Socket socket;
        bool isNew;
    };

    /** @return the sockets where this process looks for services, also by the links to them. */
    static std::map<Name, Socket> listSockets();
    std::vector<InstanceDebugInfo> services() override;
    void watch();

    SocketDriver& mDriver;
    std::mutex mMutex;
    std::vector<Watch> mWatches;
    bool mIsWatching = false;
};

}  // namespace android::hardware
