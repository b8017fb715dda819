// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace android {

/** Tells whoever watches system properties that they have changed; this platform has none. */
inline void report_sysprop_change() {}

}  // namespace android
