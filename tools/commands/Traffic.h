// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Client.h"
#include "SimulatedDriver.h"
#include "TraceFile.h"

namespace vibratorctl {

/** Adds the argument of a command that reads node traffic. @return gives the name of the file. */
inline std::function<std::string()> addTraffic(cli::Command& command) {
    const auto named = command.file("FILE",
                                    "trace of the simulated driver, or log of the daemon (default: "
                                    "the trace in VIBRATOR_SIM_DIR); - for standard input",
                                    "");
    return [named] {
        if (!named->empty()) return *named;
        const std::string simulated = simulator::inheritedDirectory();
        if (simulated.empty()) throw cli::UsageError("no FILE: name a trace, or the daemon's log");
        return simulator::traceFile(simulated);
    };
}

}  // namespace vibratorctl
