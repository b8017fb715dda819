// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

/** A new directory that everybody may enter; gone, with all that is in it, in the end. */
class TemporaryDirectory {
  public:
    TemporaryDirectory() {
        char path[] = "/tmp/vibrator-test-XXXXXX";
        mPath = mkdtemp(path);
        std::filesystem::permissions(mPath, std::filesystem::perms(0755));
    }
    TemporaryDirectory(const TemporaryDirectory&) = delete;
    TemporaryDirectory& operator=(const TemporaryDirectory&) = delete;
    ~TemporaryDirectory() {
        std::error_code error;
        std::filesystem::remove_all(mPath, error);
    }

    const std::string& path() const { return mPath; }

  private:
    std::string mPath;
};
