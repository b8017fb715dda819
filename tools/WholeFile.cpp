// SPDX-License-Identifier: Apache-2.0
#include "WholeFile.h"

#include "cli/CommandLine.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace {

/** @return the mode of a file to come: what it has already, or what all new files have. */
mode_t modeOf(const std::string& file) {
    struct stat info;
    if (stat(file.c_str(), &info) == 0) return info.st_mode & 0777;
    const mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

bool writeAll(int file, const std::string& bytes) {
    size_t done = 0;
    while (done < bytes.size()) {
        const ssize_t size = write(file, bytes.data() + done, bytes.size() - done);
        if (size < 0) return false;
        done += static_cast<size_t>(size);
    }
    return true;
}

}  // namespace

void checkTarget(const std::string& file, const std::string& input) {
    struct stat target;
    struct stat source;
    if (stat(file.c_str(), &target) != 0) return;
    if (!S_ISREG(target.st_mode)) {
        throw cli::UsageError(file + ": is no regular file; -o - writes to standard output");
    }
    const int found = input == "-" ? fstat(STDIN_FILENO, &source) : stat(input.c_str(), &source);
    if (found == 0 && target.st_dev == source.st_dev && target.st_ino == source.st_ino) {
        throw cli::UsageError(file + ": is the input, too");
    }
}

std::string writeWhole(const std::string& file, const std::string& bytes) {
    // Where the name is a link, what it leads to is replaced.
    char* resolved = realpath(file.c_str(), nullptr);
    const std::string target = resolved == nullptr ? file : resolved;
    free(resolved);
    std::string temporary = target + ".XXXXXX";
    const int descriptor = mkostemp(temporary.data(), O_CLOEXEC);
    if (descriptor < 0) return std::string("cannot be written: ") + strerror(errno);
    bool isDone = writeAll(descriptor, bytes) && fchmod(descriptor, modeOf(target)) == 0;
    isDone = close(descriptor) == 0 && isDone;
    isDone = isDone && rename(temporary.c_str(), target.c_str()) == 0;
    if (isDone) return "";
    const std::string reason = strerror(errno);
    unlink(temporary.c_str());
    return "cannot be written: " + reason;
}
