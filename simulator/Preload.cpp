// SPDX-License-Identifier: Apache-2.0
#include "SimulatedDriver.h"
#include "TraceFile.h"
#include "TraceLine.h"

#include <unistd.h>

#include <cstdio>

namespace {

/** Warns at the start of settings that would look like a kernel without a driver. */
__attribute__((constructor)) void checkDirectory() {
    const std::string directory = simulator::inheritedDirectory();
    if (directory.empty()) {
        dprintf(STDERR_FILENO,
                "libvibrator_sim: VIBRATOR_SIM_DIR is not set, nothing is simulated\n");
    } else if (!simulator::isMarked(simulator::Folder(directory))) {
        dprintf(STDERR_FILENO,
                "libvibrator_sim: VIBRATOR_SIM_DIR: %s has no simulated driver; "
                "\"vibrator-sim create\" makes one\n",
                model::quote(directory).c_str());
    }
}

}  // namespace
