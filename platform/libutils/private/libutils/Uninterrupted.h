// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cerrno>

namespace android {

/**
 * Makes a system call, and makes it again when a signal has interrupted it.
 *
 * @param goesOn asked after each interruption whether to do so.
 * @return the call's result; with EINTR if it was given up.
 */
template <typename Call, typename GoesOn>
auto uninterrupted(Call call, GoesOn goesOn) {
    for (;;) {
        const auto result = call();
        if (result >= 0 || errno != EINTR) return result;
        if (!goesOn()) {
            errno = EINTR;
            return result;
        }
    }
}

}  // namespace android
