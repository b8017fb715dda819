// SPDX-License-Identifier: Apache-2.0
#include "Report.h"

#include "cli/Text.h"

#include <unistd.h>

#include <iostream>

using nlohmann::ordered_json;

namespace {

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
    ordered_json members = {{"argument", answer.argument},
                            {"operation", operation.name},
                            {"ok", ok},
                            {"status", statusName(status)}};
    if (answer.argument.empty()) members.erase("argument");
    std::string words = command + (answer.argument.empty() ? "" : " ") + answer.argument + ": ";
    if (ok) {
        words += "OK" + (answer.words.empty() ? "" : ", " + answer.words);
    } else {
        members["reason"] = answer.reason.empty() ? reasonOf(operation, status) : answer.reason;
        words += members["reason"].get<std::string>();
    }
    if (isVerbose) words += " [" + operation.name + ": " + statusName(status) + "]";
    members.update(answer.members);
    return print(ok ? std::cout : std::cerr, command, words + "\n", members);
}

int Report::found(const std::string& command, const std::string& words, const ordered_json& members,
                  bool ok) const {
    ordered_json all = {{"ok", ok}};
    all.update(members);
    return print(std::cout, command, words, all);
}

int Report::print(std::ostream& stream, const std::string& command, const std::string& words,
                  const ordered_json& members) const {
    ordered_json object = {{"command", nullptr}};
    if (!command.empty()) object["command"] = command;
    object.update(members);
    if (isJson) {
        // One line of ASCII, which is safe for terminals.
        std::cout << object.dump(-1, ' ', true, ordered_json::error_handler_t::replace) << '\n';
    } else {
        stream << cli::printableLines(words);
    }
    return object["ok"] ? kSuccess : kRefused;
}

void Report::failure(const std::string& command, const std::string& status,
                     const std::string& reason) const {
    const std::string start = "vibratorctl: " + (command.empty() ? "" : command + ": ");
    print(std::cerr, command, start + cli::printable(reason) + "\n",
          {{"ok", false}, {"status", status}, {"reason", reason}});
}

void Report::warn(const std::string& text) const {
    if (!isJson) std::cerr << "vibratorctl: " << cli::printable(text) << '\n';
}
