// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SimulatedDriver.h"

namespace simulator {

/** Makes a driver in a directory. @throw std::runtime_error that says why it cannot. */
void makeDriver(const std::string& directory, Layout layout, const Features& features);

/**
 * Makes a driver, starts the daemon on it, and runs a command that uses both. When the command or
 * this process ends, in whatever way, the daemon is ended and temporary files are removed.
 *
 * @param directory the driver's; empty for a temporary one.
 * @param command empty for a shell.
 * @return the command's exit code; 128 plus the signal's number if a signal ended it.
 * @throw std::runtime_error that says what kept the daemon from running on the driver.
 */
int runSession(const std::string& directory, Layout layout, const Features& features,
               std::vector<std::string> command);

}  // namespace simulator
