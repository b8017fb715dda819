// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>
#include <utils/UniqueFd.h>

#include <string>

namespace session {

/**
 * A directory in /tmp, which other users may look into. A second process removes it when this one
 * ends, even if it is killed.
 */
class PrivateDirectory {
  public:
    PrivateDirectory();
    PrivateDirectory(const PrivateDirectory&) = delete;
    PrivateDirectory& operator=(const PrivateDirectory&) = delete;
    ~PrivateDirectory();

    std::string operator/(const std::string& name) const { return mPath + "/" + name; }

  private:
    std::string mPath = "/tmp/vibrator-sim.XXXXXX";
    /** The remover waits for the end of a pipe, of which this process has the other end. */
    android::UniqueFd mPipe;
    pid_t mRemover;
};

}  // namespace session
