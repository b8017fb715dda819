// SPDX-License-Identifier: Apache-2.0
#include "Packets.h"

#include "cli/Text.h"

#include <algorithm>
#include <charconv>
#include <cstdint>
#include <nlohmann/json.hpp>
#include <string_view>

namespace {

using nlohmann::json;

constexpr const char* kFields[] = {"param0", "intensity", "param2", "param3"};

std::string_view trimmed(std::string_view text) {
    constexpr std::string_view kBlanks = " \t\r";
    const size_t start = text.find_first_not_of(kBlanks);
    if (start == std::string_view::npos) return {};
    return text.substr(start, text.find_last_not_of(kBlanks) - start + 1);
}

bool parseNumber(std::string_view word, int32_t* number, std::string* error) {
    word = trimmed(word);
    const auto [end, status] = std::from_chars(word.data(), word.data() + word.size(), *number);
    if (status == std::errc() && end == word.data() + word.size()) return true;
    *error = cli::inQuotes(word) + " is no whole number of 32 bits";
    return false;
}

void append(const int32_t (&values)[4], HapticEnginePackets* packets) {
    packets->push_back({values[0], values[1], values[2], values[3]});
}

bool parseCsv(const std::string& text, HapticEnginePackets* packets, std::string* error) {
    size_t start = 0;
    for (int line = 1; start < text.size(); ++line) {
        const size_t end = std::min(text.find('\n', start), text.size());
        const std::string_view content = trimmed(std::string_view(text).substr(start, end - start));
        start = end + 1;
        if (content.empty() || content.front() == '#') continue;
        if (!parsePacket(std::string(content), packets, error)) {
            *error = "line " + std::to_string(line) + ": " + *error;
            return false;
        }
    }
    return true;
}

/** @return the four values' place in an element: a list of four, or an object of four members. */
const json* field(const json& element, size_t index) {
    if (element.is_array()) return element.size() == 4 ? &element[index] : nullptr;
    if (!element.is_object() || element.size() != 4) return nullptr;
    const auto member = element.find(kFields[index]);
    return member == element.end() ? nullptr : &*member;
}

bool isInt32(const json& value) {
    if (!value.is_number_integer()) return false;
    if (value.is_number_unsigned()) return value.get<uint64_t>() <= INT32_MAX;
    return value.get<int64_t>() >= INT32_MIN && value.get<int64_t>() <= INT32_MAX;
}

bool parseJson(const std::string& text, HapticEnginePackets* packets, std::string* error) {
    const json list = json::parse(text, nullptr, false);
    if (!list.is_array()) {
        *error = "no JSON list";
        return false;
    }
    for (size_t i = 0; i < list.size(); ++i) {
        int32_t values[4];
        for (size_t k = 0; k < 4; ++k) {
            const json* value = field(list[i], k);
            if (value == nullptr || !isInt32(*value)) {
                *error = "packet " + std::to_string(i + 1) +
                         ": not four whole numbers of 32 bits, in a list or as param0, intensity, "
                         "param2 and param3";
                return false;
            }
            values[k] = value->get<int32_t>();
        }
        append(values, packets);
    }
    return true;
}

}  // namespace

bool parsePacket(const std::string& text, HapticEnginePackets* packets, std::string* error) {
    int32_t values[4];
    std::string_view rest = text;
    for (size_t i = 0; i < 4; ++i) {
        const size_t comma = rest.find(',');
        if ((comma == std::string_view::npos) != (i == 3)) {
            *error = cli::inQuotes(text) + " is not PARAM0,INTENSITY,PARAM2,PARAM3";
            return false;
        }
        if (!parseNumber(rest.substr(0, comma), &values[i], error)) return false;
        if (i < 3) rest.remove_prefix(comma + 1);
    }
    append(values, packets);
    return true;
}

bool parsePackets(const std::string& text, HapticEnginePackets* packets, std::string* error) {
    const size_t first = text.find_first_not_of(" \t\r\n");
    const bool isJson = first != std::string::npos && (text[first] == '[' || text[first] == '{');
    return isJson ? parseJson(text, packets, error) : parseCsv(text, packets, error);
}
