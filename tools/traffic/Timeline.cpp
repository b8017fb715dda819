// SPDX-License-Identifier: Apache-2.0
#include "traffic/Timeline.h"

#include "Amplitude.h"
#include "EffectPlayback.h"
#include "HapticEngineText.h"
#include "NodePathTable.h"
#include "PrebakedPatterns.h"
#include "Strengths.h"
#include "text/Text.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <iterator>
#include <sstream>
#include <utility>

namespace vibratorctl {

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using Segment = Timeline::Segment;

/** The longest time between two accesses of one call, in s. */
constexpr double kSameCall = 0.05;

/** @return the amplitude from 1 to 255 that the service turns into an intensity; 0 for none. */
int amplitudeOf(long long intensity) {
    int amplitude = UINT8_MAX;
    while (amplitude > 0 && intensityOf(static_cast<uint8_t>(amplitude)) != intensity)
        --amplitude;
    return amplitude;
}

/** @return the strength of the click that has an amplitude; nullptr if none has. */
const char* clickOf(int amplitude) {
    const auto* found =
            std::find(std::begin(kClickAmplitudes), std::end(kClickAmplitudes), amplitude);
    return found == std::end(kClickAmplitudes) ? nullptr : kStrengths[found - kClickAmplitudes];
}

/** @return a number of the driver's scale, where 1 is full strength. */
double strengthOf(double intensity) {
    return std::max(0.0, intensity / kMaxAmplitude);
}

class TimelineMaker {
  public:
    void add(const NodeAccess& access) {
        const bool isGood = access.error.empty();
        if (access.kind == NodeAccess::kWrite && isGood) {
            if (mTimeline.marks.empty()) {
                mFirst = access.time;
                mTimeline.isTimed = !access.clock.empty();
            }
            if (!access.clock.empty()) {
                // If the clock was set back, time continues from there.
                mFirst = std::min(mFirst, access.time - mNow);
                mNow = access.time - mFirst;
            }
            write(access.leaf(), access.text);
        }
        mProbed = access.kind == NodeAccess::kProbe && isGood && access.leaf() == "intensity";
    }

    Timeline finish() {
        // A run that nothing ends is drawn for a short time, or as long as all before it.
        constexpr double kTail = 60;
        const double last = mSegments.empty() ? mNow : std::max(mNow, mSegments.back().start);
        if (!mSegments.empty() && mSegments.back().end - last > std::max(kTail, last)) {
            mSegments.back().end = last + std::max(1.0, last / 20);
            mTimeline.goesOn = true;
        }
        mTimeline.end = mSegments.empty() ? last : std::max(last, mSegments.back().end);
        return std::move(mTimeline);
    }

  private:
    /** What a call that has begun may still become. */
    enum Begun { kNoCall, kOn, kIntensity, kPattern, kEngine };

    /**
     * Takes what a node was told.
     *
     * @param text begins with a number, where the node takes one.
     */
    void write(const std::string& leaf, const std::string& text) {
        const long long value = strtoll(text.c_str(), nullptr, 10);
        if (leaf == "enable") start(value);
        if (leaf == "duration") mDuration = value;
        if (leaf == "activate") activate(value != 0);
        if (leaf == "intensity") setIntensity(value);
        if (leaf == "haptic_engine") takePackets(text);
        if (leaf == "cp_trigger_index") choosePattern(value);
        if (leaf == "cp_trigger_queue") queuePattern(value, text);
        if (leaf == "event_cmd") set(text.find("OPEN") < text.size() ? "fold open" : "fold close");
        if (leaf == "ext_control") set(value == 0 ? "external off" : "external on");
        if (leaf == "multi_freq") set("frequency " + std::to_string(value));
        if (leaf == "force_touch_intensity") set("force-touch " + std::to_string(value));
    }

    /** @return whether the last call may be still going on. */
    bool isSoon() const {
        return !mTimeline.isTimed || mNow - mTimeline.marks.back().time < kSameCall;
    }

    /** Adds a call; without times it comes after the motor has stopped, or after some s. */
    void mark(const std::string& label, Begun begun = kNoCall, double latest = 1) {
        if (!mTimeline.isTimed && !mTimeline.marks.empty()) {
            mNow = std::clamp(mStop + kGap, mNow + kGap, mNow + latest);
        }
        mTimeline.marks.push_back({mNow, label, false});
        mBegun = begun;
    }
    /** Adds a call that does not wait for the motor. */
    void set(const std::string& label, Begun begun = kNoCall) {
        mark(label, begun, kGap);
        mTimeline.marks.back().isSetting = true;
    }

    void setIntensity(long long value) {
        const double strength = strengthOf(static_cast<double>(value));
        // The service looks for the node before it sets an amplitude, and not before an intensity.
        const int amplitude = mProbed ? amplitudeOf(value) : 0;
        mStrength = strength;
        if (mBegun == kOn && isSoon() && clickOf(amplitude) != nullptr) {
            // The click starts the motor before it sets the strength; it is drawn as one.
            mTimeline.marks.back().label = std::string("click ") + clickOf(amplitude);
            mSegments.back().strength = strength;
            mBegun = kNoCall;
            return;
        }
        set(amplitude > 0 ? "amplitude " + std::to_string(amplitude)
                          : "intensity " + std::to_string(value),
            kIntensity);
        if (mSegments.empty()) return;
        const Segment running = mSegments.back();
        if (running.kind != Segment::kRun || running.end <= mNow) return;
        stop();
        mSegments.push_back({mNow, running.end, strength, Segment::kRun});
    }

