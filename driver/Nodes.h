// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Attributes.h"
#include "Folder.h"

#include <sys/stat.h>

#include <functional>
#include <map>
#include <string>

struct fuse;

namespace driver {

/**
 * Serves attributes as the files of a file system, which has nothing else and is to be mounted at
 * the directory of their layout. Lives as long as its process.
 */
class Nodes {
  public:
    /**
     * @param file /dev/fuse, where the kernel asks.
     * @param trace gets each access; a directory that is no driver's for no trace.
     * @throw std::runtime_error
     */
    Nodes(int file, model::Layout layout, model::State& state, const std::string& trace);

    /** Adds a file for an attribute, with the text that it shows at first. */
    void add(const std::string& leaf, mode_t mode, const std::string& text);
    /** Serves them until they are unmounted. @param action called when a timer can be read. */
    void serve(int timer, const std::function<void()>& action);

  private:
    struct Requests;

    /** The directory and its files, by path. */
    std::map<std::string, struct stat> mFiles;
    model::State& mState;
    const std::string mDirectory;
    const simulator::Folder mTrace;
    struct fuse* mFuse;
};

}  // namespace driver
