// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Report.h"
#include "Score.h"
#include "Service.h"
#include "cli/CommandLine.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

/** What the commands share: the options of every command, the service, the report. */
class Client {
  public:
    Client();

    /** Runs a command line. @return the exit code. */
    int run(int argc, char** argv);

    /** Reports the answer to a call. @return the exit code. */
    int answer(const Operation& operation, VibratorStatus status, Answer answer = {}) const;
    /** The same for a call just made. @throw service::Unreachable */
    int answer(const Operation& operation,
               const ::android::hardware::Return<VibratorStatus>& status,
               Answer answer = {}) const {
        return this->answer(operation, service::reached(status), std::move(answer));
    }

    /** @return the service. @throw service::Unreachable */
    ::android::sp<service::IDaxVibrator> service() const { return service::connect(*mInstance); }
    const std::string& instance() const { return *mInstance; }
    const Report& report() const { return mReport; }
    cli::Program& program() { return mProgram; }
    /** Adds a command; see cli::Program. */
    cli::Command& command(const std::string& group, const std::string& name,
                          const std::string& help, const std::string& example) {
        return mProgram.command(group, name, help, example);
    }

    /** Makes a command a step of scores, under a name of its own. */
    void addStep(StepKind kind) { mStepKinds.push_back(std::move(kind)); }
    const std::vector<StepKind>& stepKinds() const { return mStepKinds; }
    /** Sets the step of a score to which answers belong from now on; nullptr for none. */
    void setStep(const ScoreStep* step) { mStep = step; }

  private:
    /** @return the exit code of the command, or of the error that stopped it. */
    int runCommand(int argc, char** argv);

    cli::Program mProgram;
    cli::Value<std::string> mInstance;
    cli::Value<uint32_t> mTimeout;
    cli::Value<bool> mJson;
    cli::Value<bool> mVerbose;
    Report mReport;
    std::vector<StepKind> mStepKinds;
    const ScoreStep* mStep = nullptr;
};

/** @return the simulated driver's directory from the environment; empty for the kernel's driver. */
std::string simulationDirectory();

/** @return what a file holds, or standard input for "-". @throw cli::UsageError */
std::string readInput(const std::string& name);
