// SPDX-License-Identifier: Apache-2.0
#include "SocketPublication.h"

#include "libhwbinder/SocketDirectory.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <cstdio>
#include <string_view>
#include <utility>

namespace android::hardware {
namespace {

/** Ends of the names of the files beside a service's socket. */
constexpr char kTemporary[] = "~";
constexpr char kLock[] = ".lock";

#ifdef SO_PASSRIGHTS
constexpr int kPassRights = SO_PASSRIGHTS;
#else
constexpr int kPassRights = 83;
#endif

bool endsWith(std::string_view text, std::string_view end) {
    return text.size() >= end.size() && text.substr(text.size() - end.size()) == end;
}

/**
 * Takes the lock file of a name. Its holder keeps it as long as it lives, so a socket whose lock is
 * free was left behind by a dead process. Other users cannot open the file, and so not lock it.
 */
Error takeLock(const SocketDirectory& directory, const std::string& name, UniqueFd* lock) {
    UniqueFd file(openat(directory.descriptor(), name.c_str(),
                         O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
    struct stat info;
    if (!file.isValid() || fstat(file.get(), &info) != 0) {
        return Error::ofErrno({directory.path(), "/", name});
    }
    if (info.st_uid != geteuid() || (info.st_mode & (S_IRWXG | S_IRWXO)) != 0) {
        return {-EPERM, directory.path() + "/" + name +
                                ": others may open it, and hold the name; remove it"};
    }
    if (flock(file.get(), LOCK_EX | LOCK_NB) != 0) {
        if (errno == EWOULDBLOCK) return {-EWOULDBLOCK, "another process has the name"};
        return Error::ofErrno({directory.path(), "/", name});
    }
    *lock = std::move(file);
    return {};
}

/** Puts a file that was made under a temporary name in its place. */
bool replace(const SocketDirectory& directory, const std::string& temporary,
             const std::string& name) {
    return renameat(directory.descriptor(), temporary.c_str(), directory.descriptor(),
                    name.c_str()) == 0;
}

/** Listens at a temporary name, which then replaces the final one: no client sees it half made. */
Error listenAt(const SocketDirectory& directory, const std::string& name, UniqueFd* listener) {
    const std::string temporary = name + kTemporary;
    sockaddr_un address;
    Error error = directory.addressOf(temporary, &address);
    if (!error.isOk()) return error;
    unlinkat(directory.descriptor(), temporary.c_str(), 0);
    UniqueFd socket(::socket(AF_UNIX, SOCK_SEQPACKET | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
    if (!socket.isValid()) return Error::ofErrno({"no socket for ", directory.path(), "/", name});
    // On every message the kernel says who has sent it. Connections inherit both settings.
    const int on = 1;
    setsockopt(socket.get(), SOL_SOCKET, SO_PASSCRED, &on, sizeof(on));
    // Descriptors do not even arrive; a kernel before 6.16 does not know that.
    const int off = 0;
    setsockopt(socket.get(), SOL_SOCKET, kPassRights, &off, sizeof(off));
    const mode_t before = umask(0);
    const int bound =
            bind(socket.get(), reinterpret_cast<const sockaddr*>(&address), sizeof(address));
    umask(before);
    if (bound != 0 || listen(socket.get(), SOMAXCONN) != 0 ||
        !replace(directory, temporary, name)) {
        return Error::ofErrno({directory.path(), "/", name});
    }
    *listener = std::move(socket);
    return {};
}

/** Links the name of an inherited interface to the socket, in place of what had it before. */
Error linkTo(const SocketDirectory& directory, const std::string& target, const std::string& name) {
    char before[sizeof(sockaddr_un::sun_path)];
    // In each start but the first the link is right.
    const ssize_t length = readlinkat(directory.descriptor(), name.c_str(), before, sizeof(before));
    if (length >= 0 && target == std::string_view(before, static_cast<size_t>(length))) return {};
    const std::string temporary = name + kTemporary;
    unlinkat(directory.descriptor(), temporary.c_str(), 0);
    if (symlinkat(target.c_str(), directory.descriptor(), temporary.c_str()) != 0 ||
        !replace(directory, temporary, name)) {
        return Error::ofErrno({directory.path(), "/", name});
    }
    return {};
}

/** @return OK if no other service's file could have this name. */
Error checkName(const SocketDirectory& directory, const std::string& name) {
    if (endsWith(name, kTemporary) || endsWith(name, kLock)) {
        return {-EINVAL, "\"" + name + "\": the name of a service must not end in \"" + kTemporary +
                                 "\" or \"" + kLock + "\""};
    }
    sockaddr_un address;
    return directory.addressOf(name, &address);
}

}  // namespace

std::string SocketPublication::name() const {
    return socketName(chain.front(), instance);
}

bool ListeningSocket::mayBringDescriptors() const {
    int value = 0;
    socklen_t size = sizeof(value);
    return getsockopt(socket.get(), SOL_SOCKET, kPassRights, &value, &size) != 0;
}

Error listenUnderNames(const SocketPublication& publication, ListeningSocket* listener) {
    const std::string name = publication.name();
    SocketDirectory directory;
    ListeningSocket made;
    Error error = directory.openForServer();
    if (error.isOk()) error = checkName(directory, name);
    if (error.isOk()) error = takeLock(directory, name + kLock, &made.lock);
    // No link for the base interface: every object has that one.
    for (size_t i = 1; error.isOk() && i + 1 < publication.chain.size(); ++i) {
        error = linkTo(directory, name, socketName(publication.chain[i], publication.instance));
    }
    if (error.isOk()) error = listenAt(directory, name, &made.socket);
    if (error.isOk()) *listener = std::move(made);
    return error;
}

}  // namespace android::hardware
