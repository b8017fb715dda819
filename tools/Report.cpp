// SPDX-License-Identifier: Apache-2.0
#include "Report.h"

#include <unistd.h>

#include <iostream>

namespace {

using nlohmann::ordered_json;

/** uids that may call the restricted operations: root and Android's system user. */
bool mayCallRestricted(uid_t uid) {
    return uid == 0 || uid == 1000;
}

std::string explain(const Call& call, VibratorStatus status) {
    if (call.restricted && !mayCallRestricted(getuid())) {
        return "the caller is not permitted: uid " + std::to_string(getuid()) +
               " is neither 0 (root) nor 1000 (system)";
    }
    switch (status) {
        case VibratorStatus::BAD_VALUE:
            return std::string("out of range") +
                   (call.range != nullptr ? std::string(": ") + call.range : "");
        case VibratorStatus::UNSUPPORTED_OPERATION:
            return "not supported here and now";
        default:
            return "the driver has not taken it; the service's log says why";
    }
}

std::string inWords(const ordered_json& value) {
    if (value.is_boolean()) return value.get<bool>() ? "yes" : "no";
    if (value.is_string()) return value.get<std::string>();
    if (!value.is_array()) return value.dump();
    std::string words;
    for (const auto& element : value)
        words += (words.empty() ? "" : " ") + inWords(element);
    return words.empty() ? "none" : words;
}

}  // namespace

std::string statusName(VibratorStatus status) {
    constexpr const char* kNames[] = {"OK", "UNKNOWN_ERROR", "BAD_VALUE", "UNSUPPORTED_OPERATION"};
    const auto number = static_cast<uint32_t>(status);
    return number < std::size(kNames) ? kNames[number] : std::to_string(number);
}

int Report::answer(const Call& call, VibratorStatus status, const ordered_json& more) {
    ordered_json values = {{"operation", call.operation}, {"status", statusName(status)}};
    if (status == VibratorStatus::OK && !more.is_null()) values.update(more);
    const std::string reason = status == VibratorStatus::OK ? "" : explain(call, status);
    if (mJson) {
        if (!reason.empty()) values["reason"] = reason;
        print(values);
    } else if (reason.empty()) {
        std::cout << call.operation << ": " << statusName(status) << '\n';
        if (!more.is_null()) print(more);
    } else {
        std::cerr << call.operation << ": " << statusName(status) << ": " << reason << '\n';
    }
    return status == VibratorStatus::OK ? kSuccess : kRefused;
}

int Report::unreachable(const std::string& operation, const std::string& why) {
    if (mJson) {
        print({{"operation", operation}, {"error", why}});
    } else {
        std::cerr << "vibratorctl: the service cannot be reached: " << why << '\n';
    }
    return kUnreachable;
}

int Report::values(const ordered_json& values) {
    print(values);
    return kSuccess;
}

void Report::note(const std::string& text) const {
    if (!mJson) std::cerr << text << '\n';
}

void Report::print(const ordered_json& values) const {
    if (mJson) {
        std::cout << values.dump(2) << '\n';
        return;
    }
    for (const auto& [name, value] : values.items()) {
        std::cout << name << ": " << inWords(value) << '\n';
    }
}
