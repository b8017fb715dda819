// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"

#include <algorithm>
#include <cmath>
#include <cstdio>
#include <sstream>
#include <utility>
#include <vector>

namespace {

constexpr double kWidth = 1200;
constexpr double kLeft = 70;
constexpr double kRight = 24;
constexpr double kStrip = 240;
constexpr double kFontSize = 13;
/** Width of a character of a typewriter font, as a part of its size. */
constexpr double kCharacter = 0.602 * kFontSize;
constexpr double kLaneHeight = 18;
constexpr size_t kMostLanes = 14;

std::string number(double value) {
    char text[32];
    snprintf(text, sizeof(text), "%.6g", value);
    return text;
}

/** @return a text as XML may hold it. */
std::string escaped(const std::string& text) {
    std::string safe;
    for (const char c : text) {
        if (c == '<') {
            safe += "&lt;";
        } else if (c == '&') {
            safe += "&amp;";
        } else {
            safe += c >= 0x20 && c < 0x7f ? c : '?';
        }
    }
    return safe;
}

double widthOf(const std::string& label) {
    return static_cast<double>(label.size()) * kCharacter;
}

/** @return a step of 1, 2 or 5 times a power of ten that divides a length into about ten. */
double niceStep(double length) {
    const double rough = length / 10;
    const double power = std::pow(10, std::floor(std::log10(rough)));
    for (const double factor : {1.0, 2.0, 5.0}) {
        if (factor * power >= rough) return factor * power;
    }
    return 10 * power;
}

class Drawing {
  public:
    explicit Drawing(const Timeline& timeline)
        : mTimeline(timeline), mLength(std::max(timeline.length * 1.02, 0.001)) {}

    std::string draw() {
        layOutMarks();
        mTop = 56 + static_cast<double>(mLaneEnds.size()) * kLaneHeight + 8;
        const double height = mTop + kStrip + 56;
        mOut << R"(<svg xmlns="http://www.w3.org/2000/svg" width=")" << kWidth << R"(" height=")"
             << height << R"(" viewBox="0 0 )" << kWidth << ' ' << height
             << R"(" font-family="DejaVu Sans Mono, Menlo, Consolas, monospace" font-size=")"
             << kFontSize << "\">\n";
        rectangle(0, 0, kWidth, height, "#ffffff");
        drawTitle();
        drawAxes();
        for (const Timeline::Segment& segment : mTimeline.segments)
            drawSegment(segment);
        drawMarks();
        mOut << "</svg>\n";
        return mOut.str();
    }

  private:
    double x(double time) const { return kLeft + time / mLength * (kWidth - kLeft - kRight); }
    double y(double strength) const { return mTop + (1 - strength) * kStrip; }

    using Attributes = std::vector<std::pair<const char*, std::string>>;

    void element(const char* name, const Attributes& attributes, const std::string& content = {}) {
        mOut << '<' << name;
        for (const auto& [key, value] : attributes)
            mOut << ' ' << key << "=\"" << value << '"';
        mOut << '>' << escaped(content) << "</" << name << ">\n";
    }
    void text(double atX, double atY, const std::string& label, Attributes more = {}) {
        more.insert(more.begin(), {{"x", number(atX)}, {"y", number(atY)}});
        element("text", more, label);
    }
    void rectangle(double left, double top, double width, double height, const char* colour) {
        element("rect", {{"x", number(left)},
                         {"y", number(top)},
                         {"width", number(width)},
                         {"height", number(height)},
                         {"fill", colour}});
    }
    void line(double x1, double y1, double x2, double y2, Attributes more) {
        more.insert(
                more.begin(),
                {{"x1", number(x1)}, {"y1", number(y1)}, {"x2", number(x2)}, {"y2", number(y2)}});
        element("line", more);
    }

    /** Gives each label a lane in which it meets no other; those for which there is none stay out.
     */
    void layOutMarks() {
        for (const Timeline::Mark& mark : mTimeline.marks) {
            const double width = widthOf(mark.label) + 10;
            const double start = std::min(x(mark.time), kWidth - width);
            auto lane = std::find_if(mLaneEnds.begin(), mLaneEnds.end(),
                                     [&](double end) { return end <= start; });
            if (lane == mLaneEnds.end() && mLaneEnds.size() < kMostLanes) {
                lane = mLaneEnds.insert(lane, 0);
            }
            if (lane == mLaneEnds.end()) {
                ++mUnlabelled;
                mPlaces.emplace_back(start, -1);
                continue;
            }
            *lane = start + width;
            mPlaces.emplace_back(start, lane - mLaneEnds.begin());
        }
    }

