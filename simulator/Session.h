// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"

#include <string>
#include <vector>

namespace simulator {

/** Makes a driver in a directory. @throw std::runtime_error that says why it cannot. */
void makeDriver(const std::string& directory, Layout layout, const Features& features);

struct SessionOptions {
    /** The driver's directory; empty for a temporary one. */
    std::string directory;
    Layout layout = Layout::kLedTrigger;
    Features features;
    /** Empty for a shell. */
    std::vector<std::string> command;
};

/**
 * Makes a driver, starts the daemon on it, and runs a command that uses both. When the command or
 * this process ends, in whatever way, the daemon is ended and temporary files are removed.
 *
 * @return the command's exit code; 128 plus the signal's number if a signal ended it.
 * @throw std::runtime_error that says what kept the daemon from running on the driver.
 */
int runSession(const SessionOptions& options);

}  // namespace simulator
