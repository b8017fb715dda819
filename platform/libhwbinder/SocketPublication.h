// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libutils/Error.h"

#include <hwbinder/Binder.h>
#include <utils/UniqueFd.h>

#include <string>
#include <vector>

namespace android::hardware {

/** An object, and the names that it is to have. */
struct SocketPublication {
    sp<BHwBinder> object;
    /** Its interface and those that it extends, the base last. */
    std::vector<std::string> chain;
    std::string instance;

    /** @return the name of its socket; the other names are links to it. */
    std::string name() const;
};

/** The socket of an object, at which clients connect. */
struct ListeningSocket {
    UniqueFd socket;
    /** The lock of its name, which is free again when this is closed. */
    UniqueFd lock;

    /** @return whether clients may send descriptors; a kernel from 6.16 on keeps them away. */
    bool mayBringDescriptors() const;
};

/**
 * Makes the socket of an object, and the links to it; not for two threads at once.
 *
 * @return OK; an error of the code -EWOULDBLOCK if another process has the name.
 */
Error listenUnderNames(const SocketPublication& publication, ListeningSocket* listener);

}  // namespace android::hardware
