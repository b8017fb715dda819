// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace android::hidl::manager::V1_0 {
struct IServiceNotification;
}
