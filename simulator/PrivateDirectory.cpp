// SPDX-License-Identifier: Apache-2.0
#include "PrivateDirectory.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <stdexcept>
#include <system_error>

namespace session {
namespace {

/** Waits until nobody has the other end of a pipe; nobody waits for this process's output. */
void awaitEnd(int pipe) {
    const int nowhere = open("/dev/null", O_RDWR);
    dup2(pipe, STDIN_FILENO);
    dup2(nowhere, STDOUT_FILENO);
    dup2(nowhere, STDERR_FILENO);
    close_range(STDERR_FILENO + 1, ~0U, 0);
    char byte;
    while (read(STDIN_FILENO, &byte, 1) < 0 && errno == EINTR) {
    }
}

/** Removes a directory and all in it. @return whether it is gone. */
bool removeDirectory(const std::string& path) {
    // A dying daemon may still add files.
    for (int attempt = 0; attempt < 5; ++attempt) {
        std::error_code error;
        std::filesystem::remove_all(path, error);
        if (!error) return true;
        usleep(200'000);
    }
    return false;
}

}  // namespace

// Not in $TMPDIR: a socket's path must be short, and a preloaded library's without blanks.
PrivateDirectory::PrivateDirectory() {
    if (mkdtemp(mPath.data()) == nullptr) throw std::runtime_error(mPath + ": " + strerror(errno));
    int ends[2];
    if (chmod(mPath.c_str(), 0755) != 0 || pipe2(ends, O_CLOEXEC) != 0 || (mRemover = fork()) < 0) {
        const std::string reason = mPath + ": " + strerror(errno);
        rmdir(mPath.c_str());
        throw std::runtime_error(reason);
    }
    if (mRemover == 0) {
        awaitEnd(ends[0]);
        _exit(removeDirectory(mPath) ? 0 : 1);
    }
    close(ends[0]);
    mPipe.reset(ends[1]);
}

PrivateDirectory::~PrivateDirectory() {
    mPipe.reset();
    waitpid(mRemover, nullptr, 0);
}

}  // namespace session
