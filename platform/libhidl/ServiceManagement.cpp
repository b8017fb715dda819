// SPDX-License-Identifier: Apache-2.0
#include "LocalServiceManager.h"

#include <android/hidl/manager/1.2/BpHwServiceManager.h>
#include <android/log.h>
#include <hidl/Host.h>
#include <hidl/ServiceManagement.h>
#include <hwbinder/ProcessState.h>

#include <algorithm>
#include <chrono>
#include <thread>

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

/** Asks once for the service manager. @return OK, or why none answers. */
Error askForManager(sp<Manager>* manager) {
    if (LocalDriver* sockets = driver().localDriver()) {
        *manager = new LocalServiceManager(*sockets);
        return {};
    }
    Error error = driver().check();
    if (!error.isOk()) return error;
    const sp<Manager> proxy =
            new BpHwServiceManager(ProcessState::self()->getStrongProxyForHandle(0));
    if (!proxy->ping().isOk()) {
        return {DEAD_OBJECT, driver().name() + ": no service manager answers"};
    }
    *manager = proxy;
    return {};
}

/** Asks once for a service. @return OK, or why it is not there. */
Error askForService(const std::string& interface, const std::string& instance, sp<IBase>* service) {
    if (LocalDriver* sockets = driver().localDriver()) {
        return LocalServiceManager::find(*sockets, interface, instance, service);
    }
    sp<Manager> manager;
    Error error = askForManager(&manager);
    if (!error.isOk()) return error;
    const Return<sp<IBase>> found = manager->get(interface, instance);
    if (!found.isOk()) return {UNKNOWN_ERROR, found.description()};
    *service = found;
    if (*service != nullptr) return {};
    return {NAME_NOT_FOUND, driver().name() + ": the service manager does not know it"};
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
        error = {error.code(), what + " is not there: " + error.text()};
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
                        host::transportDescription().c_str());
    const auto complain = [](const std::string& whyNot) {
        __android_log_print(ANDROID_LOG_ERROR, kLogTag, "not registered: %s", whyNot.c_str());
    };
    sp<Manager> manager;
    const Error error = findManager(kForEver, &manager);
    if (!error.isOk()) {
        complain(error.text());
        return NO_INIT;
    }
    bool isKnown = false;
    const Return<void> asked = service->interfaceChain([&](const auto& chain) {
        const Return<bool> added = manager->addWithChain(instance, service, chain);
        isKnown = added.withDefault(false);
        if (!added.isOk()) complain(added.description());
    });
    return asked.isOk() && isKnown ? OK : UNKNOWN_ERROR;
}

}  // namespace details

namespace host {

std::string transportDescription() {
    return ProcessState::self()->driverDescription();
}

void setCallTimeout(milliseconds limit) {
    ::android::hardware::setCallTimeout(static_cast<int>(limit.count()));
}

std::string serviceManagerDescription() {
    if (driver().localDriver() != nullptr) return "none is needed";
    sp<Manager> manager;
    const Error error = askForManager(&manager);
    return error.isOk() ? "answers" : error.text();
}

std::string lookupError(const std::string& interface, const std::string& instance) {
    sp<IBase> service;
    const Error error = findService(milliseconds(0), interface, instance, &service);
    return error.isOk() ? interface + "/" + instance + " is there now" : error.text();
}

}  // namespace host
}  // namespace android::hardware
