// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>

namespace android::hardware {

/**
 * Announces how calls will be served. This transport has one way: a single thread, the one that
 * calls joinRpcThreadpool. Anything but (1, true) is logged as an error and served that way too.
 */
void configureRpcThreadpool(size_t maxThreads, bool callerWillJoin);

/** Serves calls to the registered objects with the calling thread. Does not return. */
void joinRpcThreadpool();

}  // namespace android::hardware
