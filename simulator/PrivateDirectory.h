// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdio>
#include <string>

namespace session {

/**
 * A directory in /tmp, which other users may look into. A shell removes it when this process
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
    /** The other end of the remover's input. */
    FILE* mRemover = nullptr;
};

}  // namespace session
