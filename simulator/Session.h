// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"

#include <string>
#include <vector>

namespace simulator {

/** Makes a driver in a directory. @throw std::runtime_error that says why it cannot. */
void makeDriver(const std::string& directory, Layout layout, const Features& features);

struct SessionOptions {
    /** Where the driver is made; empty for a directory that is removed in the end. */
    std::string directory;
    Layout layout = Layout::kLedTrigger;
    Features features;
    /** Empty for a shell. */
    std::vector<std::string> command;
};

/**
 * Makes a driver, starts the daemon on it, and runs a command that finds both; when the command
 * ends, or this process in whatever way, the daemon is ended and what was made is removed.
 *
 * @return the command's exit code; 128 and the number of the signal that has ended it.
 * @throw std::runtime_error that says what kept the daemon from running on the driver.
 */
int runSession(const SessionOptions& options);

}  // namespace simulator
