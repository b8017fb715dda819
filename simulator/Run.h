// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SimulatedDriver.h"

namespace simulator {

/** Makes a driver in a directory. @throw std::runtime_error that says why it cannot. */
void makeDriver(const std::string& directory, Layout layout, const Features& features);

/**
 * Makes a driver, and runs the service on it and a command that uses both, as session::Session
 * does.
 *
 * @param directory the driver's; empty for a temporary one.
 * @return the command's exit code.
 * @throw std::runtime_error
 */
int runSession(const std::string& directory, Layout layout, const Features& features,
               const std::vector<std::string>& command);

}  // namespace simulator
