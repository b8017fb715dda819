// SPDX-License-Identifier: Apache-2.0
#include <hwbinder/IPCThreadState.h>

namespace android::hardware {

IPCThreadState* IPCThreadState::self() {
    static thread_local IPCThreadState state;
    return &state;
}

}  // namespace android::hardware
