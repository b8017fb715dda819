// SPDX-License-Identifier: Apache-2.0
#include <hidl/HidlTransportSupport.h>
#include <hwbinder/ProcessState.h>
#include <unistd.h>

namespace android::hardware {

void configureRpcThreadpool(size_t maxThreads, bool callerWillJoin) {
    ProcessState::self()->setThreadPoolConfiguration(maxThreads, callerWillJoin);
}

void joinRpcThreadpool() {
    ProcessState::self()->joinThreadPool();
}

namespace details {

int32_t getPidIfSharable() {
    return getpid();
}

}  // namespace details
}  // namespace android::hardware
