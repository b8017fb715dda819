// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/Status.h>
#include <sys/un.h>

#include <string>

namespace android::hardware::details {

/**
 * Finds the directory of the services' sockets: $HWBINDER_DIR, else /run/hwbinder for root, else
 * hwbinder under $XDG_RUNTIME_DIR.
 *
 * @return a failure, in words, where none of them is known.
 */
Status socketDirectory(std::string* directory);

/**
 * Makes the address of an instance's socket.
 *
 * @param fileName name of the socket in the directory.
 * @return a failure, in words, where the name is no file name or the path too long for a socket.
 */
Status socketAddress(const std::string& directory, const std::string& fileName,
                     sockaddr_un* address);

/** @return the name of the socket, or of the link to it, of an interface's instance. */
std::string socketName(const char* descriptor, const std::string& instance);

}  // namespace android::hardware::details
