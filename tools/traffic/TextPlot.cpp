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
constexpr size_t kMostCalls = 40;
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

}  // namespace

std::string plotText(const Timeline& timeline, size_t columns) {
    constexpr const char* kBlocks[] = {" ", "▁", "▂", "▃", "▄", "▅", "▆", "▇", "█"};
    const size_t width = std::max<size_t>(columns, kMargin + 20) - kMargin;
    const double length = std::max(timeline.end - timeline.start, 0.001);
    const double perColumn = length / static_cast<double>(width);
    const std::vector<double> strong = strengths(timeline, width, perColumn);
    const auto& segments = timeline.segments;
    const bool isBeyond = std::any_of(segments.begin(), segments.end(),
                                      [](const auto& each) { return each.strength > 1; });

    std::string text = plotTitle(timeline) + '\n';
    char line[64];
    for (long row = kRows - 1; row >= 0; --row) {
        snprintf(line, sizeof(line), "%3ld %% ", (row + 1) * 100 / kRows);
        text += line;
        for (size_t i = 0; i < width; ++i) {
            const long eighths = std::lround(strong[i] * double{kRows * kEighths}) - row * kEighths;
            const bool isTop = row == kRows - 1 && strong[i] > 1;
            text += isTop ? "!" : kBlocks[std::clamp<long>(eighths, 0, kEighths)];
        }
        text += '\n';
    }
    std::string axis(width, '-');
    for (const Timeline::Mark& mark : timeline.marks) {
        const auto column =
                static_cast<size_t>((mark.time - timeline.start) / perColumn + kInexact);
        axis[std::min(width - 1, column)] = '|';
    }
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
    for (size_t i = 0; i < timeline.marks.size() && i < kMostCalls; ++i) {
        snprintf(line, sizeof(line), "%12s  ",
                 cli::durationInWords(timeline.marks[i].time).c_str());
        text += line + timeline.marks[i].label + '\n';
    }
    if (timeline.marks.size() > kMostCalls) {
        text += "  and " + std::to_string(timeline.marks.size() - kMostCalls) +
                " more calls; --from, --to and --last show a part\n";
    }
    return text;
}

}  // namespace vibratorctl
