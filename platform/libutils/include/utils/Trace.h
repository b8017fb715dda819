// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cutils/trace.h>

#define PASTE_TOKENS(x, y) x##y
#define PASTE(x, y) PASTE_TOKENS(x, y)

namespace android {

/** Marks a scope in the trace buffer, where there is one. */
class ScopedTrace {
  public:
    ScopedTrace(uint64_t tag, const char* name) { atrace_begin(tag, name); }
    ~ScopedTrace() { atrace_end(0); }
};

}  // namespace android
