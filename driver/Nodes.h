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
 * Opens the device over which the kernel asks for what is in a file system. @return its descriptor.
 * @throw std::runtime_error that says what the machine lacks.
 */
int openFileSystem();

/**
 * Mounts a file system that is served over a descriptor, for root so that all users see it.
 *
 * @throw std::runtime_error
 */
void mountFileSystem(int file, const std::string& directory);

/**
 * Serves attributes as files of a file system that takes the place of /sys/class. Lives as long as
 * its process.
 */
class Nodes {
  public:
    /**
     * @param file where the kernel asks.
     * @param trace gets each access; a directory that is no driver's for no trace.
     * @throw std::runtime_error
     */
    Nodes(int file, model::Layout layout, model::State& state, const std::string& trace);

    /** Adds a file for an attribute. */
    void add(const std::string& leaf, mode_t mode);
    /** Serves them until they are unmounted. @param action called when a timer can be read. */
    void serve(int timer, const std::function<void()>& action);

  private:
    struct Requests;

    void addFile(const std::string& path, mode_t mode);

    model::State& mState;
    const simulator::Folder mTrace;
    /** The attributes' directory, with a slash at its end. */
    std::string mDirectory;
    /** By path; directories, too. */
    std::map<std::string, struct stat> mFiles;
    struct fuse* mFuse;
};

}  // namespace driver
