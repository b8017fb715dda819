// SPDX-License-Identifier: Apache-2.0
#include "traffic/TextPlot.h"
#include "text/Text.h"

#include <algorithm>
#include <cmath>
#include <cstdio>

namespace vibratorctl {

namespace {

constexpr long kRows = 5;
constexpr long kEighths = 8;
/** Width of the column to the left of the strip. */
constexpr size_t kMargin = 6;
/** The most calls that are listed. */
constexpr size_t kMaxCalls = 40;
/** Tolerance of times, as a part of a column. */
constexpr double kInexact = 1e-6;

/** @return the greatest strength that the motor was told in each column. */
std::vector<double> strengths(const Timeline& timeline, size_t width, double perColumn) {
    std::vector<double> columns(width);
    for (const Timeline::Segment& segment : timeline.segments) {
        const double first = (segment.start - timeline.start) / perColumn + kInexact;
        const double last = std::ceil((segment.end - timeline.start) / perColumn - kInexact);
        for (auto i = static_cast<size_t>(first); i < width && static_cast<double>(i) < last; ++i)
            columns[i] = std::max(columns[i], segment.strength);
    }
    return columns;
}

/** @return the axis, with the numbers of the calls where there is room for them, and else a tick.
 */
std::string axisOf(const Timeline& timeline, size_t width, double perColumn) {
    std::string axis(width, '-');
    size_t free = 0;
    for (size_t i = 0; i < timeline.marks.size(); ++i) {
        const double place = (timeline.marks[i].time - timeline.start) / perColumn + kInexact;
        const size_t column = std::min(width - 1, static_cast<size_t>(place));
        if (column < free) continue;
        std::string mark = std::to_string(i + 1);
        // Numbers that touch would be read as one.
        const bool hasRoom = column == 0 || axis[column - 1] == '-';
        if (i >= kMaxCalls || !hasRoom || column + mark.size() > width) mark = "|";
        axis.replace(column, mark.size(), mark);
        free = column + mark.size();
    }
    return axis;
}

}  // namespace

std::string plotText(const Timeline& timeline, size_t columns, bool isAscii) {
    constexpr const char* kBlocks[] = {" ", "▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"};
    constexpr const char* kAscii[] = {" ", ".", ".", ":", ":", "+", "+", "#", "#"};
    const char* const* const blocks = isAscii ? kAscii : kBlocks;
    const size_t width = std::max<size_t>(columns, kMargin + 20) - kMargin;
    const double length = std::max(timeline.end - timeline.start, 0.001);
    const double perColumn = length / static_cast<double>(width);
    const std::vector<double> strong = strengths(timeline, width, perColumn);
    const bool isBeyond = *std::max_element(strong.begin(), strong.end()) > 1;

    std::string text = plotTitle(timeline) + '\n';
    char line[64];
    for (long row = kRows - 1; row >= 0; --row) {
        snprintf(line, sizeof(line), "%3ld %% ", (row + 1) * 100 / kRows);
        text += line;
        for (size_t i = 0; i < width; ++i) {
            const long eighths = std::lround(strong[i] * double{kRows * kEighths}) - row * kEighths;
            const bool isTop = row == kRows - 1 && strong[i] > 1;
            text += isTop ? "!" : blocks[std::clamp<long>(eighths, 0, kEighths)];
        }
        text += '\n';
    }
    std::string axis = axisOf(timeline, width, perColumn);
    if (timeline.goesOn) axis.back() = '>';
    const std::string from = cli::durationInWords(timeline.start);
    const std::string to = cli::durationInWords(timeline.end);
    const size_t between = width - std::min(width, from.size() + to.size());
    const std::string indent(kMargin, ' ');
    text += indent + axis + '\n' + indent + from + std::string(between, ' ') + to + '\n';
    if (timeline.goesOn) text += indent + "> goes on\n";
    if (isBeyond) text += indent + "! beyond full strength\n";
    if (!plotNote(timeline).empty()) text += indent + plotNote(timeline) + '\n';
    text += '\n';
    for (size_t i = 0; i < timeline.marks.size() && i < kMaxCalls; ++i) {
        snprintf(line, sizeof(line), "%4zu %11s  ", i + 1,
                 cli::durationInWords(timeline.marks[i].time).c_str());
        text += line + timeline.marks[i].label + '\n';
    }
    if (timeline.marks.size() > kMaxCalls) {
        text += "  and " + std::to_string(timeline.marks.size() - kMaxCalls) +
                " more calls; --from, --to and --last show a part\n";
    }
    return text;
}

}  // namespace vibratorctl
