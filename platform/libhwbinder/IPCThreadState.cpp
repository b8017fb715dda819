// SPDX-License-Identifier: Apache-2.0
#include <hwbinder/IPCThreadState.h>
#include <unistd.h>

namespace android::hardware {

IPCThreadState::IPCThreadState() : mCallingPid(getpid()), mCallingUid(getuid()) {}

IPCThreadState* IPCThreadState::self() {
    static thread_local IPCThreadState state;
    return &state;
}

void IPCThreadState::restoreCallingIdentity(int64_t token) {
    mCallingUid = static_cast<uid_t>(static_cast<uint64_t>(token) >> 32);
    mCallingPid = static_cast<pid_t>(token & 0xffffffff);
}

}  // namespace android::hardware
