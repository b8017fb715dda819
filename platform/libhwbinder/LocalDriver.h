// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"
#include "LocalConnection.h"
#include "LocalServer.h"

#include <map>
#include <mutex>
#include <string>
#include <vector>

namespace android::hardware {

/** Carries calls over sockets, on a machine whose kernel has no binder driver. */
class LocalDriver : public Driver {
  public:
    status_t transact(uint32_t handle, void* connection, uint32_t code, const Parcel& data,
                      Parcel* reply, uint32_t flags) override;
    void serve() override { mServer.serve(); }
    /** @return the connection, which stays until it is released. */
    void* acquire(uint32_t handle) override;
    void release(uint32_t handle) override;
    status_t requestDeathNotice(uint32_t handle) override;
    void clearDeathNotice(uint32_t handle) override;
    sp<::android::hidl::manager::V1_2::IServiceManager> serviceManager(
            std::string* whyNot) override;
    std::string name() const override;

    /** Connects to a service. @return its handle; 0, with the reason, where it is not there. */
    uint32_t connect(const std::string& interface, const std::string& instance,
                     std::string* whyNot);

    /**
     * Makes an object known, and known again as soon as a process that has the name now has gone.
     *
     * @param chain its interface and those that it extends, the base last.
     */
    bool publish(const sp<BHwBinder>& object, const std::vector<std::string>& chain,
                 const std::string& instance) {
        return mServer.publish(object, chain, instance);
    }

  private:
    LocalServer mServer;
    std::mutex mMutex;
    uint32_t mLastHandle = 0;
    std::map<uint32_t, LocalConnection> mConnections;
};

}  // namespace android::hardware
