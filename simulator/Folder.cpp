// SPDX-License-Identifier: Apache-2.0
#include "Folder.h"

#include <dirent.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

namespace simulator {
namespace {

constexpr int kOpenFolder = O_PATH | O_DIRECTORY | O_CLOEXEC;

/** @return a name; for one that leads out of its folder "", which every system call refuses. */
const char* inside(const std::string& name) {
    const bool leaves = name.find('/') != std::string::npos || name == "." || name == "..";
    return leaves ? "" : name.c_str();
}

}  // namespace

// openat throughout: in a program with the stand-ins, open is one of them.
Folder::Folder(const std::string& path)
    : mFile(openat(AT_FDCWD, path.empty() ? "/" : path.c_str(), kOpenFolder)) {
    if (mFile < 0) mError = errno;
}

Folder::Folder(const Folder& above, std::string_view path, bool create) : mError(above.mError) {
    if (mError != 0) return;
    mFile = fcntl(above.mFile, F_DUPFD_CLOEXEC, 0);
    mError = mFile < 0 ? errno : 0;
    while (mFile >= 0 && !path.empty()) {
        const std::string name(path.substr(0, path.find('/')));
        path.remove_prefix(std::min(name.size() + 1, path.size()));
        if (create) mkdirat(mFile, inside(name), 0755);
        const int next = openat(mFile, inside(name), kOpenFolder | O_NOFOLLOW);
        mError = next < 0 ? errno : 0;
        close(mFile);
        mFile = next;
    }
}

Folder::~Folder() {
    if (mFile >= 0) close(mFile);
}

mode_t Folder::mode(const std::string& name) const {
    struct stat info;
    return fstatat(mFile, inside(name), &info, AT_SYMLINK_NOFOLLOW) == 0 ? info.st_mode : 0;
}

int Folder::open(const std::string& name, int flags, mode_t mode) const {
    if (mError != 0) return -mError;
    // O_NONBLOCK: opening a pipe in a file's place must not block.
    constexpr int kSafely = O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
    const int file = openat(mFile, inside(name), flags | kSafely, mode);
    if (file < 0) return -errno;
    struct stat info;
    if (fstat(file, &info) == 0 && S_ISREG(info.st_mode)) return file;
    close(file);
    return -EINVAL;
}

std::string Folder::read(const std::string& name) const {
    std::string text;
    const int file = open(name, O_RDONLY);
    if (file < 0) return text;
    char piece[4096];
    for (ssize_t count; (count = ::read(file, piece, sizeof(piece))) > 0;)
        text.append(piece, static_cast<size_t>(count));
    close(file);
    return text;
}

int Folder::replace(const std::string& name, std::string_view text, mode_t mode) const {
    if (mError != 0) return mError;
    // A name for each thread; a file that a killed one left is removed.
    const std::string fresh = ".new." + std::to_string(gettid());
    remove(fresh);
    const int file = openat(mFile, fresh.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
    if (file < 0) return errno;
    errno = ENOSPC;
    const bool isDone =
            write(file, text.data(), text.size()) == static_cast<ssize_t>(text.size()) &&
            fchmod(file, mode) == 0 && renameat(mFile, fresh.c_str(), mFile, inside(name)) == 0;
    const int error = isDone ? 0 : errno;
    close(file);
    if (!isDone) remove(fresh);
    return error;
}

void Folder::remove(const std::string& name) const {
    unlinkat(mFile, inside(name), 0);
}

std::vector<std::string> Folder::names() const {
    std::vector<std::string> names;
    const int file = openat(mFile, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    DIR* folder = file < 0 ? nullptr : fdopendir(file);
    if (folder == nullptr) return names;
    while (const dirent* entry = readdir(folder)) {
        const std::string name = entry->d_name;
        if (name != "." && name != "..") names.push_back(name);
    }
    closedir(folder);
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace simulator
