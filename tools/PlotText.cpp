// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace {

constexpr long kRows = 5;
constexpr long kEighths = 8;
/** Width of what stands left of the strip. */
constexpr size_t kMargin = 6;

/** @return the strongest that the motor was in a span. */
double strengthIn(const Timeline& timeline, double start, double end) {
    double strongest = 0;
    for (const Timeline::Segment& segment : timeline.segments) {
        if (segment.start < end && segment.end > start) {
            strongest = std::max(strongest, segment.strength);
        }
    }
    return strongest;
}

}  // namespace

std::string plotText(const Timeline& timeline, size_t columns) {
    constexpr const char* kBlocks[] = {" ", "▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"};
    const size_t width = std::max<size_t>(columns, kMargin + 20) - kMargin;
    const double length = std::max(timeline.length, 0.001);
    const double perColumn = length / static_cast<double>(width);

    std::string text;
    char line[160];
    for (long row = kRows - 1; row >= 0; --row) {
        snprintf(line, sizeof(line), "%3ld %% ", (row + 1) * 100 / kRows);
        text += line;
        for (size_t column = 0; column < width; ++column) {
            const double start = static_cast<double>(column) * perColumn;
            const double strength = strengthIn(timeline, start, start + perColumn);
            const long eighths = std::lround(strength * double{kRows * kEighths}) - row * kEighths;
            text += kBlocks[std::clamp<long>(eighths, 0, kEighths)];
        }
        text += '\n';
    }
    std::string axis(width, '-');
    for (const Timeline::Mark& mark : timeline.marks) {
        axis[std::min(width - 1, static_cast<size_t>(mark.time / perColumn))] = '|';
    }
    snprintf(line, sizeof(line), "      0%*.3f s\n", static_cast<int>(width - 3), length);
    text += std::string(kMargin, ' ') + axis + '\n' + line + '\n';
    for (const Timeline::Mark& mark : timeline.marks) {
        snprintf(line, sizeof(line), "%10.3f s  %s\n", mark.time, mark.label.c_str());
        text += line;
    }
    return text;
}
