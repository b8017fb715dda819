// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhwbinder/Driver.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace android::hardware {

class SocketServer;

/** Carries calls over sockets, on a machine whose kernel has no binder driver. */
class SocketDriver : public Driver {
  public:
    SocketDriver();

    std::unique_ptr<RemoteObject> open(uint32_t handle) override;
    void serve() override;
    SocketDriver* socketDriver() override { return this; }

    /** @return where a service was found last; before that, where one of this process would be. */
    std::string directory() const;

    /**
     * Connects to a service.
     *
     * @param handle takes the handle, which is to be opened once.
     * @return OK, or why there is no such service, for each place where it was looked for.
     */
    Error connect(const std::string& interface, const std::string& instance, uint32_t* handle);

    /**
     * Makes an object known, and known again as soon as a process that has the name now has gone.
     *
     * @param chain its interface and those that it extends, the base last.
     */
    bool publish(const sp<BHwBinder>& object, const std::vector<std::string>& chain,
                 const std::string& instance);

  private:
    SocketServer& mServer;
    mutable std::mutex mMutex;
    std::string mDirectory;
    uint32_t mLastHandle = 0;
    /** Those that are not open yet. */
    std::map<uint32_t, std::unique_ptr<RemoteObject>> mConnections;
};

}  // namespace android::hardware
