// SPDX-License-Identifier: Apache-2.0
#include "Report.h"

#include "text/Text.h"

#include <iostream>

using nlohmann::ordered_json;

namespace vibratorctl {

ordered_json asJson(const LocalDriver::Motor& motor) {
    return {{"name", motor.name}, {"number", motor.number}, {"found", motor.found}};
}

int Report::answer(const Operation& operation, VibratorStatus status, Answer answer) const {
    const bool ok = status == VibratorStatus::OK;
    if (!mSubject.argument.empty()) answer.argument = mSubject.argument;
    ordered_json members;
    if (!answer.argument.empty()) members["argument"] = answer.argument;
    members.update({{"operation", operation.name}, {"ok", ok}, {"status", toString(status)}});
    members.update(answer.members);
    const std::string subject =
            mSubject.name + (answer.argument.empty() ? "" : " " + answer.argument);
    std::string words = subject + ": ";
    if (!ok) {
        members["reason"] =
                answer.reason.empty() ? reasonOf(operation, status, mService()) : answer.reason;
        words += members["reason"].get<std::string>();
    } else {
        words += "OK" + (answer.words.empty() ? "" : ", " + answer.words);
        if (!answer.warning.empty()) members["warning"] = answer.warning;
        if (!answer.warning.empty() && !isJson()) {
            std::cerr << cli::printable(subject + ": warning: " + answer.warning) << '\n';
        }
    }
    if (isVerbose()) words += " [" + operation.name + ": " + toString(status) + "]";
    members.update(mSubject.members);
    return print(ok ? std::cout : std::cerr, words + "\n", members);
}

int Report::found(const std::string& words, const ordered_json& members, bool ok) const {
    ordered_json all = {{"ok", ok}};
    all.update(members);
    all.update(mSubject.members);
    return print(std::cout, words, all);
}

int Report::print(std::ostream& stream, const std::string& words,
                  const ordered_json& members) const {
    ordered_json object = {{"command", nullptr}};
    if (!mSubject.name.empty()) object["command"] = mSubject.name;
    object.update(members);
    // One line of ASCII, which is safe for terminals.
    constexpr auto kReplace = ordered_json::error_handler_t::replace;
    if (isJson()) {
        std::cout << object.dump(-1, ' ', true, kReplace) << '\n';
    } else {
        stream << cli::printable(words, true);
    }
    return object["ok"] ? cli::kSuccess : cli::kFailed;
}

}  // namespace vibratorctl
