// SPDX-License-Identifier: Apache-2.0
#include "traffic/Picture.h"
#include "PlotScript.h"
#include "text/Text.h"

#include <sys/wait.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <iomanip>
#include <iterator>
#include <memory>
#include <regex>
#include <sstream>
#include <stdexcept>

namespace vibratorctl {

namespace {

/** The width that the time takes up, in pixels. */
constexpr int kColumns = 796;

using Bars = std::vector<Timeline::Segment>;

/** Adds a bar; bars narrower than a pixel are merged with their neighbours in it. */
void add(Timeline::Segment bar, double pixel, Bars* bars) {
    bar.end = std::max(bar.end, bar.start + pixel);
    if (!bars->empty() && bar.end <= bars->back().start + 2 * pixel) {
        bars->back().end = std::max(bar.end, bars->back().end);
        bars->back().strength = std::max(bar.strength, bars->back().strength);
    } else {
        bars->push_back(bar);
    }
}

/** @return the label of calls that stand close together; a setting does not stand first. */
std::string labelOf(std::vector<Timeline::Mark> marks) {
    constexpr size_t kMaxLength = 22;
    const auto first = std::find_if(marks.begin(), marks.end(),
                                    [](const auto& mark) { return !mark.isSetting; });
    if (first != marks.end()) std::rotate(marks.begin(), first, first + 1);
    std::string label = marks[0].label;
    for (size_t i = 1; i < marks.size(); ++i) {
        if (label.size() + marks[i].label.size() + 2 > kMaxLength)
            return label + " +" + std::to_string(marks.size() - i);
        label += ", " + marks[i].label;
    }
    return label;
}

std::string runGnuplot(const std::string& script) {
    // Files without names, which are gone when they are closed.
    using File = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;
    const File input(tmpfile(), fclose);
    const File complaints(tmpfile(), fclose);
    if (input == nullptr || complaints == nullptr || fputs(script.c_str(), input.get()) < 0 ||
        fflush(input.get()) != 0) {
        throw std::runtime_error(std::string("no room for the plot: ") + strerror(errno));
    }
    const auto nameOf = [](const File& file) {
        return "/dev/fd/" + std::to_string(fileno(file.get()));
    };
    // --default-settings: without the user's own settings.
    const std::string command = "exec timeout -v 30 gnuplot --default-settings " + nameOf(input) +
                                " 2>" + nameOf(complaints);
    std::FILE* output = popen(command.c_str(), "re");
    if (output == nullptr) throw std::runtime_error("gnuplot cannot be started");
    std::string picture;
    char part[65536];
    for (size_t size; (size = fread(part, 1, sizeof(part), output)) > 0;)
        picture.append(part, size);
    const int status = pclose(output);
    if (status == 0 && !picture.empty()) return picture;
    if (WEXITSTATUS(status) == 127) {
        throw std::runtime_error(
                "gnuplot is not installed; install the package gnuplot-nox, or leave out -o for a "
                "plot in text");
    }
    std::string complaint(200, '\0');
    complaint.resize(fread(complaint.data(), 1, complaint.size(), complaints.get()));
    throw std::runtime_error("gnuplot failed: " + cli::printable(complaint));
}

/** Gives an SVG a title, a description, and dark colours for readers who prefer them. */
std::string described(const Timeline& timeline, std::string svg) {
    constexpr size_t kMaxCalls = 20;
    std::string calls;
    for (size_t i = 0; i < timeline.marks.size() && i < kMaxCalls; ++i) {
        calls += (i == 0 ? ": " : "; ") + timeline.marks[i].label + " at " +
                 cli::durationInWords(timeline.marks[i].time);
    }
    calls += timeline.marks.size() > kMaxCalls ? "; and more." : ".";
    const std::string note = plotNote(timeline);
    const std::string head = "<title>" + plotTitle(timeline) +
                             "</title>\n<desc>Strength over time" + calls +
                             (note.empty() ? "" : " ") + note +
                             "</desc>\n<style>@media (prefers-color-scheme: dark) "
                             "{ svg { filter: invert(1) hue-rotate(180deg) } }</style>";
    svg = std::regex_replace(svg, std::regex("<title>[^<]*</title>\\s*<desc>[^<]*</desc>"), head);
    // Names without a meaning, which screen readers would read out.
    return std::regex_replace(svg, std::regex("<title>gnuplot_plot_[^<]*</title>"), "");
}

}  // namespace

std::string plotScript(const Timeline& timeline, PictureFormat format) {
    // A little longer, so that the end is not on the frame.
    const double length = std::max((timeline.end - timeline.start) * 1.01, 0.001);
    const double pixel = length / kColumns;
    const auto percentOf = [](double strength) { return std::min(1.0, strength) * 100; };
    Bars layers[4];
    for (const Timeline::Segment& segment : timeline.segments) {
        add(segment, pixel, &layers[segment.kind]);
        if (segment.strength > 1) add(segment, pixel, &layers[3]);
    }
    std::ostringstream out;
    out << std::setprecision(9) << "terminal = '"
        << (format == PictureFormat::kSvg ? "svg" : "pngcairo fontscale 0.75") << "'\ntitle = '"
        << plotTitle(timeline) << "'\nnote = '" << plotNote(timeline)
        << "'\nstart = " << timeline.start << "\nlength = " << length << "\ncolumns = " << kColumns
        << "\ngoing_on = " << (timeline.goesOn ? percentOf(timeline.segments.back().strength) : -1)
        << "\n$calls << END\n";
    double last = timeline.start - length;
    for (const Timeline::Mark& mark : timeline.marks) {
        if (mark.time - last <= 3 * pixel) continue;
        last = mark.time;
        out << last << '\n';
    }
    out << "END\n$labels << END\n";
    // Labels that would overlap are merged into one.
    constexpr double kLineHeight = 21;
    const auto& marks = timeline.marks;
    for (auto first = marks.begin(), end = first; first != marks.end(); first = end) {
        while (end != marks.end() && end->time - first->time <= kLineHeight * pixel)
            ++end;
        out << first->time << ' ' << labelOf({first, end}) << '\n';
    }
    out << "END\n";
    const char* const names[] = {"$run", "$packet", "$pattern", "$beyond"};
    for (size_t i = 0; i < std::size(layers); ++i) {
        out << names[i] << " << END\n";
        for (const auto& [start, end, strength, kind] : layers[i]) {
            // A thin gap separates neighbouring bars.
            const double gap = end - start > 4 * pixel ? pixel / 2 : 0;
            out << start << ' ' << end - gap << ' ' << percentOf(strength) << '\n';
        }
        out << "END\n";
    }
    return out.str() + kPlotScript;
}

std::string drawPicture(const Timeline& timeline, PictureFormat format) {
    const std::string picture = runGnuplot(plotScript(timeline, format));
    return format == PictureFormat::kSvg ? described(timeline, picture) : picture;
}

}  // namespace vibratorctl
