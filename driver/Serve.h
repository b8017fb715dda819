// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Nodes.h"

#include <sys/types.h>

#include <string>
#include <vector>

namespace driver {

/** Serves the nodes of a motor once another process has called mountNodes, until they are
 * unmounted. */
void serveMounted(Setup setup);

/** Mounts, as root, the nodes that a process serves; makes the directory. @throw on failure */
void mountNodes(pid_t process, const std::string& directory);

/**
 * Runs the service on a motor, and a command beside it, where /sys/class has only the motor's
 * nodes. Other programs see nothing of it. @return the command's exit code.
 */
int runSession(Setup setup, const std::vector<std::string>& command);

}  // namespace driver
