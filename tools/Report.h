// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hardware/vibrator/1.0/types.h>
#include <hidl/Status.h>

#include <nlohmann/json.hpp>
#include <string>

using VibratorStatus = ::android::hardware::vibrator::V1_0::Status;

/** Exit codes of vibratorctl. */
enum ExitCode {
    kSuccess = 0,
    /** The service answered that it did not do it. */
    kRefused = 1,
    /** The command line, or a file it names, makes no sense. */
    kUsage = 2,
    /** The service could not be reached. */
    kUnreachable = 3,
};

/** @return the name of a status, like "BAD_VALUE". */
std::string statusName(VibratorStatus status);

/** What is known of a call before it is made, to explain its answer. */
struct Call {
    /** The operation as the interface names it. */
    const char* operation;
    /** The range of its argument in words; nullptr where it has none. */
    const char* range = nullptr;
    /** Whether only the system user and root may call it. */
    bool restricted = false;
};

/** Tells the user what came of a call, in words or as JSON. */
class Report {
  public:
    explicit Report(bool json) : mJson(json) {}

    /** Reports the answer to a call, with further results. @return the exit code. */
    int answer(const Call& call, VibratorStatus status, const nlohmann::ordered_json& more = {});
    /** Reports a call that did not reach the service. @return the exit code. */
    int unreachable(const std::string& operation, const std::string& why);
    /** Reports results that have no status, in words as "name: value" lines. */
    int values(const nlohmann::ordered_json& values);
    /** Says something that is no result, unless the output is for a script. */
    void note(const std::string& text) const;

  private:
    void print(const nlohmann::ordered_json& values) const;

    bool mJson;
};
