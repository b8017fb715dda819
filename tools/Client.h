// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Report.h"
#include "Service.h"
#include "cli/CommandLine.h"

#include <hidl/Status.h>

#include <stdexcept>
#include <string>

/** The service cannot be reached; what() says why. */
class Unreachable : public std::runtime_error {
  public:
    using runtime_error::runtime_error;
};

/** What the commands have in common: the options before them, the service, the report. */
class Client {
  public:
    Client();

    /** Runs a command line. @return the exit code. */
    int run(int argc, char** argv);

    /**
     * Makes a call and reports its answer.
     *
     * @return the exit code.
     * @throw Unreachable
     */
    int answer(const Call& call, const ::android::hardware::Return<VibratorStatus>& status,
               const Details& details = {}) const;
    /** Reports the answer to a call. @return the exit code. */
    int answer(const Call& call, VibratorStatus status, const Details& details = {}) const;

    /** @return the service. @throw Unreachable */
    ::android::sp<service::IDaxVibrator> service() const;
    const std::string& instance() const { return *mInstance; }
    const Report& report() const { return mReport; }
    cli::Program& program() { return mProgram; }

    /** @return the result of a call that reached the service. @throw Unreachable */
    template <typename T>
    static T reached(const ::android::hardware::Return<T>& result) {
        if (!result.isOk()) throw Unreachable(result.description());
        return result;
    }
    static void reached(const ::android::hardware::Return<void>& result) {
        if (!result.isOk()) throw Unreachable(result.description());
    }

  private:
    /** @return the exit code of the command, or of what kept it from its end. */
    int runCommand(int argc, char** argv);

    cli::Program mProgram;
    cli::Value<std::string> mInstance;
    cli::Value<uint32_t> mTimeout;
    cli::Value<bool> mJson;
    cli::Value<bool> mVerbose;
    Report mReport;
};

/** @return the simulated driver's directory, as the environment names it; empty for the kernel's.
 */
std::string simulationDirectory();

/** @return what a file holds, or standard input for "-". @throw cli::UsageError */
std::string readInput(const std::string& name);
