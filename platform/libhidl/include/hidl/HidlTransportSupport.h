// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlBinderSupport.h>
#include <hwbinder/ProcessState.h>
#include <sched.h>
#include <unistd.h>

#include <cstddef>

#ifndef SCHED_NORMAL
// The kernel's name for it; the C library's is SCHED_OTHER.
#define SCHED_NORMAL 0
#endif

namespace android::hardware {

/**
 * Announces how calls will be served.
 *
 * @param maxThreads the most threads that serve calls. This platform always has one, and logs a
 *     warning if another number is given.
 * @param callerWillJoin whether the caller provides this thread, with joinRpcThreadpool.
 */
inline void configureRpcThreadpool(size_t maxThreads, bool callerWillJoin) {
    ProcessState::self()->setThreadPoolConfiguration(maxThreads, callerWillJoin);
}

/** Serves calls with the calling thread. Returns only if that is impossible, with a log line. */
inline void joinRpcThreadpool() {
    ProcessState::self()->joinThreadPool();
}

namespace details {

/** @return the process's id, for getDebugInfo. */
inline int32_t getPidIfSharable() {
    return getpid();
}
/** @return whether callers may learn addresses of this process: no. */
inline bool debuggable() {
    return false;
}

}  // namespace details
}  // namespace android::hardware
