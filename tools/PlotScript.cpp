// SPDX-License-Identifier: Apache-2.0
#include "Duration.h"
#include "Plot.h"

#include <algorithm>
#include <cctype>
#include <cmath>
#include <cstring>
#include <iomanip>
#include <iterator>
#include <sstream>
#include <vector>

namespace {

/** Sizes of the picture in pixels. */
constexpr double kWidth = 1000;
constexpr double kLeft = 84;
constexpr double kRight = 120;
constexpr double kStrip = 220;
constexpr double kBottom = 106;
constexpr double kFontSize = 14;
/** At least the width of a character, on the average of a label. */
constexpr double kCharacter = 0.6 * kFontSize;
constexpr double kFullPercent = 100;

/** @return text that gnuplot takes for nothing but text. */
std::string quoted(std::string text) {
    std::replace_if(
            text.begin(), text.end(),
            [](unsigned char c) { return isalnum(c) == 0 && !strchr(" ,.:%()+-", c); }, '?');
    return "'" + text + "'";
}

/** How the axis of the time is divided. */
struct TimeAxis {
    double step;
    /** Of a time in s; nullptr for a plain number. */
    const char* format;
    const char* title;
};

TimeAxis axisOf(double length) {
    constexpr double kSteps[] = {15,   30,   60,   120,   300,   600,  900,
                                 1800, 3600, 7200, 14400, 43200, 86400};
    constexpr double kMost = 10;
    if (length < 120) {
        // A step of 1, 2 or 5 times a power of ten.
        const double power = std::pow(10, std::floor(std::log10(length / kMost)));
        const double digit = length / kMost / power;
        const double step = (digit <= 1 ? 1 : digit <= 2 ? 2 : digit <= 5 ? 5 : 10) * power;
        return {step, nullptr, length < 2 ? "time in ms" : "time in s"};
    }
    const auto* step = std::find_if(std::begin(kSteps), std::end(kSteps) - 1,
                                    [&](double each) { return each * kMost >= length; });
    const double days = std::ceil(length / kMost / *step);
    return {*step * days, length < 7200 ? "%tM:%tS" : "%tH:%tM",
            length < 7200 ? "time in min:s" : "time in h:min"};
}

/** Writes the script; times in it are in ms where the picture is short, and in s elsewhere. */
class Script {
  public:
    explicit Script(const Timeline& timeline)
        : mTimeline(timeline),
          mLength(std::max((timeline.end - timeline.start) * 1.01, 0.001)),
          mUnit(mLength < 2 ? 1000 : 1),
          mPixel(mLength / (kWidth - kLeft - kRight)) {
        mOut << std::setprecision(9);
    }

    std::string write(PictureFormat format) {
        labelMarks();
        const double top = 52 + mLabelHeight;
        const double height = top + kStrip + kBottom;
        mOut << "set terminal "
             << (format == PictureFormat::kSvg ? "svg" : "pngcairo fontscale 0.75") << " size "
             << kWidth << ',' << height << " font 'sans-serif," << kFontSize
             << "' background '#ffffff'\n";
        mOut << "set termoption noenhanced\nset border 3 lc rgb '#444444'\nset tics nomirror out\n"
             << "set lmargin at screen " << kLeft / kWidth << "\nset rmargin at screen "
             << 1 - kRight / kWidth << "\nset bmargin at screen " << kBottom / height
             << "\nset tmargin at screen " << 1 - top / height << '\n';
        mOut << "set label " << quoted(plotTitle(mTimeline)) << " at screen " << 16 / kWidth
             << ", screen " << 1 - 22 / height << " font ',16'\n";
        writeAxes(height);
        for (const auto& [time, label] : mLabels) {
            mOut << "set label " << quoted(label) << " at " << time * mUnit
                 << ", graph 1.02 rotate by 45 tc rgb '#222222'\n";
        }
        writeBars();
        return mOut.str();
    }

  private:
    /** Chooses the labels: one for a crowd of marks, which says how many more there are. */
    void labelMarks() {
        constexpr double kLineHeight = 1.5 * kFontSize;
        constexpr size_t kLongest = 22;
        size_t more = 0;
        for (const Timeline::Mark& mark : mTimeline.marks) {
            if (mMarks.empty() || mark.time - mMarks.back() > 3 * mPixel)
                mMarks.push_back(mark.time);
            if (mLabels.empty() || mark.time - mLabels.back().time > kLineHeight * mPixel) {
                mLabels.push_back(mark);
                more = 0;
                continue;
            }
            std::string& label = mLabels.back().label;
            if (more == 0 && label.size() + mark.label.size() + 2 <= kLongest) {
                label += ", " + mark.label;
                continue;
            }
            if (more > 0) label.erase(label.rfind(" +"));
            label += " +" + std::to_string(++more);
        }
        size_t longest = 0;
        for (const Timeline::Mark& label : mLabels)
            longest = std::max(longest, label.label.size());
        mLabelHeight = 10 + static_cast<double>(longest) * kCharacter * 0.71;
    }

