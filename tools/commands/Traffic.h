// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Client.h"
#include "Trace.h"

/** The arguments of a command that reads node traffic. */
class Traffic {
  public:
    explicit Traffic(cli::Command* command)
        : mFile(command->file("FILE",
                              "trace of the simulated driver (default: the one in "
                              "VIBRATOR_SIM_DIR), - for standard input",
                              "")),
          mIsLog(command->flag("--log", "FILE is the daemon's log, not a trace")) {}

    bool isLog() const { return *mIsLog; }
    /** @return the file to read: the one that was named, or the simulated driver's. */
    std::string file() const {
        if (!mFile->empty()) return *mFile;
        if (isLog() || simulationDirectory().empty()) {
            throw cli::UsageError("no FILE: name a trace, or a log with --log");
        }
        return simulator::traceFile(simulationDirectory());
    }

  private:
    cli::Value<std::string> mFile;
    cli::Value<bool> mIsLog;
};
