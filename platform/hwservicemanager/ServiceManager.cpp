// SPDX-License-Identifier: Apache-2.0
#include "ServiceManager.h"

#include <android/log.h>
#include <hidl/HidlTransportSupport.h>
#include <hwbinder/IPCThreadState.h>
#include <private/android_filesystem_config.h>
#include <unistd.h>

#include <algorithm>
#include <functional>
#include <utility>

namespace android::hardware {
namespace {

constexpr char kTag[] = "hwservicemanager";

/** Notifications that one user may ask for at the most: each takes memory of the manager. */
constexpr ptrdiff_t kMaxListenersPerUid = 64;
/** Of the name of an interface or an instance, in characters. */
constexpr size_t kMaxNameLength = 1024;

/** Calls a function when a remote object has died. */
class WhenDead : public hidl_death_recipient {
  public:
    explicit WhenDead(std::function<void()> call) : mCall(std::move(call)) {}
    void serviceDied(uint64_t /* cookie */,
                     const wp<ServiceManagerBase::IBase>& /* who */) override {
        mCall();
    }

  private:
    const std::function<void()> mCall;
};

/** @return whether the caller may add services. */
bool mayAdd(const std::string& name) {
    const uid_t uid = IPCThreadState::self()->getCallingUid();
    if (uid == AID_ROOT || uid == AID_SYSTEM || uid == getuid()) return true;
    __android_log_print(ANDROID_LOG_WARN, kTag, "uid %u may not add a service \"%s\"", uid,
                        name.c_str());
    return false;
}

/** @return whether two proxies, or objects, are of the same object. */
template <typename First, typename Second>
bool isSame(const sp<First>& first, const sp<Second>& second) {
    return getOrCreateCachedBinder(first.get()) == getOrCreateCachedBinder(second.get());
}

}  // namespace

ServiceManager::Service::~Service() {
    object->unlinkToDeath(recipient);
}

Return<sp<ServiceManager::IBase>> ServiceManager::get(const hidl_string& interface,
                                                      const hidl_string& name) {
    const auto found = mServices.find({interface, name});
    return found == mServices.end() ? sp<IBase>() : found->second->object;
}

Return<bool> ServiceManager::add(const hidl_string& name, const sp<IBase>& service) {
    // Checked first: to ask a hostile object for its interfaces could take for ever.
    return mayAdd(name) && ServiceManagerBase::add(name, service).withDefault(false);
}

Return<bool> ServiceManager::addWithChain(const hidl_string& name, const sp<IBase>& service,
                                          const hidl_vec<hidl_string>& chain) {
    if (!mayAdd(name) || service == nullptr || chain.size() == 0 || name.empty()) return false;
    auto added = std::make_shared<Service>();
    added->object = service;
    added->pid = IPCThreadState::self()->getCallingPid();
    added->recipient = new WhenDead([this, key = added.get()] { removeService(key); });
    if (service->isRemote() && !service->linkToDeath(added->recipient, 0).withDefault(false)) {
        return false;
    }
    for (const hidl_string& interface : chain) {
        if (interface == IBase::descriptor) continue;
        mServices[{interface, name}] = added;
        for (const Listener& listener : mListeners) {
            if (listener.name.first == std::string(interface) &&
                (listener.name.second.empty() || listener.name.second == std::string(name))) {
                listener.callback->onRegistration(interface, name, false);
            }
        }
    }
    __android_log_print(ANDROID_LOG_INFO, kTag, "added %s/%s of process %d", chain[0].c_str(),
                        name.c_str(), added->pid);
    return true;
}

void ServiceManager::removeService(const Service* service) {
    for (auto each = mServices.begin(); each != mServices.end();) {
        each = each->second.get() == service ? mServices.erase(each) : std::next(each);
    }
}

std::vector<ServiceManager::InstanceDebugInfo> ServiceManager::services() {
    std::vector<InstanceDebugInfo> infos;
    for (const auto& [name, service] : mServices)
        infos.push_back({name.first, name.second, service->pid, {}, {}});
    return infos;
}

Return<bool> ServiceManager::registerForNotifications(const hidl_string& interface,
                                                      const hidl_string& name,
                                                      const sp<IServiceNotification>& callback) {
    const uid_t uid = IPCThreadState::self()->getCallingUid();
    const auto count = std::count_if(mListeners.begin(), mListeners.end(),
                                     [&](const Listener& each) { return each.uid == uid; });
    if (callback == nullptr || interface.empty() || count >= kMaxListenersPerUid ||
        interface.size() > kMaxNameLength || name.size() > kMaxNameLength) {
        return false;
    }
    const sp<hidl_death_recipient> recipient =
            new WhenDead([this, callback = wp<IServiceNotification>(callback)] {
                removeListeners({}, callback.promote());
            });
    if (callback->isRemote() && !callback->linkToDeath(recipient, 0).withDefault(false)) {
        return false;
    }
    mListeners.push_back({{interface, name}, callback, uid, recipient});
    for (const auto& [known, service] : mServices) {
        if (interface == known.first && (name.empty() || name == known.second)) {
            callback->onRegistration(known.first, known.second, true);
        }
    }
    return true;
}

Return<bool> ServiceManager::unregisterForNotifications(const hidl_string& interface,
                                                        const hidl_string& name,
                                                        const sp<IServiceNotification>& callback) {
    return callback != nullptr && removeListeners({interface, name}, callback) > 0;
}

size_t ServiceManager::removeListeners(const Name& name, const sp<IServiceNotification>& callback) {
    const size_t before = mListeners.size();
    const auto isMeant = [&](const Listener& each) {
        if (!(name.first.empty() || each.name == name) || callback == nullptr ||
            !isSame(each.callback, callback)) {
            return false;
        }
        each.callback->unlinkToDeath(each.recipient);
        return true;
    };
    mListeners.erase(std::remove_if(mListeners.begin(), mListeners.end(), isMeant),
                     mListeners.end());
    return before - mListeners.size();
}

Return<bool> ServiceManager::tryUnregister(const hidl_string& interface, const hidl_string& name,
                                           const sp<IBase>& service) {
    const auto found = mServices.find({interface, name});
    if (found == mServices.end() || service == nullptr ||
        found->second->pid != IPCThreadState::self()->getCallingPid() ||
        !isSame(found->second->object, service)) {
        return false;
    }
    const std::shared_ptr<Service> last = found->second;
    removeService(last.get());
    return true;
}

}  // namespace android::hardware
