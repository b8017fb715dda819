// SPDX-License-Identifier: Apache-2.0
#include "PrivateDirectory.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <stdexcept>

namespace session {

// Not in $TMPDIR: a socket's path must be short, and a preloaded library's without blanks.
PrivateDirectory::PrivateDirectory() {
    if (mkdtemp(mPath.data()) != nullptr && chmod(mPath.c_str(), 0755) == 0) {
        // It reads until this process ends. A dying daemon may still add files.
        const std::string remover =
                "exec >/dev/null 2>&1; trap '' INT QUIT TERM HUP; PATH=/usr/bin:/bin; read _;"
                "for attempt in 1 2 3 4 5; do rm -rf " +
                mPath + " && break; sleep 0.2; done";
        mRemover = popen(remover.c_str(), "we");
    }
    if (mRemover == nullptr) {
        const std::string reason = mPath + ": " + strerror(errno);
        rmdir(mPath.c_str());
        throw std::runtime_error(reason);
    }
}

PrivateDirectory::~PrivateDirectory() {
    pclose(mRemover);
}

}  // namespace session
