// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hardware/vibrator/1.0/types.h>

#include <iosfwd>
#include <nlohmann/json.hpp>
#include <string>
#include <vector>

using VibratorStatus = ::android::hardware::vibrator::V1_0::Status;

/** Exit codes of vibratorctl. */
enum ExitCode {
    kSuccess = 0,
    /** The service refused, doctor found something, or the output could not be written. */
    kRefused = 1,
    /** The command line, or a file that it names, has a mistake. */
    kUsage = 2,
    /** The service cannot be reached. */
    kUnreachable = 3,
};

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

/** Reports the result of a command, in words or as JSON: one line or one object for each call. */
struct Report {
    bool isJson = false;
    bool isVerbose = false;

    /** Reports the answer to a command's call. @return the exit code. */
    int answer(const std::string& command, const Operation& operation, VibratorStatus status,
               const Answer& answer) const;
    /**
     * Reports the result of a command that is not a single call.
     *
     * @param words lines for a person.
     * @param ok whether nothing is wrong.
     * @return the exit code.
     */
    int found(const std::string& command, const std::string& words,
              const nlohmann::ordered_json& members, bool ok = true) const;
    /** Reports that a command was not done. @param status like "USAGE". */
    void failure(const std::string& command, const std::string& status,
                 const std::string& reason) const;
    /** Warns on standard error, in words only. */
    void warn(const std::string& text) const;

  private:
    /** Prints the words or, on standard output, the members. @return the exit code. */
    int print(std::ostream& stream, const std::string& command, const std::string& words,
              const nlohmann::ordered_json& members) const;
};
