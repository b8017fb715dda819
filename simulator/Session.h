// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"

#include <stdexcept>
#include <string>
#include <vector>

namespace simulator {

/** What kept the daemon from running on a simulated driver; what() says it in one line. */
class SessionError : public std::runtime_error {
  public:
    using runtime_error::runtime_error;
};

/** Makes a driver in a directory; throws a SessionError that says why it cannot. */
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
 */
int runSession(const SessionOptions& options);

}  // namespace simulator
