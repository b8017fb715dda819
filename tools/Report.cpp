// SPDX-License-Identifier: Apache-2.0
#include "Report.h"

#include "cli/Text.h"

#include <unistd.h>

#include <iostream>

using nlohmann::ordered_json;

std::string statusName(VibratorStatus status) {
    constexpr const char* kNames[] = {"OK", "UNKNOWN_ERROR", "BAD_VALUE", "UNSUPPORTED_OPERATION"};
    const auto number = static_cast<uint32_t>(status);
    return number < std::size(kNames) ? kNames[number] : std::to_string(number);
}

bool mayCallRestricted() {
    return getuid() == 0 || getuid() == 1000;
}

std::string notPermitted() {
    return "not permitted: only root and uid 1000 (system) may do this, not uid " +
           std::to_string(getuid());
}

int Report::answer(const Call& call, VibratorStatus status, const Details& details,
                   const std::string& reason) const {
    const bool ok = status == VibratorStatus::OK;
    if (isJson) {
        ordered_json object = {{"command", call.command}};
        if (!call.argument.empty()) object["argument"] = call.argument;
        object.update({{"operation", call.operation}, {"ok", ok}, {"status", statusName(status)}});
        if (!ok) object["reason"] = reason;
        object.update(details.members);
        print(object);
        return ok ? kSuccess : kRefused;
    }
    std::string line = call.command + (call.argument.empty() ? "" : " ") + call.argument + ": ";
    if (ok) {
        line += "OK" + (details.words.empty() ? "" : ", " + details.words);
    } else {
        line += reason;
    }
    if (isVerbose) line += std::string(" [") + call.operation + ": " + statusName(status) + "]";
    (ok ? std::cout : std::cerr) << cli::printable(line) << '\n';
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
    if (isJson) {
        ordered_json object = {{"command", nullptr}};
        if (!command.empty()) object["command"] = command;
        object.update({{"ok", false}, {"status", status}, {"reason", reason}});
        print(object);
    } else {
        warn((command.empty() ? "" : command + ": ") + reason);
    }
}

void Report::warn(const std::string& text) const {
    if (!isJson) std::cerr << "vibratorctl: " << cli::printable(text) << '\n';
}

void Report::print(const ordered_json& object) {
    std::cout << object.dump(-1, ' ', true, ordered_json::error_handler_t::replace) << '\n';
}
