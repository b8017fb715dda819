// SPDX-License-Identifier: Apache-2.0
#include "service/Client.h"

#include "text/Text.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>

namespace vibratorctl {

using nlohmann::ordered_json;

namespace {

/** The service cannot be reached. */
constexpr int kUnreachable = 3;

/** @return the name of a status, like "BAD_VALUE". */
std::string statusName(VibratorStatus status) {
    constexpr const char* kNames[] = {"OK", "UNKNOWN_ERROR", "BAD_VALUE", "UNSUPPORTED_OPERATION"};
    const auto number = static_cast<uint32_t>(status);
    return number < std::size(kNames) ? kNames[number] : std::to_string(number);
}

}  // namespace

Client::Client()
    : Program("vibratorctl", VERSION,
              "Calls the vibrator service, and shows what the driver was told.") {
    constexpr cli::Numbers kTimeouts = {"a time in s", 0, 3600};
    mInstance = shared().text("--instance NAME", "name of the service's instance", "default");
    mTimeout = shared().number("--timeout SECONDS", kTimeouts,
                               "the longest that a call may take; 0: no limit", 10);
    mJson = shared().flag("--json", "print each answer as a line of JSON");
    mVerbose = shared().flag("-v,--verbose", "also print the interface's operation and its status");
    shared().note("Exit code: 0 done; 1 the service refused, doctor found a problem, or the output "
                  "could not be written; 2 a mistake in the command line or in a file; 3 the "
                  "service cannot be reached.")
            .note("Only root and uid 1000 (system) may make the calls under \"For root and "
                  "system\".")
            .note("\"vibratorctl help COMMAND\" shows a command's options and an example.");
}

int Client::perform(const cli::Command& command) {
    setCallTimeout(*mTimeout);
    try {
        return Program::perform(command);
    } catch (const Unreachable& error) {
        complain("UNREACHABLE", std::string("the service cannot be reached: ") + error.what() +
                                        "; \"vibratorctl doctor\" says what to do");
        return kUnreachable;
    }
}

int Client::answer(const Operation& operation, VibratorStatus status, Answer answer) const {
    const bool ok = status == VibratorStatus::OK;
    if (mStep != nullptr) {
        answer.argument = mStep->argument();
        answer.members.update(mStep->place());
    }
    ordered_json members;
    std::string words = performed();
    if (!answer.argument.empty()) {
        members["argument"] = answer.argument;
        words += " " + answer.argument;
    }
    members.update({{"operation", operation.name}, {"ok", ok}, {"status", statusName(status)}});
    words += ": ";
    if (ok) {
        words += "OK" + (answer.words.empty() ? "" : ", " + answer.words);
    } else {
        members["reason"] = answer.reason.empty() ? reasonOf(operation, status) : answer.reason;
        words += members["reason"].get<std::string>();
    }
    if (isVerbose()) words += " [" + operation.name + ": " + statusName(status) + "]";
    members.update(answer.members);
    return print(ok ? std::cout : std::cerr, words + "\n", members);
}

int Client::found(const std::string& words, const ordered_json& members, bool ok) const {
    ordered_json all = {{"ok", ok}};
    all.update(members);
    return print(std::cout, words, all);
}

void Client::complain(const std::string& status, const std::string& reason) const {
    Program::complain(status, reason);
    if (isJson()) print(std::cout, "", {{"ok", false}, {"status", status}, {"reason", reason}});
}

int Client::print(std::ostream& stream, const std::string& words,
                  const ordered_json& members) const {
    ordered_json object = {{"command", nullptr}};
    if (!performed().empty()) object["command"] = performed();
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

std::string readInput(const std::string& name) {
    constexpr size_t kMost = 64 << 20;
    errno = 0;
    std::ifstream file(name);
    std::istream& input = name == "-" ? std::cin : file;
    std::string text;
    char block[65536];
    while (text.size() <= kMost && (input.read(block, sizeof(block)) || input.gcount() > 0))
        text.append(block, static_cast<size_t>(input.gcount()));
    if (text.size() > kMost) throw cli::UsageError(name + ": more than 64 MiB");
    if (input.bad() || (name != "-" && !file.is_open())) {
        throw cli::UsageError(name + ": cannot be read: " + strerror(errno != 0 ? errno : EIO));
    }
    return text;
}

}  // namespace vibratorctl
