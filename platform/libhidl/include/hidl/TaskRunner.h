// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <functional>

namespace android::hardware::details {

/**
 * Runs the oneway calls of wrappers for objects of the same process. This platform never makes such
 * wrappers, so it takes no task.
 */
class TaskRunner {
  public:
    void start(size_t /* limit */) {}
    /** @return whether the task will run. */
    bool push(const std::function<void()>& /* task */) { return false; }
};

}  // namespace android::hardware::details
