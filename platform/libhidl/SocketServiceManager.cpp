// SPDX-License-Identifier: Apache-2.0
#include "SocketServiceManager.h"

#include "libhwbinder/SocketDirectory.h"

#include <android/hidl/base/1.0/BpHwBase.h>
#include <dirent.h>
#include <fcntl.h>
#include <hwbinder/ProcessState.h>
#include <sys/stat.h>

#include <algorithm>
#include <chrono>
#include <thread>
#include <utility>

namespace android::hardware {

using ::android::hidl::base::V1_0::IBase;

auto SocketServiceManager::listSockets() -> std::map<Name, Socket> {
    std::map<Name, Socket> sockets;
    for (const std::string& path : clientDirectories()) {
        SocketDirectory directory;
        if (!directory.open(path, false).isOk()) continue;
        DIR* entries =
                fdopendir(openat(directory.descriptor(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
        if (entries == nullptr) continue;
        while (const dirent* entry = readdir(entries)) {
            const std::string name = entry->d_name;
            struct stat info;
            // "a.b@1.0::IName.instance": a dot ends the interface behind its last colon.
            const size_t colon = name.find("::");
            const size_t dot = colon == std::string::npos ? colon : name.find('.', colon);
            if (dot != std::string::npos && name.back() != '~' &&
                fstatat(directory.descriptor(), name.c_str(), &info, 0) == 0 &&
                S_ISSOCK(info.st_mode)) {
                sockets.emplace(Name(name.substr(0, dot), name.substr(dot + 1)),
                                Socket(info.st_ino, info.st_ctime));
            }
        }
        closedir(entries);
    }
    return sockets;
}

Error SocketServiceManager::find(const std::string& interface, const std::string& instance,
                                 sp<IBase>* service) {
    uint32_t handle = 0;
    Error error = mDriver.connect(interface, instance, &handle);
    if (error.isOk()) {
        *service = new ::android::hidl::base::V1_0::BpHwBase(
                ProcessState::self()->getStrongProxyForHandle(handle));
    }
    return error;
}

Return<sp<IBase>> SocketServiceManager::get(const hidl_string& interface, const hidl_string& name) {
    sp<IBase> service;
    (void)find(interface, name, &service);
    return service;
}

std::vector<SocketServiceManager::InstanceDebugInfo> SocketServiceManager::services() {
    std::vector<InstanceDebugInfo> infos;
    for (const auto& [name, socket] : listSockets())
        infos.push_back({name.first, name.second, static_cast<pid_t>(PidConstant::NO_PID), {}, {}});
    return infos;
}

Return<bool> SocketServiceManager::registerForNotifications(
        const hidl_string& interface, const hidl_string& name,
        const sp<IServiceNotification>& callback) {
    if (callback == nullptr) return false;
    const std::lock_guard<std::mutex> lock(mMutex);
    if (!std::exchange(mIsWatching, true)) std::thread([this] { watch(); }).detach();
    mWatches.push_back({{interface, name}, callback, {}, true});
    return true;
}

Return<bool> SocketServiceManager::unregisterForNotifications(
        const hidl_string& interface, const hidl_string& name,
        const sp<IServiceNotification>& callback) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto first = std::remove_if(mWatches.begin(), mWatches.end(), [&](const Watch& watch) {
        return watch.callback == callback &&
               (interface.empty() || watch.name == Name(interface, name));
    });
    const bool isFound = first != mWatches.end();
    mWatches.erase(first, mWatches.end());
    return isFound;
}

/** Tells of sockets as long as there is anybody to tell. */
void SocketServiceManager::watch() {
    for (;;) {
        std::vector<Watch> news;
        {
            const std::lock_guard<std::mutex> lock(mMutex);
            mIsWatching = !mWatches.empty();
            if (!mIsWatching) return;
            auto sockets = listSockets();
            for (Watch& watch : mWatches) {
                const Socket socket = sockets[watch.name];
                if (socket != Socket() && socket != watch.socket) news.push_back(watch);
                watch.socket = socket;
                watch.isNew = false;
            }
        }
        for (const Watch& watch : news)
            watch.callback->onRegistration(watch.name.first, watch.name.second, watch.isNew);
        std::this_thread::sleep_for(std::chrono::milliseconds(100));
    }
}

Return<bool> SocketServiceManager::addWithChain(const hidl_string& name, const sp<IBase>& service,
                                                const hidl_vec<hidl_string>& chain) {
    if (service == nullptr || service->isRemote() || chain.size() == 0) return false;
    const sp<IBinder> binder = getOrCreateCachedBinder(service.get());
    if (binder == nullptr) return false;
    const std::vector<std::string> names(chain.begin(), chain.end());
    return mDriver.publish(binder->localBinder(), names, name);
}

}  // namespace android::hardware
