// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdlib>
#include <filesystem>
#include <string>

/** A new directory, held in memory, that everybody may enter; gone in the end with all in it. */
class TemporaryDirectory {
  public:
    TemporaryDirectory() {
        char path[] = "/dev/shm/vibrator-test-XXXXXX";
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
