// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/LocalDriver.h"

#include "LocalConnection.h"
#include "LocalServer.h"
#include "libhwbinder/SocketDirectory.h"

namespace android::hardware {

LocalDriver::LocalDriver() : mServer(std::make_unique<LocalServer>()) {}

LocalDriver::~LocalDriver() = default;

std::unique_ptr<RemoteObject> LocalDriver::open(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mConnections.extract(handle);
    return found.empty() ? nullptr : std::move(found.mapped());
}

void LocalDriver::serve() {
    mServer->serve();
}

std::string LocalDriver::name() const {
    return "sockets in " + serverDirectory();
}

Error LocalDriver::connect(const std::string& interface, const std::string& instance,
                           uint32_t* handle) {
    std::string whyNot;
    for (const std::string& directory : clientDirectories()) {
        std::string why;
        const int socket = connectTo(directory, socketName(interface, instance), &why);
        if (socket >= 0) {
            const std::lock_guard<std::mutex> lock(mMutex);
            *handle = ++mLastHandle;
            mConnections[*handle] =
                    std::make_unique<LocalConnection>(socket, mServer.get(), *handle);
            return {};
        }
        whyNot += (whyNot.empty() ? "" : "; ") + why;
    }
    return {NAME_NOT_FOUND, whyNot};
}

bool LocalDriver::publish(const sp<BHwBinder>& object, const std::vector<std::string>& chain,
                          const std::string& instance) {
    return mServer->publish(object, chain, instance);
}

}  // namespace android::hardware
