// SPDX-License-Identifier: Apache-2.0
#include "SocketServiceManager.h"

#include <android/hidl/manager/1.2/BpHwServiceManager.h>
#include <android/log.h>
#include <hidl/Host.h>
#include <hidl/ServiceManagement.h>
#include <hwbinder/ProcessState.h>

#include <algorithm>
#include <chrono>
#include <mutex>
#include <thread>
#include <utility>
#include <vector>

namespace android::hardware {
namespace {

using ::android::hidl::base::V1_0::IBase;
using ::android::hidl::manager::V1_0::IServiceManager;
using ::android::hidl::manager::V1_2::BpHwServiceManager;
using std::chrono::milliseconds;
using std::chrono::steady_clock;
using Manager = ::android::hidl::manager::V1_2::IServiceManager;

constexpr milliseconds kPatience(5000);
constexpr milliseconds kForEver = milliseconds::max();

Driver& driver() {
    return ProcessState::self()->driver();
}

/** @return why a call has failed. */
Error errorOf(const details::return_status& call) {
    // That of an exception has no status.
    const status_t error = call.status().transactionError();
    return {error == OK ? UNKNOWN_ERROR : error, call.description()};
}

/** @return the service manager of this process; nullptr where another process is that. */
SocketServiceManager* ownManager() {
    SocketDriver* const sockets = driver().socketDriver();
    if (sockets == nullptr) return nullptr;
    static const auto& manager = *new sp<SocketServiceManager>(new SocketServiceManager(*sockets));
    return manager.get();
}

/** Asks once for the service manager. @return OK, or why none answers. */
Error askForManager(sp<Manager>* manager) {
    *manager = ownManager();
    if (*manager != nullptr) return {};
    Error error = driver().check();
    if (!error.isOk()) return error;
    const sp<Manager> proxy =
            new BpHwServiceManager(ProcessState::self()->getStrongProxyForHandle(0));
    if (!proxy->ping().isOk()) {
        return {DEAD_OBJECT, host::transport().path + ": no service manager answers"};
    }
    *manager = proxy;
    return {};
}

/** Looks a name up once. @return OK, or why nothing has it. */
Error lookUp(const std::string& interface, const std::string& instance, sp<IBase>* service) {
    if (auto* own = ownManager()) return own->find(interface, instance, service);
    sp<Manager> manager;
    Error error = askForManager(&manager);
    if (!error.isOk()) return error;
    const Return<sp<IBase>> found = manager->get(interface, instance);
    if (!found.isOk()) return errorOf(found);
    *service = found;
    if (*service != nullptr) return {};
    return {NAME_NOT_FOUND, host::transport().path + ": the service manager does not know it"};
}

/** Asks once for a service. @return OK, or why it is not there. */
Error askForService(const std::string& interface, const std::string& instance, sp<IBase>* service) {
    sp<IBase> found;
    Error error = lookUp(interface, instance, &found);
    if (!error.isOk()) return error;
    // Whoever has registered it has said so, but may be wrong.
    const Return<bool> hasInterface = details::hasInterface(found.get(), interface.c_str());
    if (!hasInterface.isOk()) return errorOf(hasInterface);
    if (!hasInterface) return {BAD_TYPE, "what has the name does not have the interface"};
    *service = found;
    return {};
}

/**
 * Asks for something until it is there.
 *
 * @param patience for how long; it is asked once at least.
 * @param what is waited for.
 * @return OK, or why it is not there.
 */
template <typename Ask>
Error waitFor(milliseconds patience, const std::string& what, Ask ask) {
    if (!driver().check().isOk()) patience = milliseconds(0);
    const steady_clock::time_point start = steady_clock::now();
    milliseconds pause(1);
    for (;;) {
        Error error = ask();
        if (error.isOk()) return error;
        const bool isSilent = error.code() == TIMED_OUT;
        error = {error.code(), what + (isSilent ? ": " : " is not there: ") + error.text()};
        if (patience != kForEver && steady_clock::now() - start >= patience) return error;
        if (pause == milliseconds(1)) {
            __android_log_print(ANDROID_LOG_INFO, kLogTag, "waiting; %s", error.text().c_str());
        }
        std::this_thread::sleep_for(pause);
        pause = std::min(2 * pause, milliseconds(128));
    }
}

Error findManager(milliseconds patience, sp<Manager>* manager) {
    return waitFor(patience, "the service manager", [&] { return askForManager(manager); });
}

Error findService(milliseconds patience, const std::string& interface, const std::string& instance,
                  sp<IBase>* service) {
    return waitFor(patience, interface + "/" + instance,
                   [&] { return askForService(interface, instance, service); });
}

/** Tells a service manager of an object, under the names of all of its interfaces. */
Return<bool> add(Manager& manager, const sp<IBase>& service, const std::string& instance) {
    hidl_vec<hidl_string> chain;
    const Return<void> asked = service->interfaceChain([&](const auto& names) { chain = names; });
    if (!asked.isOk()) return asked.status();
    const Return<bool> added = manager.addWithChain(instance, service, chain);
    // A manager of 1.0 or 1.1 asks the object itself for its interfaces.
    const bool isOlder = added.status().transactionError() == UNKNOWN_TRANSACTION;
    return isOlder ? manager.add(instance, service) : added;
}

/**
 * What this process has registered. When the service manager dies, it is registered again with the
 * one that comes in its place.
 */
class Registrations : public hidl_death_recipient {
  public:
    /** Waits until the manager answers. @return OK, or why it does not know the service. */
    Error add(const sp<IBase>& service, const std::string& instance) {
        const std::lock_guard<std::mutex> lock(mMutex);
        if (mManager == nullptr) {
            Error error = connect();
            if (!error.isOk()) return error;
        }
        const Return<bool> added = hardware::add(*mManager, service, instance);
        if (added.isOk() && !added) return {UNKNOWN_ERROR, "the service manager refuses it"};
        // A manager that has died meanwhile has a successor.
        mServices.emplace_back(service, instance);
        return added.isOk() ? Error() : errorOf(added);
    }

