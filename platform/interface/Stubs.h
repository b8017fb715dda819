// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "transport/Stub.h"

namespace android::hardware::details {

/** The receiving side of IDaxVibrator 2.1 and all that it extends. */
extern const Stub kDax21Stub;

}  // namespace android::hardware::details
