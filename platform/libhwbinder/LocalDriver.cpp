// SPDX-License-Identifier: Apache-2.0
#include "LocalDriver.h"

#include "SocketDirectory.h"
#include "libhidl/LocalServiceManager.h"

namespace android::hardware {

status_t LocalDriver::transact(uint32_t /* handle */, void* connection, uint32_t code,
                               const Parcel& data, Parcel* reply, uint32_t flags) {
    if (connection == nullptr) return DEAD_OBJECT;
    return static_cast<LocalConnection*>(connection)->transact(code, data, reply, flags);
}

void* LocalDriver::acquire(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mConnections.find(handle);
    return found == mConnections.end() ? nullptr : &found->second;
}

void LocalDriver::release(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    mConnections.erase(handle);
}

status_t LocalDriver::requestDeathNotice(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mConnections.find(handle);
    const bool isWatched =
            found != mConnections.end() && mServer.watch(handle, found->second.socket());
    return isWatched ? OK : DEAD_OBJECT;
}

void LocalDriver::clearDeathNotice(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = mConnections.find(handle);
    if (found != mConnections.end()) mServer.unwatch(found->second.socket());
}

sp<::android::hidl::manager::V1_2::IServiceManager> LocalDriver::serviceManager(
        std::string* /* whyNot */) {
    return new LocalServiceManager(*this);
}

std::string LocalDriver::name() const {
    return "sockets in " + serverDirectory();
}

uint32_t LocalDriver::connect(const std::string& interface, const std::string& instance,
                              std::string* whyNot) {
    for (const std::string& directory : clientDirectories()) {
        std::string why;
        const int socket = connectTo(directory, socketName(interface, instance), &why);
        if (socket >= 0) {
            const std::lock_guard<std::mutex> lock(mMutex);
            mConnections.emplace(++mLastHandle, socket);
            return mLastHandle;
        }
        *whyNot += (whyNot->empty() ? "" : "; ") + why;
    }
    return 0;
}

}  // namespace android::hardware
