// SPDX-License-Identifier: Apache-2.0
#include "Duration.h"

#include <cmath>
#include <cstdio>
#include <cstdlib>
#include <cstring>

std::string durationInWords(double seconds) {
    char text[48];
    const long long whole = std::llround(seconds);
    if (std::llround(seconds * 1000) < 1000) {
        snprintf(text, sizeof(text), "%.4g ms", std::round(seconds * 1e4) / 10);
    } else if (whole < 60) {
        snprintf(text, sizeof(text), "%.4g s", std::round(seconds * 1000) / 1000);
    } else if (whole < 3600) {
        snprintf(text, sizeof(text), "%lld:%02lld min", whole / 60, whole % 60);
    } else {
        snprintf(text, sizeof(text), "%lld:%02lld:%02lld h", whole / 3600, whole / 60 % 60,
                 whole % 60);
    }
    return text;
}

std::optional<double> parseDuration(const std::string& text) {
    constexpr struct {
        const char* unit;
        double seconds;
    } kUnits[] = {{"ms", 0.001}, {"s", 1}, {"m", 60}, {"h", 3600}};
    const size_t digits = strspn(text.c_str(), "0123456789.");
    char* end = nullptr;
    const std::string written = text.substr(0, digits);
    const double number = strtod(written.c_str(), &end);
    if (digits == 0 || *end != '\0' || !(number < 1e9)) return std::nullopt;
    for (const auto& [unit, seconds] : kUnits) {
        if (text.substr(digits) == unit) return number * seconds;
    }
    return std::nullopt;
}
