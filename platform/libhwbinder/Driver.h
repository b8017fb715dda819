// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Binder.h>
#include <hwbinder/IPCThreadState.h>
#include <hwbinder/Parcel.h>
#include <utils/Errors.h>

#include <cstdint>
#include <string>

namespace android::hidl::manager::V1_2 {
struct IServiceManager;
}

namespace android::hardware {

/** What carries calls between processes: the kernel's binder driver, or sockets in its place. */
class Driver {
  public:
    virtual ~Driver() = default;

    /**
     * Makes a call of a remote object and, unless it is oneway, waits for the reply. Calls that
     * the other process makes meanwhile, in the course of this one, are served.
     *
     * @param link what acquire has given for the handle.
     * @return OK; DEAD_OBJECT; TIMED_OUT; FAILED_TRANSACTION for what the driver does not take; or
     *     what the object has answered instead of a reply.
     */
    virtual status_t transact(uint32_t handle, void* link, uint32_t code, const Parcel& data,
                              Parcel* reply, uint32_t flags) = 0;

    /** Serves calls and news of deaths with the calling thread, until that becomes impossible. */
    virtual void serve() = 0;

    // Called when the proxy of a handle is made, and when it is destroyed.
    /** @return data that the driver gets with each call, to save it a search. */
    virtual void* acquire(uint32_t handle) = 0;
    virtual void release(uint32_t handle) = 0;
    /** Asks for news of the death of the process behind a handle: BpHwBinder::sendObituary. */
    virtual status_t requestDeathNotice(uint32_t handle) = 0;
    virtual void clearDeathNotice(uint32_t handle) = 0;

    /** @return the service manager; nullptr, with the reason, while none answers. */
    virtual sp<::android::hidl::manager::V1_2::IServiceManager> serviceManager(
            std::string* whyNot) = 0;

    /** @return whether the service manager is a process of its own. */
    virtual bool hasServiceManager() const { return false; }
    /** Makes an object the service manager of every process. @return OK, or why not. */
    virtual status_t becomeContextManager(const sp<BHwBinder>& /* object */) {
        return INVALID_OPERATION;
    }

    /** @return whether it can carry calls, now or later. */
    virtual bool isUsable() const { return true; }
    /** @return what this is, in words: "/dev/hwbinder". */
    virtual std::string name() const = 0;
};

/** The tag of the runtime's log lines. */
inline constexpr char kLogTag[] = "hwbinder";

/** @return an environment variable; empty where it is not set. */
std::string environment(const char* name);

/** @return how long a call may take, in ms; 0 without a limit. */
int callTimeout();

/** @return why this thread's last search for a service has failed; set by what searches. */
std::string& lookupError();

/** Sets this thread's caller while one of its calls is served. */
class CallerIdentity {
  public:
    CallerIdentity(uid_t uid, pid_t pid)
        : mThread(IPCThreadState::self()), mBefore(mThread->callingIdentity()) {
        mThread->restoreCallingIdentity(IPCThreadState::identityToken(uid, pid));
    }
    ~CallerIdentity() { mThread->restoreCallingIdentity(mBefore); }
    CallerIdentity(const CallerIdentity&) = delete;
    CallerIdentity& operator=(const CallerIdentity&) = delete;

  private:
    IPCThreadState* const mThread;
    const int64_t mBefore;
};

}  // namespace android::hardware
