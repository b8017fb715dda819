// SPDX-License-Identifier: Apache-2.0
#include "Report.h"

#include "cli/Text.h"

#include <unistd.h>

#include <iostream>

using nlohmann::ordered_json;

namespace {

/** Prints an object in one line, of ASCII only: safe for terminals, whatever is in it. */
void print(const ordered_json& object) {
    std::cout << object.dump(-1, ' ', true, ordered_json::error_handler_t::replace) << '\n';
}

/** @return the name of a status, like "BAD_VALUE". */
std::string statusName(VibratorStatus status) {
    constexpr const char* kNames[] = {"OK", "UNKNOWN_ERROR", "BAD_VALUE", "UNSUPPORTED_OPERATION"};
    const auto number = static_cast<uint32_t>(status);
    return number < std::size(kNames) ? kNames[number] : std::to_string(number);
}

}  // namespace

bool mayCallRestricted() {
    return getuid() == 0 || getuid() == 1000;
}

std::string notPermitted() {
    return "not permitted: only root and uid 1000 (system) may do this, not uid " +
           std::to_string(getuid());
}

int Report::answer(const std::string& command, const Operation& operation, VibratorStatus status,
                   const Answer& answer) const {
    const bool ok = status == VibratorStatus::OK;
    const std::string reason =
            ok || !answer.reason.empty() ? answer.reason : reasonOf(operation, status);
    if (isJson) {
        ordered_json object = {{"command", command}};
        if (!answer.argument.empty()) object["argument"] = answer.argument;
        object.update({{"operation", operation.name}, {"ok", ok}, {"status", statusName(status)}});
        if (!ok) object["reason"] = reason;
        object.update(answer.members);
        print(object);
    } else {
        const std::string ending =
                isVerbose ? " [" + operation.name + ": " + statusName(status) + "]" : "";
        (ok ? std::cout : std::cerr)
                << cli::printable(command + (answer.argument.empty() ? "" : " ") + answer.argument +
                                  ": " + (ok ? "OK" : reason) +
                                  (ok && !answer.words.empty() ? ", " + answer.words : "") + ending)
                << '\n';
    }
    return ok ? kSuccess : kRefused;
}

int Report::found(const std::string& command, const std::string& words, const ordered_json& members,
                  bool ok) const {
    if (isJson) {
        ordered_json object = {{"command", command}, {"ok", ok}};
        object.update(members);
        print(object);
    } else {
        std::cout << cli::printableLines(words);
    }
    return ok ? kSuccess : kRefused;
}

void Report::failure(const std::string& command, const std::string& status,
                     const std::string& reason) const {
    if (!isJson) return warn((command.empty() ? "" : command + ": ") + reason);
    ordered_json object = {{"command", nullptr}};
    if (!command.empty()) object["command"] = command;
    object.update({{"ok", false}, {"status", status}, {"reason", reason}});
    print(object);
}

void Report::warn(const std::string& text) const {
    if (!isJson) std::cerr << "vibratorctl: " << cli::printable(text) << '\n';
}