    void drawTitle() {
        double left = kLeft;
        const std::pair<const char*, const char*> legend[] = {{"#4878b0", "motor running"},
                                                              {"#e08a3c", "haptic engine packet"},
                                                              {"#7d5ba6", "stored pattern"}};
        for (const auto& [colour, label] : legend) {
            rectangle(left, 13, 14, 14, colour);
            text(left + 20, 25, label);
            left += 20 + widthOf(label) + 30;
        }
        std::string calls = "calls";
        if (mUnlabelled > 0) {
            calls += " (" + std::to_string(mUnlabelled) + " without a label, for want of room)";
        }
        text(kLeft, 48, calls, {{"fill-opacity", "0.6"}});
    }

    void drawAxes() {
        const Attributes dark = {{"stroke", "#222222"}};
        const Attributes middle = {{"text-anchor", "middle"}};
        for (int percent = 0; percent <= 100; percent += 25) {
            const double height = y(percent / 100.0);
            line(kLeft, height, kWidth - kRight, height, {{"stroke", "#dddddd"}});
            text(kLeft - 8, height + 4, std::to_string(percent), {{"text-anchor", "end"}});
        }
        element("text",
                {{"transform", "translate(20 " + number(mTop + kStrip / 2) + ") rotate(-90)"},
                 {"text-anchor", "middle"}},
                "strength in %");
        const double unit = mLength < 2 ? 1000 : 1;
        const double step = niceStep(mLength);
        for (int i = 0; i * step <= mLength; ++i) {
            line(x(i * step), y(0), x(i * step), y(0) + 5, dark);
            text(x(i * step), y(0) + 20, number(i * step * unit), middle);
        }
        line(kLeft, y(0), kWidth - kRight, y(0), dark);
        text((kLeft + kWidth - kRight) / 2, y(0) + 42, unit == 1 ? "time in s" : "time in ms",
             middle);
    }

    void drawSegment(const Timeline::Segment& segment) {
        constexpr const char* kColours[] = {"#4878b0", "#e08a3c", "#7d5ba6"};
        const double left = x(segment.start);
        const double width = std::max(1.0, x(segment.end) - left);
        // A hair's breadth lies between one and the next.
        rectangle(left, y(segment.strength), std::max(1.0, width - 0.5), segment.strength * kStrip,
                  kColours[segment.kind]);
        // Above the bar or, where that is too high, inside; not at all where it is too wide.
        std::string label = segment.label;
        if (segment.kind == Timeline::Segment::kPacket) {
            label = number((segment.end - segment.start) * 1000) + " ms";
        }
        if (label.empty() || widthOf(label) + 8 > width) return;
        const bool inside = segment.strength > 0.9;
        text(left + width / 2, y(segment.strength) + (inside ? 18 : -6), label,
             {{"text-anchor", "middle"}, {"fill", inside ? "#ffffff" : "#000000"}});
    }

    /** Draws the lines first, so that no line crosses a label. */
    void drawMarks() {
        const auto labelY = [&](size_t mark) {
            return 68 + static_cast<double>(mPlaces[mark].second) * kLaneHeight;
        };
        for (size_t i = 0; i < mPlaces.size(); ++i) {
            const double at = x(mTimeline.marks[i].time);
            const double top = mPlaces[i].second < 0 ? mTop - 6 : labelY(i);
            line(at, top, at, y(0),
                 {{"stroke", "#222222"}, {"stroke-opacity", "0.35"}, {"stroke-dasharray", "2 3"}});
        }
        for (size_t i = 0; i < mPlaces.size(); ++i) {
            if (mPlaces[i].second < 0) continue;
            const std::string& label = mTimeline.marks[i].label;
            rectangle(mPlaces[i].first + 1, labelY(i) - 13, widthOf(label) + 6, 16, "#ffffff");
            text(mPlaces[i].first + 4, labelY(i), label, {{"class", "call"}});
        }
    }

    const Timeline& mTimeline;
    double mLength;
    double mTop = 0;
    /** Where the last label of each lane ends. */
    std::vector<double> mLaneEnds;
    /** Where each label starts, and its lane, -1 for none. */
    std::vector<std::pair<double, long>> mPlaces;
    size_t mUnlabelled = 0;
    std::ostringstream mOut;
};

}  // namespace

std::string plotSvg(const Timeline& timeline) {
    return Drawing(timeline).draw();
}
