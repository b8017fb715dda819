// SPDX-License-Identifier: Apache-2.0
#include "Patterns.h"

#include "cli/CommandLine.h"
#include "text/Text.h"

#include <sstream>

namespace driver {

Patterns parsePatterns(const std::string& text, const std::string& file) {
    Patterns patterns;
    std::istringstream lines(text);
    size_t number = 1;
    for (std::string line; std::getline(lines, line); ++number) {
        std::istringstream words(line.substr(0, line.find('#')));
        if (line[0] == '[') patterns.emplace_back();
        for (std::string word; line[0] != '[' && words >> word;) {
            model::Packet packet{};
            int end = 0;
            sscanf(word.c_str(), "%9d,%9d,%9d,%9d%n", &packet.param0, &packet.intensity,
                   &packet.param2, &packet.param3, &end);
            if (end != static_cast<int>(word.size()) || patterns.empty()) {
                throw cli::UsageError(
                        cli::inQuotes(file) + ": line " + std::to_string(number) + ": " +
                        cli::inQuotes(word) +
                        " is not a packet of a pattern, PARAM0,INTENSITY,PARAM2,PARAM3");
            }
            patterns.back().push_back(packet);
        }
    }
    if (patterns.empty())
        throw cli::UsageError(cli::inQuotes(file) + ": there is no pattern in it");
    return patterns;
}

}  // namespace driver
