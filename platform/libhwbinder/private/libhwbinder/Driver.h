// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libutils/Error.h"

#include <hwbinder/Binder.h>
#include <hwbinder/IPCThreadState.h>
#include <hwbinder/Parcel.h>
#include <utils/Errors.h>

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <utility>

namespace android::hardware {

class SocketDriver;

/** An object of another process, as its proxy sees it. It is given up when this ends. */
class RemoteObject {
  public:
    virtual ~RemoteObject() = default;

    /**
     * Makes a call and, unless it is oneway, waits for the reply. Calls that the other process
     * makes meanwhile, in the course of this one, are served.
     *
     * @return OK; DEAD_OBJECT; TIMED_OUT; FAILED_TRANSACTION for what the driver does not take; or
     *     what the object has answered instead of a reply.
     */
    virtual status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags) = 0;

    /** Asks for news of the death of the object's process: BpHwBinder::sendObituary. */
    virtual status_t requestDeathNotice() = 0;
    virtual void clearDeathNotice() = 0;
};

/**
 * What carries calls between processes: the kernel's binder driver, or sockets in its place. It
 * knows nothing of interfaces.
 */
class Driver {
  public:
    virtual ~Driver() = default;

    /** @return the object of a handle; nullptr if there is none. */
    virtual std::unique_ptr<RemoteObject> open(uint32_t handle) = 0;

    /** Serves calls and news of deaths with the calling thread, until that becomes impossible. */
    virtual void serve() = 0;

    /** @return this as the driver that finds services itself; nullptr where a manager does that. */
    virtual SocketDriver* socketDriver() { return nullptr; }
    /** Makes an object the service manager of every process. @return OK, or why not. */
    virtual status_t becomeContextManager(const sp<BHwBinder>& /* object */) {
        return INVALID_OPERATION;
    }

    /** @return OK if it can carry calls, now or later. */
    virtual Error check() const { return {}; }
};

/** The tag of the runtime's log lines. */
inline constexpr char kLogTag[] = "hwbinder";

/** @return an environment variable; empty where it is not set. */
std::string environment(const char* name);

/** How long a call may take, in ms; 0 without a limit. */
inline std::atomic<int> callTimeout = 0;

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

/**
 * Has an object answer a call.
 *
 * @param results room for them, empty.
 * @param reply sends a parcel, with its flags; called once, and for no oneway call.
 */
template <typename Reply>
void answerCall(BHwBinder& object, uint32_t code, const Parcel& arguments, uint32_t flags,
                Parcel* results, Reply reply) {
    bool replied = (flags & TF_ONE_WAY) != 0;
    const auto send = [&](const Parcel& parcel) {
        if (!std::exchange(replied, true)) reply(parcel, 0);
    };
    const status_t status =
            object.BHwBinder::transact(code, arguments, results, flags & TF_ONE_WAY, send);
    if (status == OK) return send(*results);
    if (replied) return;
    results->clear();
    results->writeInt32(status);
    reply(*results, TF_STATUS_CODE);
}

/** @return OK, or the status that a received reply has in place of results. */
inline status_t statusOf(Parcel& reply, uint32_t flags) {
    if ((flags & TF_STATUS_CODE) == 0) return OK;
    status_t status = OK;
    const status_t read = reply.readInt32(&status);
    reply.clear();
    return read == OK && status != OK ? status : FAILED_TRANSACTION;
}

}  // namespace android::hardware
