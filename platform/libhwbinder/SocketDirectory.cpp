// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/SocketDirectory.h"

#include "Alarm.h"
#include "libhwbinder/Driver.h"

#include <fcntl.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <climits>
#include <cstring>

namespace android::hardware {
namespace {

constexpr char kSystemDirectory[] = "/run/hwbinder";
/** Links that are followed in a path, as many as the kernel follows. */
constexpr int kMaxLinks = 40;

bool isOurs(uid_t uid) {
    return uid == 0 || uid == geteuid();
}

bool isWritableByOthers(const struct stat& info) {
    return (info.st_mode & (S_IWGRP | S_IWOTH)) != 0;
}

/** @return whether only root and this process's user could have put the entry there. */
bool isGuarded(const struct stat& parent, const struct stat& entry) {
    if (!isOurs(parent.st_uid)) return false;
    return !isWritableByOthers(parent) || ((parent.st_mode & S_ISVTX) != 0 && isOurs(entry.st_uid));
}

/**
 * Goes along a path, one step after the other: a link of somebody else's could lead to any
 * directory, and is not followed anywhere in it.
 */
class Walk {
  public:
    Error go(const std::string& path, bool makesLast) {
        mRest = path;
        Error error = start();
        while (error.isOk() && !mRest.empty())
            error = step(path, makesLast);
        return error;
    }

    UniqueFd takeDirectory() { return std::move(mAt); }
    const struct stat& info() const { return mInfo; }
    bool isPlaceGuarded() const { return mIsGuarded; }

  private:
    /** Begins at the root, or where the process is: whoever could change that path is unknown. */
    Error start() {
        const bool isAbsolute = mRest[0] == '/';
        mIsGuarded = mIsGuarded && isAbsolute;
        mAt.reset(open(isAbsolute ? "/" : ".", O_PATH | O_DIRECTORY | O_CLOEXEC));
        if (!mAt.isValid() || fstat(mAt.get(), &mInfo) != 0) return Error::ofErrno({mRest});
        return {};
    }

    std::string takeName() {
        mRest.erase(0, mRest.find_first_not_of('/'));
        std::string name = mRest.substr(0, mRest.find('/'));
        mRest.erase(0, name.size());
        mRest.erase(0, mRest.find_first_not_of('/'));
        return name;
    }

    Error step(const std::string& path, bool makesLast) {
        const std::string name = takeName();
        if (name.empty()) return {};
        const auto enter = [&] {
            return openat(mAt.get(), name.c_str(), O_PATH | O_NOFOLLOW | O_CLOEXEC);
        };
        UniqueFd next(enter());
        if (!next.isValid() && errno == ENOENT && makesLast && mRest.empty()) {
            if (mkdirat(mAt.get(), name.c_str(), 0755) != 0 && errno != EEXIST) {
                return Error::ofErrno({path});
            }
            next.reset(enter());
        }
        struct stat info;
        if (!next.isValid() || fstat(next.get(), &info) != 0) return Error::ofErrno({path});
        mIsGuarded = mIsGuarded && isGuarded(mInfo, info);
        if (S_ISLNK(info.st_mode)) return follow(path, name, next, info.st_uid);
        mAt = std::move(next);
        mInfo = info;
        return {};
    }

    Error follow(const std::string& path, const std::string& name, const UniqueFd& link,
                 uid_t owner) {
        if (!isOurs(owner)) {
            return {-EPERM, path + ": \"" + name + "\" is a link of uid " + std::to_string(owner)};
        }
        char target[PATH_MAX];
        const ssize_t length = readlinkat(link.get(), "", target, sizeof(target));
        if (length < 0) return Error::ofErrno({path});
        if (++mLinks > kMaxLinks) return {-ELOOP, path + ": " + strerror(ELOOP)};
        const std::string to(target, static_cast<size_t>(length));
        mRest = mRest.empty() ? to : to + "/" + mRest;
        return to[0] == '/' ? start() : Error();
    }

    std::string mRest;
    UniqueFd mAt;
    struct stat mInfo {};
    bool mIsGuarded = true;
    int mLinks = 0;
};

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

Error SocketDirectory::open(const std::string& path, bool makes) {
    Walk walk;
    Error error = walk.go(path, makes);
    if (!error.isOk()) return error;
    if (!S_ISDIR(walk.info().st_mode)) return {-ENOTDIR, path + ": is not a directory"};
    if (isWritableByOthers(walk.info())) {
        return {-EPERM, path + ": others than its owner may write to it"};
    }
    mPath = path;
    mOwner = walk.info().st_uid;
    mIsPlaceGuarded = walk.isPlaceGuarded();
    mDirectory = walk.takeDirectory();
    return {};
}

Error SocketDirectory::openForServer() {
    // The mode must not depend on the umask: every user looks for services here.
    const mode_t before = umask(0022);
    Error error = open(serverDirectory(), true);
    umask(before);
    if (error.isOk() && !isOurs(mOwner)) {
        return {-EPERM, mPath + ": belongs to uid " + std::to_string(mOwner) +
                                "; serve as that user, or in another directory (HWBINDER_DIR)"};
    }
    return error;
}

Error SocketDirectory::addressOf(const std::string& name, sockaddr_un* address) const {
    const std::string directory = "/proc/self/fd/" + std::to_string(mDirectory.get()) + "/";
    const size_t max = sizeof(address->sun_path) - 1 - directory.size();
    if (name.find('/') != std::string::npos || name.find('\0') != std::string::npos) {
        return {-EINVAL, "\"" + name + "\" cannot be the name of a socket"};
    }
    if (name.size() > max) {
        return {-ENAMETOOLONG, "\"" + name + "\" is longer than the " + std::to_string(max) +
                                       " characters that the name of a socket may have"};
    }
    *address = {};
    address->sun_family = AF_UNIX;
    memcpy(address->sun_path, (directory + name).c_str(), directory.size() + name.size());
    return {};
}

Error SocketDirectory::connect(const std::string& name, UniqueFd* connection) const {
    sockaddr_un address;
    Error error = addressOf(name, &address);
    if (!error.isOk()) return error;
    UniqueFd socket(::socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0));
    if (!socket.isValid()) return Error::ofErrno({"no socket for ", mPath, "/", name});
    // On a Unix socket an interrupted connect has not begun, and is simply called again.
    const int result = Alarm(callTimeout).uninterrupted([&] {
        return ::connect(socket.get(), reinterpret_cast<const sockaddr*>(&address),
                         sizeof(address));
    });
    ucred server{};
    socklen_t size = sizeof(server);
    if (result != 0 || getsockopt(socket.get(), SOL_SOCKET, SO_PEERCRED, &server, &size) != 0) {
        return Error::ofErrno({mPath, "/", name});
    }
    if (!isOurs(server.uid) && (server.uid != mOwner || !mIsPlaceGuarded)) {
        return {-EPERM,
                mPath + "/" + name + ": served by uid " + std::to_string(server.uid) +
                        (server.uid != mOwner ? ", to whom the directory does not belong"
                                              : ", whose directory others than root can exchange")};
    }
    *connection = std::move(socket);
    return {};
}

}  // namespace android::hardware