    void serviceDied(uint64_t /* cookie */, const wp<IBase>& /* who */) override {
        // The thread that has this news serves the calls of those who have found the services.
        std::thread([this] { addAgain(); }).detach();
    }

  private:
    /** Finds the manager, and asks for news of its death. */
    Error connect() {
        for (;;) {
            Error error = findManager(kForEver, &mManager);
            if (!error.isOk() || mManager->linkToDeath(this, 0).withDefault(false)) return error;
            // It has just died, or its predecessor's proxy still lives.
            mManager.clear();
            std::this_thread::sleep_for(milliseconds(100));
        }
    }

    void addAgain() {
        const std::lock_guard<std::mutex> lock(mMutex);
        do {
            mManager.clear();
            if (!connect().isOk()) return;
        } while (!addAll());
    }

    /** @return false if the manager has died meanwhile. */
    bool addAll() {
        for (const auto& [service, instance] : mServices) {
            const Return<bool> added = hardware::add(*mManager, service, instance);
            if (!added.isOk()) {
                std::this_thread::sleep_for(milliseconds(100));
                return false;
            }
            __android_log_print(added ? ANDROID_LOG_INFO : ANDROID_LOG_ERROR, kLogTag,
                                "%s with the new service manager: %s",
                                added ? "registered" : "not registered", instance.c_str());
        }
        return true;
    }

    std::mutex mMutex;
    sp<Manager> mManager;
    std::vector<std::pair<sp<IBase>, std::string>> mServices;
};

}  // namespace

sp<IServiceManager> defaultServiceManager() {
    return defaultServiceManager1_2();
}

sp<Manager> defaultServiceManager1_2() {
    sp<Manager> manager;
    (void)findManager(kPatience, &manager);
    return manager;
}

namespace details {

sp<IBase> getRawServiceInternal(const std::string& interface, const std::string& instance,
                                bool retry) {
    sp<IBase> service;
    (void)findService(retry ? kPatience : milliseconds(0), interface, instance, &service);
    return service;
}

status_t registerAsServiceInternal(const sp<IBase>& service, const std::string& instance) {
    __android_log_print(ANDROID_LOG_INFO, kLogTag, "calls go over %s",
                        host::transport().inWords().c_str());
    // Never destroyed: the manager may die at any time.
    static auto* const registrations = new sp<Registrations>(new Registrations);
    const Error error = (*registrations)->add(service, instance);
    // Over sockets the server has said why, and goes on trying.
    if (!error.isOk() && ownManager() == nullptr) {
        __android_log_print(ANDROID_LOG_ERROR, kLogTag, "not registered: %s", error.text().c_str());
    }
    return error.code();
}

}  // namespace details

namespace host {

Transport transport() {
    Transport transport = ProcessState::self()->transport();
    if (SocketDriver* sockets = driver().socketDriver()) transport.path = sockets->directory();
    return transport;
}

void setCallTimeout(milliseconds limit) {
    callTimeout = static_cast<int>(limit.count());
}

ManagerState managerState(std::string* whyNot) {
    if (ownManager() != nullptr) return ManagerState::NOT_NEEDED;
    sp<Manager> manager;
    const Error error = askForManager(&manager);
    if (error.isOk()) return ManagerState::ANSWERS;
    *whyNot = error.text();
    return ManagerState::SILENT;
}

status_t findService(const std::string& interface, const std::string& instance, sp<IBase>* service,
                     std::string* whyNot) {
    const Error error = hardware::findService(milliseconds(0), interface, instance, service);
    *whyNot = error.text();
    return error.code();
}

}  // namespace host
}  // namespace android::hardware
