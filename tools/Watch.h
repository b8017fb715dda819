// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

/** Where the node traffic comes from. */
struct WatchSource {
    /** File that is followed as it grows; "-" is standard input. */
    std::string file;
    /** Whether it is the daemon's log, rather than the simulated driver's trace. */
    bool isLog = false;
    /** Whether what the file holds already is shown as well. */
    bool fromStart = false;
    /** Whether to end at the end of what there is, instead of waiting for more. */
    bool once = false;
};

/**
 * Prints the accesses of the driver's nodes as they come, a line each, and the calls that the
 * service refused, as far as the source tells of them.
 *
 * @throw cli::UsageError when the file cannot be read.
 */
void watch(const WatchSource& source);
