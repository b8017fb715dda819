// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Attributes.h"
#include "Folder.h"

#include <sys/types.h>

#include <memory>

/**
 * A kernel vibrator driver in a directory: a plain file for each sysfs attribute, so that a daemon,
 * a test and a person see the same driver.
 */
namespace simulator {

using model::Features;
using model::Layout;

/** @return the driver's directory that the environment names; empty where it names none. */
std::string inheritedDirectory();

/**
 * Takes a directory for a simulated driver: marks it, if it is empty.
 *
 * @return an errno, 0 for success; ENOTEMPTY if it has other content and no mark.
 */
int claimDirectory(const Folder& directory);
/** @return whether a directory has been claimed. */
bool isMarked(const Folder& directory);
/**
 * Makes a driver in a directory that can be claimed, and replaces one of the same layout. Follows
 * no links inside. @return an errno, 0 for success.
 */
int createDriver(const Folder& directory, Layout layout, const Features& features);
/** Makes only the nodes, in any directory. @return an errno, 0 for success. */
int createNodes(const Folder& directory, Layout layout, const Features& features);

/** A node of the simulated driver. */
struct Node {
    /** Its path on a device. */
    std::string path;
    /** The directory of the driver. */
    std::shared_ptr<const Folder> directory;

    /** @return the last part of its path, like "intensity". */
    std::string leaf() const;
};

/** @return whether a path lies where the driver's nodes are; then *node is that node. */
bool findNode(const std::string& directory, const char* path, Node* node);

/** @return the nodes that exist below a directory. */
std::vector<Node> listNodes(const std::string& directory);

/** Opens a node's file as the kernel would the node. @return a descriptor, or a negative errno. */
int openNode(const Node& node, int flags);

/** @return what reading the node yields now. */
std::string show(const Node& node);

/** Writes to the node. @return the number of bytes taken, or a negative errno. */
ssize_t store(const Node& node, std::string_view bytes);

}  // namespace simulator
