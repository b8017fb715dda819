// SPDX-License-Identifier: Apache-2.0
#include "scores/Packets.h"

#include "cli/CommandLine.h"
#include "text/Text.h"

#include <algorithm>
#include <charconv>
#include <nlohmann/json.hpp>
#include <optional>
#include <sstream>

namespace vibratorctl {

namespace {

using nlohmann::json;

constexpr const char* kFields[] = {"param0", "intensity", "param2", "param3"};

std::string_view trimmed(std::string_view text) {
    constexpr std::string_view kBlanks = " \t\r";
    const size_t start = text.find_first_not_of(kBlanks);
    if (start == std::string_view::npos) return {};
    return text.substr(start, text.find_last_not_of(kBlanks) - start + 1);
}

Packets parseCsv(const std::string& text) {
    Packets packets;
    std::istringstream lines(text);
    std::string line;
    for (int number = 1; std::getline(lines, line); ++number) {
        const std::string content(trimmed(line));
        if (content.empty() || content.front() == '#') continue;
        try {
            packets.push_back(parsePacket(content));
        } catch (const cli::UsageError& error) {
            throw cli::UsageError("line " + std::to_string(number) + ": " + error.what());
        }
    }
    return packets;
}

/** @return the number of 32 bits that an element has, by its index or by a name. */
std::optional<int32_t> numberOf(const json& element, size_t index) {
    if (element.size() != 4) return std::nullopt;
    json value;
    if (element.is_array()) value = element[index];
    if (element.is_object()) value = element.value(kFields[index], json());
    if (!value.is_number_integer()) return std::nullopt;
    const auto number = value.get<double>();
    if (number < INT32_MIN || number > INT32_MAX) return std::nullopt;
    return static_cast<int32_t>(number);
}

Packets parseJson(const std::string& text) {
    const json list = json::parse(text, nullptr, false);
    if (!list.is_array()) throw cli::UsageError("no JSON list");
    Packets packets;
    for (const json& element : list) {
        int32_t values[4];
        for (size_t i = 0; i < 4; ++i) {
            const auto number = numberOf(element, i);
            if (!number) {
                throw cli::UsageError(
                        "packet " + std::to_string(packets.size() + 1) +
                        ": not four whole numbers of 32 bits, in a list or as param0, intensity, "
                        "param2 and param3");
            }
            values[i] = *number;
        }
        packets.push_back({values[0], values[1], values[2], values[3]});
    }
    return packets;
}

}  // namespace

Packet parsePacket(const std::string& text) {
    if (std::count(text.begin(), text.end(), ',') != 3)
        throw cli::UsageError(cli::inQuotes(text) + " is not PARAM0,INTENSITY,PARAM2,PARAM3");
    int32_t values[4];
    std::string_view rest = text;
    for (int32_t& value : values) {
        const std::string_view word = trimmed(rest.substr(0, rest.find(',')));
        rest.remove_prefix(std::min(rest.find(',') + 1, rest.size()));
        const char* const end = word.data() + word.size();
        const auto [number, status] = std::from_chars(word.data(), end, value);
        if (status != std::errc() || number != end)
            throw cli::UsageError(cli::inQuotes(word) + " is no whole number of 32 bits");
    }
    return {values[0], values[1], values[2], values[3]};
}

Packets parsePackets(const std::string& text) {
    const size_t first = text.find_first_not_of(" \t\r\n");
    const bool isJson = first != std::string::npos && (text[first] == '[' || text[first] == '{');
    return isJson ? parseJson(text) : parseCsv(text);
}

}  // namespace vibratorctl
