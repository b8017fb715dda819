// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libutils/Error.h"

#include <sys/types.h>
#include <sys/un.h>
#include <utils/UniqueFd.h>

#include <string>
#include <vector>

namespace android::hardware {

// Services are sockets in a directory, named "INTERFACE.INSTANCE". Whoever may write to it can pass
// for any service, so it is trusted only if nobody but root and its owner may.

/**
 * @return the directory for services of this process: $HWBINDER_DIR; else hwbinder under
 *     $XDG_RUNTIME_DIR, which a person has and a system's service has not; else /run/hwbinder.
 */
std::string serverDirectory();
/** @return where this process looks for services, in this order. */
std::vector<std::string> clientDirectories();

/** @return the name of an interface's instance in the directory. */
std::string socketName(const std::string& interface, const std::string& instance);

/** A directory of sockets, opened once: what was checked is what is used. */
class SocketDirectory {
  public:
    /**
     * Opens a directory that only root and its owner can write to.
     *
     * @param makes whether to make it if it is missing; not its parents.
     */
    Error open(const std::string& path, bool makes);
    /** Opens or makes the directory for services of this process, which root or its user owns. */
    Error openForServer();

    /** Connects to a service of root's, of this process's user or of the directory's owner. */
    Error connect(const std::string& name, UniqueFd* connection) const;
    /** Makes the address of a socket in the directory. */
    Error addressOf(const std::string& name, sockaddr_un* address) const;

    /** @return the directory itself, for calls that take a name in it. */
    int descriptor() const { return mDirectory.get(); }
    const std::string& path() const { return mPath; }

  private:
    std::string mPath;
    UniqueFd mDirectory;
    uid_t mOwner = 0;
    /** Whether nobody but root and this process's user could have put the directory there. */
    bool mIsPlaceGuarded = false;
};

}  // namespace android::hardware
