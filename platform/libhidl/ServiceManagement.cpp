// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Driver.h"

#include <android/hidl/manager/1.2/IServiceManager.h>
#include <android/log.h>
#include <hidl/ServiceManagement.h>
#include <hwbinder/Host.h>
#include <hwbinder/ProcessState.h>

#include <algorithm>
#include <chrono>
#include <thread>

namespace android::hardware {
namespace {

using ::android::hidl::base::V1_0::IBase;
using ::android::hidl::manager::V1_0::IServiceManager;
using std::chrono::milliseconds;
using std::chrono::steady_clock;
using Manager = ::android::hidl::manager::V1_2::IServiceManager;

constexpr milliseconds kPatience(5000);
constexpr milliseconds kForEver = milliseconds::max();

/**
 * Asks for something until it is there.
 *
 * @param patience for how long; it is asked once at least.
 * @param what is waited for, for the log.
 * @param find gives nullptr while it is not there, and then the reason in its argument.
 */
template <typename Find>
auto waitFor(milliseconds patience, const std::string& what, Find find) {
    const steady_clock::time_point start = steady_clock::now();
    milliseconds pause(1);
    for (;;) {
        std::string whyNot;
        auto found = find(&whyNot);
        if (found != nullptr) return found;
        lookupError() = what + " is not there: " + whyNot;
        if (patience != kForEver && steady_clock::now() - start >= patience) return found;
        if (pause == milliseconds(1)) {
            __android_log_print(ANDROID_LOG_INFO, kLogTag, "waiting; %s", lookupError().c_str());
        }
        std::this_thread::sleep_for(pause);
        pause = std::min(2 * pause, milliseconds(128));
    }
}

sp<Manager> findManager(milliseconds patience) {
    Driver& driver = ProcessState::self()->driver();
    return waitFor(driver.isUsable() ? patience : milliseconds(0), "the service manager",
                   [&](std::string* whyNot) { return driver.serviceManager(whyNot); });
}

}  // namespace

std::string& lookupError() {
    static thread_local std::string error;
    return error;
}

sp<IServiceManager> defaultServiceManager() {
    return defaultServiceManager1_2();
}

sp<Manager> defaultServiceManager1_2() {
    return findManager(kPatience);
}

namespace details {

sp<IBase> getRawServiceInternal(const std::string& interface, const std::string& instance,
                                bool retry) {
    Driver& driver = ProcessState::self()->driver();
    const bool waits = retry && driver.isUsable();
    return waitFor(waits ? kPatience : milliseconds(0), interface + "/" + instance,
                   [&](std::string* whyNot) -> sp<IBase> {
                       const sp<Manager> manager = driver.serviceManager(whyNot);
                       if (manager == nullptr) return nullptr;
                       lookupError() = driver.name() + ": the service manager does not know it";
                       const Return<sp<IBase>> service = manager->get(interface, instance);
                       *whyNot = service.isOk() ? lookupError() : service.description();
                       return service.withDefault(nullptr);
                   });
}

status_t registerAsServiceInternal(const sp<IBase>& service, const std::string& instance) {
    __android_log_print(ANDROID_LOG_INFO, kLogTag, "calls go over %s",
                        host::transportDescription().c_str());
    const auto complain = [](const std::string& whyNot) {
        __android_log_print(ANDROID_LOG_ERROR, kLogTag, "not registered: %s", whyNot.c_str());
    };
    const sp<Manager> manager = findManager(kForEver);
    if (manager == nullptr) {
        complain(lookupError());
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

std::string serviceManagerDescription() {
    Driver& driver = ProcessState::self()->driver();
    if (!driver.hasServiceManager()) return "none is needed";
    std::string whyNot;
    return driver.serviceManager(&whyNot) == nullptr ? whyNot : "answers";
}

std::string lookupError() {
    return ::android::hardware::lookupError();
}

}  // namespace host
}  // namespace android::hardware
