// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Binder.h>
#include <sys/un.h>
#include <utils/Errors.h>

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
/** Makes the address of a socket. @return false, with the reason, where the name is not usable. */
bool socketAddress(const std::string& directory, const std::string& name, sockaddr_un* address,
                   std::string* whyNot);

/** Connects to a service. @return the socket; -1, with the reason, where there is none. */
int connectTo(const std::string& directory, const std::string& name, std::string* whyNot);

/**
 * Makes the socket of a service, and links to it for the interfaces that its own extends.
 *
 * @param chain its interface and those that it extends, the base last.
 * @param whyNot takes the reason of a failure.
 * @return the listening socket; -1, with errno, in the case of EWOULDBLOCK because another process
 *     has the name.
 */
int publish(const std::vector<std::string>& chain, const std::string& instance,
            std::string* whyNot);

}  // namespace android::hardware
