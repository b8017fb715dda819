// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Folder.h"
#include "Player.h"

#include <sys/stat.h>

#include <map>
#include <string>

struct fuse;

namespace driver {

/** A motor, and the driver that it is to have. */
struct Setup {
    Motor motor;
    model::Layout layout;
    Patterns patterns;
};

/**
 * Serves the driver's attributes as the files of a file system, which has nothing else and is to be
 * mounted at the directory of their layout. Lives as long as its process.
 */
class Nodes {
  public:
    /**
     * @param file /dev/fuse, where the kernel asks.
     * @param trace gets each access; a directory that is no driver's for no trace.
     * @throw std::runtime_error
     */
    Nodes(Setup setup, int file, const std::string& trace);

    /** Serves them until they are unmounted. */
    void serve();

  private:
    struct Requests;

    void add(const std::string& leaf, mode_t mode, const std::string& text);

    Player mPlayer;
    /** The directory and its files, by path. */
    std::map<std::string, struct stat> mFiles;
    const std::string mDirectory;
    const simulator::Folder mTrace;
    struct fuse* mFuse;
};

}  // namespace driver
