// SPDX-License-Identifier: Apache-2.0
#include "Timeline.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <sstream>

namespace {

/** The full strength of the driver's scales. */
constexpr double kFull = 10000;
/** The index that makes the driver play its queue. */
constexpr long long kQueueIndex = 0xFFFE;
/** Accesses of one call lie no further apart, in s. */
constexpr double kSameCall = 0.05;
/** How long the service plays a click, a stored pattern, and the start of packets, in ms. */
constexpr long long kClickMs = 20;
constexpr long long kPatternMs = 1000;
constexpr long long kEngineMs = 1;

/** @return the amplitude from 1 to 255 that the service turns into an intensity; 0 for none. */
int amplitudeOf(long long intensity) {
    if (intensity < 1 || intensity > 10000) return 0;
    const double exact = static_cast<double>(intensity - 1) * 254 / 9999 + 1;
    const long amplitude = std::lround(exact);
    const bool isOne =
            std::lround(static_cast<double>(amplitude - 1) / 254 * 9999 + 1) == intensity;
    return isOne ? static_cast<int>(amplitude) : 0;
}

/** @return the strength of the click with an amplitude; nullptr for that of none. */
const char* clickOf(int amplitude) {
    return amplitude == 36    ? "light"
           : amplitude == 128 ? "medium"
           : amplitude == 255 ? "strong"
                              : nullptr;
}

}  // namespace

void TimelineMaker::add(const NodeAccess& access) {
    const bool isStrength = access.leaf() == "intensity";
    const bool isUsed = access.kind == NodeAccess::kWrite && access.error.empty();
    if (isUsed) {
        if (mTimeline.marks.empty()) {
            mFirst = access.time;
            mTimeline.isTimed = !access.clock.empty();
        }
        if (!access.clock.empty()) {
            // After a clock that was set back, the time goes on from there.
            mFirst = std::min(mFirst, access.time - mNow);
            mNow = access.time - mFirst;
        }
        write(access.leaf(), access.bytes);
    }
    mProbed = access.kind == NodeAccess::kProbe && isStrength && access.error.empty();
}

void TimelineMaker::write(const std::string& leaf, const std::string& bytes) {
    const long long value = strtoll(bytes.c_str(), nullptr, 10);
    const std::string number = std::to_string(value);
    if (leaf == "enable") {
        start(value);
    } else if (leaf == "duration") {
        mDuration = value;
    } else if (leaf == "activate" && value == 0) {
        start(0);
    } else if (leaf == "activate" && mTimeline.isTimed && mBegun < kPattern && mNow < mStop) {
        // While it runs, the trigger goes on as it is.
        mark("on " + std::to_string(mDuration) + " (running)");
    } else if (leaf == "activate" && mDuration == 0) {
        mark("on 0");
    } else if (leaf == "activate") {
        start(mDuration);
    } else if (leaf == "intensity") {
        writeIntensity(value);
    } else if (leaf == "haptic_engine") {
        writeHapticEngine(bytes);
    } else if (leaf == "cp_trigger_index") {
        writeIndex(value);
    } else if (leaf == "cp_trigger_queue") {
        writeQueue(bytes);
    } else if (leaf == "event_cmd") {
        mark(bytes == "FOLDER_OPEN\n" ? "fold open" : "fold close", true);
    } else if (leaf == "ext_control") {
        mark(value == 0 ? "external off" : "external on", true);
    } else if (leaf == "multi_freq") {
        mark("frequency " + number, true);
    } else if (leaf == "force_touch_intensity") {
        mark("force-touch " + number, true);
    }
}

bool TimelineMaker::isSoon() const {
    return !mTimeline.isTimed || mNow - mTimeline.marks.back().time < kSameCall;
}

void TimelineMaker::mark(const std::string& label, bool isSetting) {
    constexpr double kGap = 0.02;
    constexpr double kLongest = 1;
    if (!mTimeline.isTimed && !mTimeline.marks.empty()) {
        mNow = isSetting ? mNow + kGap : std::clamp(mStop + kGap, mNow + kGap, mNow + kLongest);
    }
    mTimeline.marks.push_back({mNow, label});
    mBegun = kNothing;
}

void TimelineMaker::writeIntensity(long long value) {
    const double strength = std::max(0.0, static_cast<double>(value) / kFull);
    // The service looks for the node before it sets an amplitude, and not before an intensity.
    const int amplitude = mProbed ? amplitudeOf(value) : 0;
    if (mBegun == kOn && isSoon() && clickOf(amplitude) != nullptr) {
        // It starts the motor before it sets the strength; to the eye that is one.
        mTimeline.marks.back().label = std::string("click ") + clickOf(amplitude);
        mTimeline.segments.back().strength = mStrength = strength;
        mBegun = kNothing;
        return;
    }
    mark(amplitude > 0 ? "amplitude " + std::to_string(amplitude)
                       : "intensity " + std::to_string(value),
         true);
    mBegun = kIntensity;
    setStrength(strength);
}

