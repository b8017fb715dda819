// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <optional>
#include <string>

namespace simulator {

/** Something that goes wrong with one operation on one node. */
struct Fault {
    /** The errno that the operation fails with; 0 for a transfer that is cut short. */
    int error = 0;
    /** How many bytes a transfer that is cut short moves. */
    size_t bytes = 0;
    /** How often it still happens; 0 for ever. */
    unsigned times = 0;
    /** How often the operation still goes well before. */
    unsigned after = 0;
};

/** @return the fault that a text stands for: an errno's name like "EINVAL", or "short=BYTES". */
std::optional<Fault> parseFault(const std::string& text);

/**
 * Makes an operation on a node go wrong from now on; nothing takes back what was set.
 *
 * @param leaf the node's name, like "intensity", in either layout.
 * @param operation "open", "read", "write" or "close".
 * @return whether it could be noted down.
 */
bool setFault(const std::string& directory, const std::string& leaf, const std::string& operation,
              const std::optional<Fault>& fault);

/** @return what goes wrong this time; counts it. */
std::optional<Fault> takeFault(const std::string& directory, const std::string& leaf,
                               const std::string& operation);

}  // namespace simulator
