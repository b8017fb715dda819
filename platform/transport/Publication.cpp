// SPDX-License-Identifier: Apache-2.0
#include "transport/Publication.h"

#include "transport/Address.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace android::hardware::details {
namespace {

Status failure(const std::string& what) {
    return Status::fromStatusT(-errno, what + ": " + strerror(errno));
}

/** Finds the directory, or makes it, and sees that nobody else can put sockets into it. */
Status openDirectory(std::string* directory) {
    Status status = socketDirectory(directory);
    if (!status.isOk()) return status;
    if (mkdir(directory->c_str(), 0755) == 0) {
        if (chmod(directory->c_str(), 0755) != 0) return failure(*directory);
    } else if (errno != EEXIST) {
        return failure(*directory);
    }
    struct stat info;
    if (stat(directory->c_str(), &info) != 0) return failure(*directory);
    if (!S_ISDIR(info.st_mode))
        return Status::fromStatusT(BAD_VALUE, *directory + ": no directory");
    if (info.st_uid != geteuid() && info.st_uid != 0) {
        return Status::fromStatusT(PERMISSION_DENIED,
                                   *directory + ": belongs to uid " + std::to_string(info.st_uid));
    }
    return Status::ok();
}

/**
 * Takes the lock that its holder keeps as long as it lives; so a socket whose lock is free is a
 * dead process's. Nobody else can open the file, so nobody else can hold the lock.
 */
Status lock(const std::string& path, int* file) {
    *file = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
    if (*file < 0 || flock(*file, LOCK_EX | LOCK_NB) == 0) {
        return *file < 0 ? failure(path) : Status::ok();
    }
    Status status = errno == EWOULDBLOCK
                            ? Status::fromStatusT(ALREADY_EXISTS, "it is registered already")
                            : failure(path);
    close(*file);
    return status;
}

/** Listens at a temporary name, which then replaces the final one: no client sees it half made. */
Status listenAt(const std::string& directory, const std::string& name, int* listener) {
    sockaddr_un address;
    Status status = socketAddress(directory, name, &address);
    if (!status.isOk()) return status;
    const std::string path = address.sun_path;
    status = socketAddress(directory, name + "~", &address);
    if (!status.isOk()) return status;

    unlink(address.sun_path);
    *listener = socket(AF_UNIX, SOCK_SEQPACKET | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    const auto* generic = reinterpret_cast<const sockaddr*>(&address);
    if (*listener >= 0 && bind(*listener, generic, sizeof(address)) == 0 &&
        chmod(address.sun_path, 0666) == 0 && listen(*listener, SOMAXCONN) == 0 &&
        rename(address.sun_path, path.c_str()) == 0) {
        return Status::ok();
    }
    status = failure(path);
    if (*listener >= 0) close(*listener);
    return status;
}

/** Links the name of an inherited interface to the socket, in place of what had it before. */
Status link(const std::string& directory, const std::string& name, const std::string& target) {
    const std::string path = directory + "/" + name;
    const std::string temporary = path + "~";
    unlink(temporary.c_str());
    if (symlink(target.c_str(), temporary.c_str()) != 0 ||
        rename(temporary.c_str(), path.c_str()) != 0) {
        return failure(path);
    }
    return Status::ok();
}

}  // namespace

Status publish(const Stub& stub, const std::string& instance, int* listener) {
    std::string directory;
    Status status = openDirectory(&directory);
    if (!status.isOk()) return status;

    const std::string name = socketName(stub.descriptor, instance);
    sockaddr_un address;
    status = socketAddress(directory, name, &address);
    if (!status.isOk()) return status;
    int lockFile = -1;
    status = lock(directory + "/" + name + ".lock", &lockFile);
    if (!status.isOk()) return status;
    for (const Stub* each = stub.parent; status.isOk() && each != nullptr; each = each->parent) {
        status = link(directory, socketName(each->descriptor, instance), name);
    }
    if (status.isOk()) status = listenAt(directory, name, listener);
    if (!status.isOk()) close(lockFile);
    return status;
}

}  // namespace android::hardware::details