    void writeAxes(double height) {
        const TimeAxis axis = axisOf(mLength);
        mOut << "set xrange [" << mTimeline.start * mUnit << ':'
             << (mTimeline.start + mLength) * mUnit << "]\nset xtics " << axis.step * mUnit
             << (axis.format == nullptr ? "" : std::string(" time format '") + axis.format + "'")
             << '\n';
        mOut << "set xlabel '" << axis.title << "' offset 0,0.4\n"
             << "set yrange [0:" << kFullPercent
             << "]\nset ytics 25\nset grid ytics lc rgb '#dddddd' lt 1\n"
             << "set ylabel 'strength in %' offset 1,0\n"
             << "set key at screen " << 1 - kRight / kWidth << ", screen " << 24 / height
             << " right center horizontal Left reverse samplen 1.5\n";
        const std::string note = plotNote(mTimeline);
        if (!note.empty()) {
            mOut << "set label " << quoted(note) << " at screen " << 16 / kWidth << ", screen "
                 << 24 / height << " font ',12'\n";
        }
    }

    struct Bar {
        double start;
        double end;
        double strength;
    };

    void writeBars() {
        std::vector<Bar> bars[3];
        std::vector<Bar> beyond;
        for (const Timeline::Segment& segment : mTimeline.segments) {
            // What is shorter than a pixel is drawn as one, together with its neighbours there.
            const double end = std::max(segment.end, segment.start + mPixel);
            addBar(&bars[segment.kind], {segment.start, end, std::min(1.0, segment.strength)});
            if (segment.strength > 1) addBar(&beyond, {segment.start, end, 1});
            if (segment.isOpen) writeArrow(segment);
        }
        const struct {
            const char* name;
            const char* title;
            const char* colour;
            const std::vector<Bar>& bars;
        } kinds[] = {{"$on", "motor on", "#0072b2", bars[0]},
                     {"$packets", "haptic engine packets", "#e69f00", bars[1]},
                     {"$patterns", "stored pattern", "#009e73", bars[2]},
                     {"$beyond", "beyond full strength", "#d55e00", beyond}};
        std::string plot;
        for (const auto& kind : kinds) {
            if (kind.bars.empty()) continue;
            const bool isBeyond = &kind.bars == &beyond;
            writeBlock(kind.name, kind.bars);
            // Of a column: its middle, and from where to where it goes both ways.
            plot += std::string(", ") + kind.name + " using 1:3:1:2:(" + (isBeyond ? "96" : "0") +
                    "):3 with boxxyerror fs solid noborder lc rgb '" + kind.colour + "' title '" +
                    kind.title + "'";
        }
        mOut << "$calls << END\n";
        for (const double time : mMarks)
            mOut << time * mUnit << '\n';
        mOut << "END\nplot $calls using 1:(" << kFullPercent
             << ") with impulses lc rgb '#999999' dt 3 notitle" << plot << '\n';
    }

    void addBar(std::vector<Bar>* bars, const Bar& bar) const {
        if (!bars->empty() && bar.end <= bars->back().start + 2 * mPixel) {
            bars->back().end = std::max(bar.end, bars->back().end);
            bars->back().strength = std::max(bar.strength, bars->back().strength);
        } else {
            bars->push_back(bar);
        }
    }

    void writeBlock(const char* name, const std::vector<Bar>& bars) {
        mOut << name << " << END\n";
        for (const Bar& bar : bars) {
            // A hair's breadth lies between one and the next.
            const double gap = bar.end - bar.start > 4 * mPixel ? mPixel / 2 : 0;
            mOut << bar.start * mUnit << ' ' << (bar.end - gap) * mUnit << ' '
                 << bar.strength * kFullPercent << '\n';
        }
        mOut << "END\n";
    }

    void writeArrow(const Timeline::Segment& segment) {
        const double height = std::min(1.0, segment.strength) * kFullPercent / 2;
        mOut << "set arrow from " << segment.end * mUnit << ',' << height << " rto "
             << 24 * mPixel * mUnit << ",0 filled lw 2 lc rgb '#444444'\n"
             << "set label 'goes on' at " << (segment.end + 30 * mPixel) * mUnit << ',' << height
             << '\n';
    }

    const Timeline& mTimeline;
    double mLength;
    double mUnit;
    /** The time that a pixel is wide. */
    double mPixel;
    std::vector<double> mMarks;
    std::vector<Timeline::Mark> mLabels;
    double mLabelHeight = 0;
    std::ostringstream mOut;
};

}  // namespace

std::string plotTitle(const Timeline& timeline) {
    const size_t calls = timeline.marks.size();
    return "What the driver was told: " + std::to_string(calls) +
           (calls == 1 ? " call" : " calls") + " in " +
           durationInWords(timeline.end - timeline.start);
}

std::string plotNote(const Timeline& timeline) {
    return timeline.isTimed ? "" : "The log has no times: each call is drawn after the one before.";
}

std::string plotScript(const Timeline& timeline, PictureFormat format) {
    return Script(timeline).write(format);
}
