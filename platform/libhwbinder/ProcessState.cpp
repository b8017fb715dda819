// SPDX-License-Identifier: Apache-2.0
#include "KernelDriver.h"
#include "libhwbinder/SocketDirectory.h"
#include "libhwbinder/SocketDriver.h"

#include <android/log.h>
#include <hwbinder/BpHwBinder.h>
#include <hwbinder/ProcessState.h>

#include <cstdlib>
#include <thread>

namespace android::hardware {
namespace {

constexpr char kDevice[] = "/dev/hwbinder";

/** Chooses the driver. @param transport set to which one it is, and why. */
std::unique_ptr<Driver> chooseDriver(Transport* transport) {
    const std::string device = environment("HWBINDER_DEVICE");
    if (!device.empty()) {
        auto kernel = std::make_unique<KernelDriver>(device);
        const Error error = kernel->check();
        *transport = {"binder", device,
                      "as HWBINDER_DEVICE says" + (error.isOk() ? "" : "; " + error.text())};
        return kernel;
    }
    std::string why = "as HWBINDER_DIR says";
    if (environment("HWBINDER_DIR").empty()) {
        auto kernel = std::make_unique<KernelDriver>(kDevice);
        if (kernel->check().isOk()) {
            *transport = {"binder", kDevice, "which is there"};
            return kernel;
        }
        why = "because of " + kernel->check().text();
    }
    *transport = {"sockets", serverDirectory(), why};
    return std::make_unique<SocketDriver>();
}

}  // namespace

std::string environment(const char* name) {
    const char* value = getenv(name);
    return value == nullptr ? "" : value;
}

ProcessState::ProcessState() : mDriver(chooseDriver(&mTransport)) {}

ProcessState* ProcessState::self() {
    // Never destroyed: threads of the pool and objects with static lifetime use it to the end.
    static auto* const state = new ProcessState;
    return state;
}

void ProcessState::setThreadPoolConfiguration(size_t maxThreads, bool callerJoins) {
    if (maxThreads != 1) {
        __android_log_print(ANDROID_LOG_WARN, kLogTag,
                            "a pool of %zu threads was asked for; one thread serves all calls",
                            maxThreads);
    }
    const std::lock_guard<std::mutex> lock(mMutex);
    mCallerJoins = callerJoins;
}

void ProcessState::startThreadPool() {
    const std::lock_guard<std::mutex> lock(mMutex);
    if (mPoolStarted || mCallerJoins) return;
    mPoolStarted = true;
    std::thread([this] { joinThreadPool(); }).detach();
}

void ProcessState::joinThreadPool() {
    const std::lock_guard<std::mutex> lock(mServing);
    mDriver->serve();
}

sp<IBinder> ProcessState::getStrongProxyForHandle(uint32_t handle) {
    const std::lock_guard<std::mutex> lock(mMutex);
    wp<IBinder>& entry = mProxies[handle];
    sp<IBinder> proxy = entry.promote();
    if (proxy == nullptr) {
        proxy = new BpHwBinder(handle);
        entry = proxy;
    }
    return proxy;
}

bool ProcessState::expungeHandle(uint32_t handle, IBinder* proxy) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto entry = mProxies.find(handle);
    if (entry == mProxies.end() || entry->second.unsafe_get() != proxy) return false;
    mProxies.erase(entry);
    return true;
}

void ProcessState::sendObituary(uint32_t handle) {
    sp<IBinder> proxy;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        const auto entry = mProxies.find(handle);
        if (entry != mProxies.end()) proxy = entry->second.promote();
    }
    if (proxy != nullptr) proxy->remoteBinder()->sendObituary();
}

}  // namespace android::hardware
