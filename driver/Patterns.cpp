// SPDX-License-Identifier: Apache-2.0
#include "Patterns.h"

#include "cli/CommandLine.h"
#include "text/Text.h"

#include <algorithm>
#include <sstream>

namespace driver {

Segment segmentOf(const model::Packet& packet) {
    return {static_cast<uint32_t>(std::max(packet.param0, 0)),
            static_cast<uint32_t>(std::clamp(packet.intensity, 0, kFullStrength))};
}

std::vector<std::vector<Segment>> parsePatterns(const std::string& text) {
    std::vector<std::vector<Segment>> patterns;
    std::istringstream lines(text);
    size_t number = 1;
    for (std::string line; std::getline(lines, line); ++number) {
        std::istringstream words(line.substr(0, line.find('#')));
        if (line[0] == '[') patterns.emplace_back();
        for (std::string word; line[0] != '[' && words >> word;) {
            model::Packet packet{};
            int end = 0;
            sscanf(word.c_str(), "%d,%d,%d,%d%n", &packet.param0, &packet.intensity, &packet.param2,
                   &packet.param3, &end);
            if (end != static_cast<int>(word.size()) || patterns.empty()) {
                throw cli::UsageError(
                        "line " + std::to_string(number) + ": " + cli::inQuotes(word) +
                        " is not a packet of a pattern, PARAM0,INTENSITY,PARAM2,PARAM3");
            }
            patterns.back().push_back(segmentOf(packet));
        }
    }
    if (patterns.empty()) throw cli::UsageError("there is no pattern in it");
    return patterns;
}

}  // namespace driver
