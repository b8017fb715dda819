// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace android::hardware {

/** What carries the calls of a process. */
struct Transport {
    /** "binder" or "sockets". */
    std::string kind;
    /** The binder's device, or the directory of the sockets. */
    std::string path;
    /** Why it is this one, like "as HWBINDER_DIR says". */
    std::string why;

    /** @return all of it, for a person. */
    std::string inWords() const {
        return (kind == "binder" ? "" : kind + " in ") + path + ", " + why;
    }
};

}  // namespace android::hardware
