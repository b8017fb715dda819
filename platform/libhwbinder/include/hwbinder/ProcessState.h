// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/IBinder.h>
#include <hwbinder/Transport.h>

#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace android::hardware {

class Driver;

/** This process's part of the binder: its driver, its pool of threads and its proxies. */
class ProcessState {
  public:
    /** @return the state of this process, made at the first call. */
    static ProcessState* self();

    /** @return the driver that calls of this process go over. */
    Driver& driver() { return *mDriver; }
    /** @return which driver that is, and why. */
    const Transport& transport() const { return mTransport; }

    /**
     * @param maxThreads the most threads that serve calls; this platform always has one.
     * @param callerJoins whether the caller provides this thread.
     */
    void setThreadPoolConfiguration(size_t maxThreads, bool callerJoins);
    /** Starts the thread that serves calls, unless the caller provides it. */
    void startThreadPool();
    /**
     * Serves calls with the calling thread, until that becomes impossible. While another thread
     * does so, this one waits: calls never run at the same time.
     */
    void joinThreadPool();

    /** @return the one proxy of a handle. */
    sp<IBinder> getStrongProxyForHandle(uint32_t handle);
    /** Forgets a proxy that is being destroyed. @return false if it has a successor already. */
    bool expungeHandle(uint32_t handle, IBinder* proxy);
    /** Tells the proxy of a handle, if it still lives, that the process behind it has ended. */
    void sendObituary(uint32_t handle);

  private:
    ProcessState();

    Transport mTransport;
    std::unique_ptr<Driver> mDriver;
    std::mutex mServing;
    std::mutex mMutex;
    bool mCallerJoins = false;
    bool mPoolStarted = false;
    std::map<uint32_t, wp<IBinder>> mProxies;
};

}  // namespace android::hardware
