// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/SocketDriver.h"

#include "SocketConnection.h"
#include "SocketServer.h"
#include "libhwbinder/SocketDirectory.h"

namespace android::hardware {

SocketDriver::SocketDriver() : mServer(*new SocketServer), mDirectory(serverDirectory()) {}

std::unique_ptr<RemoteObject> SocketDriver::open(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mConnections.extract(handle);
    return found.empty() ? nullptr : std::move(found.mapped());
}

void SocketDriver::serve() {
    mServer.serve();
}

std::string SocketDriver::directory() const {
    const std::lock_guard<std::mutex> lock(mMutex);
    return mDirectory;
}

Error SocketDriver::connect(const std::string& interface, const std::string& instance,
                            uint32_t* handle) {
    std::string whyNot;
    for (const std::string& path : clientDirectories()) {
        SocketDirectory directory;
        UniqueFd socket;
        Error error = directory.open(path, false);
        if (error.isOk()) error = directory.connect(socketName(interface, instance), &socket);
        if (error.isOk()) {
            const std::lock_guard<std::mutex> lock(mMutex);
            mDirectory = path;
            *handle = ++mLastHandle;
            mConnections[*handle] = std::make_unique<SocketConnection>(std::move(socket),
                                                                       mServer.deaths(), *handle);
            return error;
        }
        whyNot += (whyNot.empty() ? "" : "; ") + error.text();
    }
    return {NAME_NOT_FOUND, whyNot};
}

bool SocketDriver::publish(const sp<BHwBinder>& object, const std::vector<std::string>& chain,
                           const std::string& instance) {
    return mServer.add({object, chain, instance});
}

}  // namespace android::hardware
