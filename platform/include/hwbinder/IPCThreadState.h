// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <cstdint>

namespace android::hardware {

/** Who is calling: the identity behind the call that the current thread is serving. */
class IPCThreadState {
  public:
    /** @return the state of the current thread. */
    static IPCThreadState* self();

    /** @return process id of the caller, 0 where it is unknown; this process's outside a call. */
    pid_t getCallingPid() const { return mCallingPid; }
    /** @return uid of the caller; this process's own outside a call. */
    uid_t getCallingUid() const { return mCallingUid; }

    /** Takes the identity of a token. */
    void restoreCallingIdentity(int64_t token);
    /** @return a token: the uid in the upper, the pid in the lower 32 bits. */
    static int64_t identityToken(uid_t uid, pid_t pid) {
        return static_cast<int64_t>(uint64_t{uid} << 32 | static_cast<uint32_t>(pid));
    }

  private:
    IPCThreadState();

    pid_t mCallingPid;
    uid_t mCallingUid;
};

}  // namespace android::hardware
