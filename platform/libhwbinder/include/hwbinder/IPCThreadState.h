// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>
#include <unistd.h>

#include <cstdint>

namespace android::hardware {

/** Who is calling: the identity behind the call that the current thread is serving. */
class IPCThreadState {
  public:
    /** @return the state of the current thread. */
    static IPCThreadState* self() {
        static thread_local IPCThreadState state;
        return &state;
    }

    /** @return process id of the caller, 0 where it is unknown; this process's outside a call. */
    pid_t getCallingPid() const {
        return mCaller == kNobody ? getpid() : static_cast<pid_t>(mCaller & 0xffffffff);
    }
    /** @return uid of the caller; this process's own outside a call. */
    uid_t getCallingUid() const {
        return mCaller == kNobody ? getuid()
                                  : static_cast<uid_t>(static_cast<uint64_t>(mCaller) >> 32);
    }

    /** @return a token of the present identity. */
    int64_t callingIdentity() const { return mCaller; }
    /** Takes the identity of a token. */
    void restoreCallingIdentity(int64_t token) { mCaller = token; }
    /** @return a token: the uid in the upper, the pid in the lower 32 bits. */
    static int64_t identityToken(uid_t uid, pid_t pid) {
        return static_cast<int64_t>(uint64_t{uid} << 32 | static_cast<uint32_t>(pid));
    }

  private:
    /** Outside a call; no process has the number -1. */
    static constexpr int64_t kNobody = -1;

    int64_t mCaller = kNobody;
};

}  // namespace android::hardware
