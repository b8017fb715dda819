// SPDX-License-Identifier: Apache-2.0
#include "Folder.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <system_error>

namespace simulator {
namespace {

/** @return a name; for one that leads out of its folder "", which every system call refuses. */
const char* inside(const std::string& name) {
    const bool leaves = name.find('/') != std::string::npos || name == "." || name == "..";
    return leaves ? "" : name.c_str();
}

/** Makes a folder that all may see, whatever the umask, unless there is something already. */
void makeFolder(int above, const char* name) {
    const mode_t before = umask(0022);
    mkdirat(above, name, 0755);
    umask(before);
}

}  // namespace

// openat throughout: in a program with the stand-ins, open is one of them.
Folder::Folder(const std::string& path) {
    enter(AT_FDCWD, path.empty() ? "/" : path.c_str());
}

Folder Folder::make(const std::string& path) {
    std::error_code error;
    std::filesystem::create_directories(path, error);
    Folder folder(path);
    if (folder.mError != 0 && error) folder.mError = error.value();
    return folder;
}

Folder::Folder(const Folder& above, std::string_view path, bool create) : mError(above.mError) {
    if (mError == 0) enter(above.mFolder.get(), ".");
    while (mError == 0 && !path.empty()) {
        const std::string name(path.substr(0, path.find('/')));
        path.remove_prefix(std::min(name.size() + 1, path.size()));
        if (create) makeFolder(mFolder.get(), inside(name));
        enter(mFolder.get(), inside(name), O_NOFOLLOW);
    }
}

void Folder::enter(int above, const char* name, int flags) {
    mFolder.reset(openat(above, name, O_PATH | O_DIRECTORY | O_CLOEXEC | flags));
    mError = mFolder.isValid() ? 0 : errno;
}

mode_t Folder::mode(const std::string& name) const {
    struct stat info;
    return fstatat(mFolder.get(), inside(name), &info, AT_SYMLINK_NOFOLLOW) == 0 ? info.st_mode : 0;
}

UniqueFd Folder::open(const std::string& name, int flags, mode_t mode) const {
    // O_NONBLOCK: opening a pipe in a file's place must not block.
    constexpr int kSafely = O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC;
    UniqueFd file(openat(mFolder.get(), inside(name), flags | kSafely, mode));
    struct stat info;
    if (file.isValid() && (fstat(file.get(), &info) != 0 || !S_ISREG(info.st_mode))) {
        file.reset();
        errno = EINVAL;
    }
    return file;
}

std::string Folder::read(const std::string& name) const {
    std::string text;
    const UniqueFd file = open(name, O_RDONLY);
    char piece[4096];
    for (ssize_t count; (count = ::read(file.get(), piece, sizeof(piece))) > 0;)
        text.append(piece, static_cast<size_t>(count));
    return text;
}

int Folder::replace(const std::string& name, std::string_view text, mode_t mode) const {
    if (error() != 0) return error();
    // A name for each thread; a file that a killed one left is removed.
    const std::string fresh = ".new." + std::to_string(gettid());
    remove(fresh);
    constexpr int kCreate = O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC;
    const UniqueFd file(openat(mFolder.get(), fresh.c_str(), kCreate, 0600));
    if (!file.isValid()) return errno;
    errno = ENOSPC;
    for (ssize_t size; (size = write(file.get(), text.data(), text.size())) > 0;)
        text.remove_prefix(static_cast<size_t>(size));
    if (text.empty() && fchmod(file.get(), mode) == 0 &&
        renameat(mFolder.get(), fresh.c_str(), mFolder.get(), inside(name)) == 0) {
        return 0;
    }
    const int failure = errno;
    remove(fresh);
    return failure;
}

void Folder::remove(const std::string& name) const {
    unlinkat(mFolder.get(), inside(name), 0);
}

std::vector<std::string> Folder::names() const {
    std::vector<std::string> names;
    const std::string self = "/proc/self/fd/" + std::to_string(mFolder.get());
    std::error_code error;
    for (const auto& entry : std::filesystem::directory_iterator(self, error))
        names.push_back(entry.path().filename());
    std::sort(names.begin(), names.end());
    return names;
}

}  // namespace simulator