void TimelineMaker::setStrength(double strength) {
    mStrength = strength;
    if (mTimeline.segments.empty()) return;
    Timeline::Segment& running = mTimeline.segments.back();
    if (running.kind != Timeline::Segment::kRun || running.end <= mNow) return;
    if (running.start >= mNow) {
        running.strength = strength;
        return;
    }
    const double end = running.end;
    running.end = mNow;
    mTimeline.segments.push_back({mNow, end, strength, Timeline::Segment::kRun, false});
}

void TimelineMaker::writeHapticEngine(const std::string& text) {
    std::istringstream numbers(text);
    int64_t count = 0;
    int64_t values[4];
    numbers >> count;
    mPackets.clear();
    while (numbers >> values[0] >> values[1] >> values[2] >> values[3]) {
        mPackets.emplace_back(std::max(0.0, static_cast<double>(values[0]) / 1000),
                              std::max(0.0, static_cast<double>(values[1]) / kFull));
    }
    const std::string plural = mPackets.size() == 1 ? "" : "s";
    mark("engine, " + std::to_string(mPackets.size()) + " packet" + plural);
    mBegun = kEngine;
}

void TimelineMaker::writeIndex(long long value) {
    mQueueStrength = -1;
    // The text in the queue tells which pattern.
    if (value == kQueueIndex) return;
    const std::string label = "pattern " + std::to_string(value);
    if (mBegun == kIntensity && isSoon()) {
        mTimeline.marks.back().label = label;
    } else {
        mark(label);
    }
    mBegun = value == 0 ? kNothing : kPattern;
}

void TimelineMaker::writeQueue(const std::string& text) {
    // "PATTERN.PERCENT, REPEATS, DELAY~"
    char* rest = nullptr;
    const long long pattern = strtoll(text.c_str(), &rest, 10);
    const long long percent = *rest == '.' ? strtoll(rest + 1, nullptr, 10) : 0;
    mQueueStrength = static_cast<double>(std::max(0LL, percent)) / 100;
    mark("pattern " + std::to_string(pattern) + " repeat");
    mBegun = kPattern;
}

void TimelineMaker::start(long long ms) {
    const Begun begun = mBegun;
    if (begun == kEngine && ms > 0) {
        // The packets have their own times; this only sets them off.
        if (ms != kEngineMs) mark("on " + std::to_string(ms));
        stop();
        double time = mNow;
        for (const auto& [length, strength] : mPackets) {
            mTimeline.segments.push_back(
                    {time, time + length, strength, Timeline::Segment::kPacket, false});
            time += length;
        }
        mStop = time;
        mBegun = kNothing;
        return;
    }
    if (begun != kPattern || ms != kPatternMs) mark(ms > 0 ? "on " + std::to_string(ms) : "off");
    stop();
    mStop = mNow;
    mBegun = kNothing;
    if (ms <= 0) return;
    mStop = mNow + static_cast<double>(ms) / 1000;
    const bool isQueued = begun == kPattern && mQueueStrength >= 0;
    mTimeline.segments.push_back(
            {mNow, mStop, isQueued ? mQueueStrength : mStrength,
             begun == kPattern ? Timeline::Segment::kPattern : Timeline::Segment::kRun, false});
    if (ms == kClickMs && begun != kPattern) mBegun = kOn;
}

void TimelineMaker::stop() {
    auto& segments = mTimeline.segments;
    while (!segments.empty() && segments.back().start >= mNow)
        segments.pop_back();
    if (!segments.empty()) segments.back().end = std::min(segments.back().end, mNow);
}

Timeline TimelineMaker::finish() {
    // A run that nothing ends is drawn for a short while, or as long as all before it.
    constexpr double kTail = 60;
    auto& segments = mTimeline.segments;
    double last = mNow;
    for (const Timeline::Segment& segment : segments)
        last = std::max(last, segment.start);
    for (Timeline::Segment& segment : segments) {
        if (segment.end - last > std::max(kTail, last)) {
            segment.end = last + std::max(1.0, last / 20);
            segment.isOpen = true;
        }
        mTimeline.end = std::max(mTimeline.end, segment.end);
    }
    mTimeline.end = std::max(mTimeline.end, last);
    return std::move(mTimeline);
}

void cut(Timeline* timeline, double from, double to) {
    timeline->start = std::max(timeline->start, from);
    timeline->end = std::min(timeline->end, to);
    auto& segments = timeline->segments;
    auto& marks = timeline->marks;
    const auto isOutside = [&](const auto& start, const auto& end) {
        return start > timeline->end || end < timeline->start;
    };
    segments.erase(
            std::remove_if(segments.begin(), segments.end(),
                           [&](const auto& each) { return isOutside(each.start, each.end); }),
            segments.end());
    marks.erase(std::remove_if(marks.begin(), marks.end(),
                               [&](const auto& each) { return isOutside(each.time, each.time); }),
                marks.end());
    for (Timeline::Segment& segment : segments) {
        segment.start = std::max(segment.start, timeline->start);
        segment.isOpen = segment.isOpen || segment.end > timeline->end;
        segment.end = std::min(segment.end, timeline->end);
    }
}
