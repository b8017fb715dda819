// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/SocketDirectory.h"

#include "libhwbinder/Driver.h"

#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <mutex>
#include <string_view>
#include <utility>

namespace android::hardware {
namespace {

constexpr char kSystemDirectory[] = "/run/hwbinder";

/** Ends of the names of the files beside a service's socket. */
constexpr char kTemporary[] = "~";
constexpr char kLock[] = ".lock";

bool endsWith(std::string_view text, std::string_view end) {
    return text.size() >= end.size() && text.substr(text.size() - end.size()) == end;
}

std::string inWords(const std::string& what) {
    return what + ": " + strerror(errno);
}

/** Closes its descriptor in the end, unless there is none or release() has given it away. */
class Descriptor {
  public:
    explicit Descriptor(int descriptor) : mDescriptor(descriptor) {}
    ~Descriptor() {
        const int error = errno;
        close(mDescriptor);
        errno = error;
    }
    Descriptor(const Descriptor&) = delete;
    Descriptor& operator=(const Descriptor&) = delete;

    int get() const { return mDescriptor; }
    int release() { return std::exchange(mDescriptor, -1); }

  private:
    int mDescriptor;
};

/** @return whether nobody but root and the owner can put sockets into the directory. */
bool isTrusted(const std::string& directory, uid_t* owner, std::string* whyNot) {
    struct stat link;
    struct stat info;
    if (lstat(directory.c_str(), &link) != 0 || stat(directory.c_str(), &info) != 0) {
        *whyNot = inWords(directory);
        return false;
    }
    *owner = info.st_uid;
    if (S_ISLNK(link.st_mode) && link.st_uid != 0 && link.st_uid != geteuid()) {
        *whyNot = directory + ": is a link of uid " + std::to_string(link.st_uid);
    } else if (!S_ISDIR(info.st_mode)) {
        *whyNot = directory + ": is not a directory";
    } else if ((info.st_mode & (S_IWGRP | S_IWOTH)) != 0) {
        *whyNot = directory + ": others than its owner may write to it";
    } else {
        return true;
    }
    errno = EPERM;
    return false;
}

/** Finds the directory, or makes it. */
bool prepareDirectory(const std::string& directory, std::string* whyNot) {
    // The mode must not depend on the umask: every user looks for services here.
    const mode_t before = umask(0022);
    const bool exists = mkdir(directory.c_str(), 0755) == 0 || errno == EEXIST;
    umask(before);
    if (!exists) {
        *whyNot = inWords(directory);
        return false;
    }
    uid_t owner = 0;
    if (!isTrusted(directory, &owner, whyNot)) return false;
    if (owner == 0 || owner == geteuid()) return true;
    *whyNot = directory + ": belongs to uid " + std::to_string(owner);
    errno = EPERM;
    return false;
}

/**
 * Takes the lock file of a name. Its holder keeps it as long as it lives, so a socket whose lock is
 * free was left behind by a dead process. Other users cannot open the file, and so not lock it.
 */
int takeLock(const std::string& path, std::string* whyNot) {
    Descriptor file(open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600));
    if (file.get() >= 0 && flock(file.get(), LOCK_EX | LOCK_NB) == 0) return file.release();
    *whyNot = errno == EWOULDBLOCK ? "another process has the name" : inWords(path);
    return -1;
}

/** Listens at a temporary name, which then replaces the final one: no client sees it half made. */
int listenAt(const std::string& directory, const std::string& name, std::string* whyNot) {
    sockaddr_un address;
    if (!socketAddress(directory, name + kTemporary, &address, whyNot)) return -1;
    const std::string path = directory + "/" + name;
    unlink(address.sun_path);
    Descriptor listener(socket(AF_UNIX, SOCK_SEQPACKET | SOCK_NONBLOCK | SOCK_CLOEXEC, 0));
    if (listener.get() < 0) {
        *whyNot = inWords("no socket for " + path);
        return -1;
    }
    // On every message the kernel says who has sent it. Connections inherit both settings.
    const int on = 1;
    setsockopt(listener.get(), SOL_SOCKET, SO_PASSCRED, &on, sizeof(on));
#ifdef SO_PASSRIGHTS
    constexpr int kPassRights = SO_PASSRIGHTS;
#else
    constexpr int kPassRights = 83;
#endif
    // Descriptors do not even arrive; a kernel before 6.16 does not know that.
    const int off = 0;
    setsockopt(listener.get(), SOL_SOCKET, kPassRights, &off, sizeof(off));
    const mode_t before = umask(0);
    const int bound =
            bind(listener.get(), reinterpret_cast<const sockaddr*>(&address), sizeof(address));
    umask(before);
    if (bound == 0 && listen(listener.get(), SOMAXCONN) == 0 &&
        rename(address.sun_path, path.c_str()) == 0) {
        return listener.release();
    }
    *whyNot = inWords(path);
    return -1;
}

/** Links the name of an inherited interface to the socket, in place of what had it before. */
bool linkTo(const std::string& target, const std::string& directory, const std::string& name,
            std::string* whyNot) {
    const std::string path = directory + "/" + name;
    char before[sizeof(sockaddr_un::sun_path)];
    // In each start but the first the link is right.
    const ssize_t length = readlink(path.c_str(), before, sizeof(before));
    if (length >= 0 && target == std::string_view(before, static_cast<size_t>(length))) return true;
    const std::string temporary = path + kTemporary;
    unlink(temporary.c_str());
    if (symlink(target.c_str(), temporary.c_str()) == 0 &&
        rename(temporary.c_str(), path.c_str()) == 0) {
        return true;
    }
    *whyNot = inWords(path);
    return false;
}

}  // namespace

