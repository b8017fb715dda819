// SPDX-License-Identifier: Apache-2.0
#include "KernelDriver.h"
#include "libhwbinder/SocketDriver.h"

#include <android/log.h>
#include <hwbinder/BpHwBinder.h>
#include <hwbinder/ProcessState.h>

#include <atomic>
#include <cstdlib>
#include <thread>

namespace android::hardware {
namespace {

constexpr char kDevice[] = "/dev/hwbinder";

/** Chooses the driver. @param description takes which one it is, and why. */
std::unique_ptr<Driver> chooseDriver(std::string* description) {
    const std::string device = environment("HWBINDER_DEVICE");
    if (!device.empty()) {
        auto kernel = std::make_unique<KernelDriver>(device);
        const Error error = kernel->check();
        *description = (error.isOk() ? device : error.text()) + ", as HWBINDER_DEVICE says";
        return kernel;
    }
    std::string reason = ", as HWBINDER_DIR says";
    if (environment("HWBINDER_DIR").empty()) {
        auto kernel = std::make_unique<KernelDriver>(kDevice);
        if (kernel->check().isOk()) {
            *description = std::string(kDevice) + ", which is there";
            return kernel;
        }
        reason = ", because of " + kernel->check().text();
    }
    auto sockets = std::make_unique<SocketDriver>();
    *description = sockets->name() + reason;
    return sockets;
}

std::atomic<int>& timeout() {
    static std::atomic<int> milliseconds = 0;
    return milliseconds;
}

}  // namespace

std::string environment(const char* name) {
    const char* value = getenv(name);
    return value == nullptr ? "" : value;
}

ProcessState::ProcessState() : mDriver(chooseDriver(&mDescription)) {}

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

int callTimeout() {
    return timeout();
}

void setCallTimeout(int milliseconds) {
    timeout() = milliseconds;
}

}  // namespace android::hardware
