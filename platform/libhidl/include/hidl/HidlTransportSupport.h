// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlBinderSupport.h>
#include <sched.h>

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
void configureRpcThreadpool(size_t maxThreads, bool callerWillJoin);

/** Serves calls with the calling thread. Returns only if that is impossible, with a log line. */
void joinRpcThreadpool();

namespace details {

/** @return the process's id, for getDebugInfo. */
int32_t getPidIfSharable();
/** @return whether callers may learn addresses of this process: no. */
inline bool debuggable() {
    return false;
}

}  // namespace details
}  // namespace android::hardware
