// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "cli/CommandLine.h"
#include "service/Connection.h"
#include "service/Reasons.h"

#include <iosfwd>
#include <nlohmann/json.hpp>

namespace vibratorctl {

/** The answer to a call, besides its status. */
struct Answer {
    /** What the command was given: "5". */
    std::string argument = {};
    /** For a person: "20 ms". */
    std::string words = {};
    /** The same, as members of the JSON. */
    nlohmann::ordered_json members = nlohmann::ordered_json::object();
    /** What a person should know although the call succeeded. */
    std::string warning = {};
    /** Why it was refused, if that is known; otherwise reasonOf() finds the reason. */
    std::string reason = {};
};

/** What is reported on: a command, or a step of a score. */
struct Subject {
    std::string name;
    /** What it was given; empty if the answer knows. */
    std::string argument = {};
    /** More members of the JSON of each of its answers. */
    nlohmann::ordered_json members = nlohmann::ordered_json::object();
};

/** @return a motor as a member of the JSON. */
nlohmann::ordered_json asJson(const LocalDriver::Motor& motor);

/** Tells answers in words or as JSON, one line or one object for each call. */
class Report {
  public:
    /** @param service tells the process that has refused a call. */
    Report(const cli::Argument* asJson, const cli::Argument* verbose,
           std::function<Process()> service)
        : mAsJson(asJson), mVerbose(verbose), mService(std::move(service)) {}

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

    bool isJson() const { return mAsJson->isGiven(); }
    bool isVerbose() const { return mVerbose->isGiven(); }
    /** Sets what is reported on from now on. @return what was reported on before. */
    Subject setSubject(Subject subject) { return std::exchange(mSubject, std::move(subject)); }

  private:
    /** Prints the words or, on standard output, the members. @return the exit code. */
    int print(std::ostream& stream, const std::string& words,
              const nlohmann::ordered_json& members) const;

    const cli::Argument* mAsJson;
    const cli::Argument* mVerbose;
    std::function<Process()> mService;
    Subject mSubject;
};

}  // namespace vibratorctl
