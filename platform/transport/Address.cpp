// SPDX-License-Identifier: Apache-2.0
#include "transport/Address.h"

#include <sys/socket.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>

namespace android::hardware::details {
namespace {

std::string environment(const char* name) {
    const char* value = getenv(name);
    return value == nullptr ? "" : value;
}

}  // namespace

Status socketDirectory(std::string* directory) {
    *directory = environment("HWBINDER_DIR");
    if (!directory->empty()) return Status::ok();
    if (geteuid() == 0) {
        *directory = "/run/hwbinder";
        return Status::ok();
    }
    const std::string runtime = environment("XDG_RUNTIME_DIR");
    if (runtime.empty()) {
        return Status::fromStatusT(NAME_NOT_FOUND,
                                   "neither HWBINDER_DIR nor XDG_RUNTIME_DIR is set");
    }
    *directory = runtime + "/hwbinder";
    return Status::ok();
}

Status socketAddress(const std::string& directory, const std::string& fileName,
                     sockaddr_un* address) {
    const std::string path = directory + "/" + fileName;
    if (fileName.find('/') != std::string::npos || path.find('\0') != std::string::npos) {
        return Status::fromStatusT(BAD_VALUE, "\"" + fileName + "\" is no name for a socket");
    }
    *address = {};
    address->sun_family = AF_UNIX;
    if (path.size() >= sizeof(address->sun_path)) {
        return Status::fromStatusT(BAD_VALUE,
                                   path + ": longer than the " +
                                           std::to_string(sizeof(address->sun_path) - 1) +
                                           " characters of a socket address");
    }
    memcpy(address->sun_path, path.c_str(), path.size());
    return Status::ok();
}

std::string socketName(const char* descriptor, const std::string& instance) {
    return std::string(descriptor) + "." + instance;
}

}  // namespace android::hardware::details
