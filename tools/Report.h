// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hardware/vibrator/1.0/types.h>

#include <nlohmann/json.hpp>
#include <string>

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

/** @return the name of a status, like "BAD_VALUE". */
std::string statusName(VibratorStatus status);

/** @return whether this process's user may make the calls that not everybody may. */
bool mayCallRestricted();

/** @return why a call was refused to this process's user. */
std::string notPermitted();

/** What is known of a call before it is made, to explain its answer. */
struct Call {
    /** The command: "intensity". */
    std::string command;
    /** The operation as the interface names it. */
    const char* operation;
    /** Whether only the system user and root may call it. */
    bool restricted = false;
    /** What the command was given: "5"; for the answer. */
    std::string argument = {};
};

/** The answer to a call beside its status. */
struct Details {
    /** For a person: "20 ms". */
    std::string words;
    /** The same, as members of the JSON. */
    nlohmann::ordered_json members = nlohmann::ordered_json::object();
};

/** Tells the user what came of a command, in words or as JSON: one line, one object, a call. */
struct Report {
    bool isJson = false;
    bool isVerbose = false;

    /** Reports the answer to a call. @param reason why it was refused. @return the exit code. */
    int answer(const Call& call, VibratorStatus status, const Details& details,
               const std::string& reason) const;
    /**
     * Reports what a command that is no single call found.
     *
     * @param words lines for a person.
     * @param ok whether all is as it should be.
     * @return the exit code.
     */
    int found(const std::string& command, const std::string& words,
              const nlohmann::ordered_json& members, bool ok = true) const;
    /** Reports that a command was not done. @param status like "USAGE". */
    void failure(const std::string& command, const std::string& status,
                 const std::string& reason) const;
    /** Warns on standard error, in words only. */
    void warn(const std::string& text) const;

    /** Prints an object in one line, of ASCII only: safe for terminals, whatever is in it. */
    static void print(const nlohmann::ordered_json& object);
};
