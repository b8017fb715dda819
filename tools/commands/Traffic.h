// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SimulatedDriver.h"
#include "TraceFile.h"
#include "service/Client.h"

namespace vibratorctl {

/** The arguments of a command that reads node traffic. */
struct Traffic {
    explicit Traffic(cli::Command& command)
        : named(command.file("FILE",
                             "trace of the simulated driver (default: the one in "
                             "VIBRATOR_SIM_DIR), - for standard input",
                             "")),
          log(command.flag("--log", "FILE is the daemon's log, not a trace")) {}

    bool isLog() const { return *log; }
    /** @return the file to read: the one that was named, or the simulated driver's. */
    std::string file() const {
        if (!named->empty()) return *named;
        if (!isLog() && !simulator::inheritedDirectory().empty()) {
            return simulator::traceFile(simulator::inheritedDirectory());
        }
        throw cli::UsageError("no FILE: name a trace, or a log with --log");
    }

    cli::Value<std::string> named;
    cli::Value<bool> log;
};

}  // namespace vibratorctl
