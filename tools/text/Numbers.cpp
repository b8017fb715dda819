// SPDX-License-Identifier: Apache-2.0
#include "Numbers.h"

#include <cctype>
#include <charconv>
#include <cmath>

namespace cli {
namespace {

/** @return the ms in a unit of time; 0 for another unit. */
double msIn(const std::string& unit) {
    constexpr struct {
        const char* name;
        double ms;
    } kUnits[] = {{"ms", 1}, {"s", 1000}, {"m", 60'000}, {"h", 3'600'000}};
    for (const auto& [name, ms] : kUnits) {
        if (unit == name) return ms;
    }
    return 0;
}

}  // namespace

std::string Numbers::range() const {
    const std::string numbers = std::to_string(least) + " to " + std::to_string(most);
    if (*unit == '%') return numbers + ", or up to 100%";
    return numbers + (*unit == '\0' ? "" : " ") + unit;
}

std::optional<uint32_t> Numbers::parse(const std::string& text) const {
    double number = 0;
    const char* const end = text.data() + text.size();
    const auto read = std::from_chars(text.data(), end, number, std::chars_format::fixed);
    if (text.empty() || isdigit(text[0]) == 0 || read.ec != std::errc()) return {};
    const std::string written(read.ptr, end);
    const bool isTime = msIn(unit) != 0;
    const bool isPercent = written == "%" && written == unit;
    const double factor = isTime            ? msIn(written.empty() ? unit : written)
                          : isPercent       ? most
                          : written.empty() ? 1
                                            : 0;
    // A part of the smallest unit is no number.
    if (factor == 0 || (factor == 1 && text.find('.') != std::string::npos)) return {};
    const double value = std::round(number * factor / (isPercent ? 100 : 1));
    const double scale = isTime ? msIn(unit) : 1;
    if (value < least * scale || value > most * scale) return {};
    return static_cast<uint32_t>(value);
}

}  // namespace cli