std::string serverDirectory() {
    return clientDirectories().front();
}

std::vector<std::string> clientDirectories() {
    const std::string directory = environment("HWBINDER_DIR");
    if (!directory.empty()) return {directory};
    const std::string runtime = environment("XDG_RUNTIME_DIR");
    if (geteuid() == 0 || runtime.empty()) return {kSystemDirectory};
    return {runtime + "/hwbinder", kSystemDirectory};
}

std::string socketName(const std::string& interface, const std::string& instance) {
    return interface + "." + instance;
}

bool socketAddress(const std::string& directory, const std::string& name, sockaddr_un* address,
                   std::string* whyNot) {
    const std::string path = directory + "/" + name;
    *address = {};
    address->sun_family = AF_UNIX;
    errno = EINVAL;
    if (name.find('/') != std::string::npos || path.find('\0') != std::string::npos) {
        *whyNot = "\"" + name + "\" cannot be the name of a socket";
        return false;
    }
    if (path.size() >= sizeof(address->sun_path)) {
        *whyNot = path + ": longer than the " + std::to_string(sizeof(address->sun_path) - 1) +
                  " characters of a socket's address";
        return false;
    }
    memcpy(address->sun_path, path.c_str(), path.size());
    return true;
}

int connectTo(const std::string& directory, const std::string& name, std::string* whyNot) {
    uid_t owner = 0;
    sockaddr_un address;
    if (!isTrusted(directory, &owner, whyNot) ||
        !socketAddress(directory, name, &address, whyNot)) {
        return -1;
    }
    Descriptor connection(socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0));
    if (connection.get() < 0) {
        *whyNot = inWords("no socket for " + std::string(address.sun_path));
        return -1;
    }
    const timeval limit{callTimeout() / 1000, callTimeout() % 1000 * 1000L};
    setsockopt(connection.get(), SOL_SOCKET, SO_SNDTIMEO, &limit, sizeof(limit));
    setsockopt(connection.get(), SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof(limit));
    int result = 0;
    do {
        // On a Unix socket an interrupted connect has not begun, and is simply called again.
        result = connect(connection.get(), reinterpret_cast<const sockaddr*>(&address),
                         sizeof(address));
    } while (result != 0 && errno == EINTR);
    ucred server{};
    socklen_t size = sizeof(server);
    if (result != 0 || getsockopt(connection.get(), SOL_SOCKET, SO_PEERCRED, &server, &size) != 0) {
        *whyNot = inWords(address.sun_path);
        return -1;
    }
    if (server.uid == 0 || server.uid == owner || server.uid == geteuid()) {
        return connection.release();
    }
    *whyNot = std::string(address.sun_path) + ": served by uid " + std::to_string(server.uid) +
              ", to whom the directory does not belong";
    return -1;
}

int publish(const std::vector<std::string>& chain, const std::string& instance,
            std::string* whyNot) {
    // The umask is the whole process's: two that change it at once could leave it changed.
    static std::mutex mutex;
    const std::lock_guard<std::mutex> one(mutex);
    const std::string directory = serverDirectory();
    if (!prepareDirectory(directory, whyNot)) return -1;
    const std::string name = socketName(chain.front(), instance);
    sockaddr_un address;
    if (!socketAddress(directory, name, &address, whyNot)) return -1;
    if (endsWith(name, kTemporary) || endsWith(name, kLock)) {
        // Another service's file could have this name.
        *whyNot = "\"" + name + "\": the name of a service must not end in \"" + kTemporary +
                  "\" or \"" + kLock + "\"";
        errno = EINVAL;
        return -1;
    }
    Descriptor lock(takeLock(directory + "/" + name + kLock, whyNot));
    if (lock.get() < 0) return -1;
    // No link for the base interface: every object has that one.
    for (size_t i = 1; i + 1 < chain.size(); ++i) {
        if (!linkTo(name, directory, socketName(chain[i], instance), whyNot)) return -1;
    }
    const int listener = listenAt(directory, name, whyNot);
    // Held until the process ends.
    if (listener >= 0) lock.release();
    return listener;
}

}  // namespace android::hardware