    void takePackets(const std::string& text) {
        std::istringstream numbers(text);
        int64_t count = 0;
        int64_t values[4];
        numbers >> count;
        mPackets.clear();
        while (numbers >> values[0] >> values[1] >> values[2] >> values[3]) {
            mPackets.emplace_back(std::max(0.0, static_cast<double>(values[0]) / 1000),
                                  strengthOf(static_cast<double>(values[1])));
        }
        mark("engine, " + std::to_string(mPackets.size()) +
                     (mPackets.size() == 1 ? " packet" : " packets"),
             kEngine);
    }

    void choosePattern(long long value) {
        mQueueStrength = -1;
        // The text in the queue tells which pattern.
        if (value == kQueueIndex) return;
        const std::string label = "pattern " + std::to_string(value);
        if (mBegun == kIntensity && isSoon()) {
            mTimeline.marks.back().label = label;
            mTimeline.marks.back().isSetting = false;
        } else {
            mark(label);
        }
        mBegun = value == 0 ? kNoCall : kPattern;
    }

    /** @param text "PATTERN.PERCENT, REPEATS, DELAY~". */
    void queuePattern(long long pattern, const std::string& text) {
        const char* dot = strchr(text.c_str(), '.');
        const long long percent = dot == nullptr ? 0 : strtoll(dot + 1, nullptr, 10);
        mQueueStrength = static_cast<double>(std::max(0LL, percent)) / 100;
        mark("pattern " + std::to_string(pattern) + " repeat", kPattern);
    }

    void activate(bool isOn) {
        if (isOn && mTimeline.isTimed && mBegun < kPattern && mNow < mStop) {
            // A running trigger is not started again.
            mark("on " + std::to_string(mDuration) + " (running)");
        } else if (isOn && mDuration == 0) {
            mark("on 0");
        } else {
            start(isOn ? mDuration : 0);
        }
    }

    void start(long long ms) {
        const Begun begun = mBegun;
        const bool isUsual =
                (begun == kEngine && ms == kEngineMs) || (begun == kPattern && ms == kPatternMs);
        if (!isUsual) mark(ms > 0 ? "on " + std::to_string(ms) : "off");
        mBegun = begun < kPattern && ms == kClickMs ? kOn : kNoCall;
        stop();
        mStop = mNow;
        if (begun == kEngine && ms > 0) {
            // The packets have their own times; this only starts them.
            for (const auto& [length, strength] : mPackets) {
                mSegments.push_back({mStop, mStop + length, strength, Segment::kPacket});
                mStop += length;
            }
        } else if (ms > 0) {
            mStop += static_cast<double>(ms) / 1000;
            const bool isPattern = begun == kPattern;
            mSegments.push_back({mNow, mStop,
                                 isPattern && mQueueStrength >= 0 ? mQueueStrength : mStrength,
                                 isPattern ? Segment::kPattern : Segment::kRun});
        }
    }

    void stop() {
        while (!mSegments.empty() && mSegments.back().start >= mNow)
            mSegments.pop_back();
        if (!mSegments.empty()) mSegments.back().end = std::min(mSegments.back().end, mNow);
    }

    /** Between calls without times, in s. */
    static constexpr double kGap = 0.02;

    Timeline mTimeline;
    std::vector<Segment>& mSegments = mTimeline.segments;
    double mFirst = 0;
    double mNow = 0;
    /** When the motor stops, by what it was told. */
    double mStop = -1;
    double mStrength = 1;
    long long mDuration = 0;
    Begun mBegun = kNoCall;
    /** Whether the last access found the node of the strength. */
    bool mProbed = false;
    /** Strength of the pattern in the driver's queue; below 0 if it has the motor's. */
    double mQueueStrength = -1;
    /** Length in s and strength of the packets that the next start plays. */
    std::vector<std::pair<double, double>> mPackets;
};

}  // namespace

Timeline makeTimeline(const std::vector<NodeAccess>& accesses) {
    TimelineMaker maker;
    for (const NodeAccess& access : accesses)
        maker.add(access);
    return maker.finish();
}

void cut(Timeline* timeline, double from, double to) {
    timeline->goesOn = timeline->goesOn && to >= timeline->end;
    const double start = timeline->start = std::max(timeline->start, from);
    const double end = timeline->end = std::min(timeline->end, to);
    for (Segment segment : std::exchange(timeline->segments, {})) {
        if (segment.start > end || segment.end < start) continue;
        timeline->goesOn = timeline->goesOn || segment.end > end;
        segment.start = std::max(segment.start, start);
        segment.end = std::min(segment.end, end);
        timeline->segments.push_back(segment);
    }
    for (Timeline::Mark& mark : std::exchange(timeline->marks, {})) {
        if (mark.time >= start && mark.time <= end) timeline->marks.push_back(std::move(mark));
    }
}

std::string plotTitle(const Timeline& timeline) {
    const size_t calls = timeline.marks.size();
    return "What the driver was told: " + std::to_string(calls) +
           (calls == 1 ? " call" : " calls") + " in " +
           cli::durationInWords(timeline.end - timeline.start);
}

std::string plotNote(const Timeline& timeline) {
    return timeline.isTimed ? "" : "The log has no times: each call is drawn after the one before.";
}

}  // namespace vibratorctl
