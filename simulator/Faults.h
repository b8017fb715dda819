// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Folder.h"

#include <cstddef>
#include <optional>

namespace simulator {

/** Something that goes wrong with one operation on one node. */
struct Fault {
    /** The errno that the operation fails with; 0 for a transfer that is cut short. */
    int error = 0;
    /** How many bytes a transfer that is cut short moves. */
    size_t bytes = 0;
    /** How often it still happens; 0: always. */
    unsigned times = 0;
    /** How often the operation still succeeds first. */
    unsigned after = 0;
};

/** @return the fault that a text stands for: an errno's name like "EINVAL", or "short=BYTES". */
std::optional<Fault> parseFault(const std::string& text);

/**
 * Sets the fault of an operation on a node; an empty one removes it.
 *
 * @param leaf the node's name, like "intensity", in either layout.
 * @param operation "open", "read", "write" or "close".
 * @return whether it could be stored.
 */
bool setFault(const Folder& directory, const std::string& leaf, const std::string& operation,
              const std::optional<Fault>& fault);

/**
 * @return the fault that happens this time. Counts it, also between processes: no more of them get
 *     the fault than it has times left.
 */
std::optional<Fault> takeFault(const Folder& directory, const std::string& leaf,
                               const std::string& operation);

/** @return a line for each fault that is set, like "intensity write EIO, 2 times". */
std::vector<std::string> listFaults(const Folder& directory);

/** Removes all faults. @return an errno, 0 for success. */
int clearFaults(const Folder& directory);

}  // namespace simulator
