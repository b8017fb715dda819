// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "scores/Score.h"
#include "service/Connection.h"

#include <iosfwd>
#include <nlohmann/json.hpp>

namespace vibratorctl {

using VibratorStatus = ::android::hardware::vibrator::V1_0::Status;

/** An operation of the interface, and what a call of it needs. */
struct Operation {
    std::string name;
    /** Whether only root and the system user may call it. */
    bool isRestricted = false;
    /** The nodes that it needs besides those that run the motor. */
    std::vector<std::string> nodes = {};
    /** What its arguments may be: "an amplitude is 1 to 255". */
    std::string range = {};
};

/** The answer to a call, besides its status. */
struct Answer {
    /** What the command was given: "5". */
    std::string argument = {};
    /** For a person: "20 ms". */
    std::string words = {};
    /** The same, as members of the JSON. */
    nlohmann::ordered_json members = nlohmann::ordered_json::object();
    /** Why it was refused, if that is known; otherwise reasonOf() finds the reason. */
    std::string reason = {};
};

/** @return whether this process's user may make the restricted calls. */
bool mayCallRestricted();

/** @return why a call was refused to this process's user. */
std::string notPermitted();

/** @return why the service refused a call, judged by the driver, and what to do. */
std::string reasonOf(const Operation& operation, VibratorStatus status);

/**
 * What the commands share: the options of every command, the service, and the report, which is in
 * words or as JSON, one line or one object for each call.
 */
class Client : public cli::Program {
  public:
    Client();

    /** Reports the answer to a call. @return the exit code. */
    int answer(const Operation& operation, VibratorStatus status, Answer answer = {}) const;
    /** The same for a call just made. @throw Unreachable */
    int answer(const Operation& operation,
               const ::android::hardware::Return<VibratorStatus>& status,
               Answer answer = {}) const {
        return this->answer(operation, reached(status), std::move(answer));
    }
    /**
     * Reports the result of what is not a single call.
     *
     * @param words lines for a person.
     * @param ok whether nothing is wrong.
     * @return the exit code.
     */
    int found(const std::string& words, const nlohmann::ordered_json& members,
              bool ok = true) const;
    void complain(const std::string& status, const std::string& reason) const override;

    /** @return the service. @throw Unreachable */
    ::android::sp<IDaxVibrator> service() const { return connect(*mInstance); }
    const std::string& instance() const { return *mInstance; }
    bool isVerbose() const { return *mVerbose; }

    /** Makes a command a step of scores, under a name of its own. */
    void addStep(StepKind kind) { mStepKinds.push_back(std::move(kind)); }
    const std::vector<StepKind>& stepKinds() const { return mStepKinds; }
    /** Sets the step of a score to which answers belong from now on; nullptr for none. */
    void setStep(const ScoreStep* step) { mStep = step; }

  private:
    bool isJson() const override { return *mJson; }
    int perform(const cli::Command& command) override;
    /** Prints the words or, on standard output, the members. @return the exit code. */
    int print(std::ostream& stream, const std::string& words,
              const nlohmann::ordered_json& members) const;
    /** @return the name of the step or the command that is performed. */
    std::string performed() const { return mStep == nullptr ? current() : mStep->name; }

    cli::Value<std::string> mInstance;
    cli::Value<uint32_t> mTimeout;
    cli::Value<bool> mJson;
    cli::Value<bool> mVerbose;
    std::vector<StepKind> mStepKinds;
    const ScoreStep* mStep = nullptr;
};

/** @return what a file holds, or standard input for "-". @throw cli::UsageError */
std::string readInput(const std::string& name);

}  // namespace vibratorctl
