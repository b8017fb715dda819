// SPDX-License-Identifier: Apache-2.0
#include "Timeline.h"

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <limits>
#include <sstream>

namespace {

/** The full strength of the driver's scales. */
constexpr double kFull = 10000;
/** A run that nothing ends is shown for so long after the last call, in s. */
constexpr double kOpenEnd = 1;

/** Follows the driver from write to write. */
class Motor {
  public:
    explicit Motor(Timeline* timeline) : mTimeline(*timeline) {}

    void write(const NodeAccess& access, double time) {
        const std::string leaf = access.leaf();
        const long long value = strtoll(access.bytes.c_str(), nullptr, 10);
        if (leaf == "enable") {
            switchMotor(time, value);
        } else if (leaf == "duration") {
            mDuration = value;
        } else if (leaf == "activate") {
            // While it runs, the trigger goes on as it is; what has been selected is set off.
            if (value != 0 && time < mEnd && mPattern.empty() && mPackets.empty()) {
                mark(time, "on " + std::to_string(mDuration) + ", runs already");
            } else {
                switchMotor(time, value == 0 ? 0 : mDuration);
            }
        } else if (leaf == "intensity") {
            mark(time, "intensity " + std::to_string(value));
            setStrength(time, static_cast<double>(value) / kFull);
        } else if (leaf == "haptic_engine") {
            readPackets(access.bytes);
            mark(time, "engine, " + std::to_string(mPackets.size()) + " packets");
        } else if (leaf == "cp_trigger_index") {
            mPattern = value == 0 || value == 0xFFFE ? "" : "pattern " + std::to_string(value);
            if (value != 0xFFFE) mark(time, "pattern " + std::to_string(value));
        } else if (leaf == "cp_trigger_queue") {
            const std::string play = access.bytes.substr(0, access.bytes.find(','));
            const size_t point = play.find('.');
            mPattern = "pattern " + play.substr(0, point);
            mQueueStrength = strtod(play.substr(point + 1).c_str(), nullptr) / 100;
            mark(time, "queue " + play.substr(0, point) + " at " + play.substr(point + 1) + " %");
        } else if (leaf == "event_cmd") {
            mark(time, access.bytes == "FOLDER_OPEN\n" ? "fold open" : "fold close");
        } else if (leaf == "ext_control") {
            mark(time, value == 0 ? "external off" : "external on");
        } else if (leaf == "multi_freq") {
            mark(time, "frequency " + std::to_string(value));
        } else if (leaf == "force_touch_intensity") {
            mark(time, "force touch " + std::to_string(value));
        }
    }

    void finish() {
        double last = mTimeline.marks.empty() ? 0 : mTimeline.marks.back().time;
        for (const Timeline::Segment& segment : mTimeline.segments)
            last = std::max(last, segment.start);
        for (Timeline::Segment& segment : mTimeline.segments) {
            if (segment.end > last + kOpenEnd && segment.end - segment.start > 60 * kOpenEnd) {
                segment.end = last + kOpenEnd;
            }
            mTimeline.length = std::max(mTimeline.length, segment.end);
        }
        mTimeline.length = std::max(mTimeline.length, last);
    }

  private:
    void mark(double time, const std::string& label) { mTimeline.marks.push_back({time, label}); }

    void stop(double time) {
        for (Timeline::Segment& segment : mTimeline.segments)
            segment.end = std::min(segment.end, std::max(segment.start, time));
        mEnd = time;
    }

    void switchMotor(double time, long long ms) {
        if (!mPackets.empty() && ms > 0) {
            // The packets have their own times; this only sets them off.
            stop(time);
            for (const auto& [length, strength] : mPackets) {
                add({time, time + length, strength, Timeline::Segment::kPacket, ""});
                time += length;
            }
            mPackets.clear();
            return;
        }
        mark(time, ms > 0 ? "on " + std::to_string(ms) : "off");
        stop(time);
        if (ms <= 0) return;
        mEnd = time + static_cast<double>(ms) / 1000;
        const bool queued = mQueueStrength >= 0;
        add({time, mEnd, queued ? mQueueStrength : mStrength,
             mPattern.empty() ? Timeline::Segment::kRun : Timeline::Segment::kPattern, mPattern});
        mPattern.clear();
        mQueueStrength = -1;
    }

    void setStrength(double time, double strength) {
        mStrength = strength;
        if (mTimeline.segments.empty()) return;
        Timeline::Segment& running = mTimeline.segments.back();
        if (running.kind != Timeline::Segment::kRun || running.end <= time) return;
        const double end = running.end;
        running.end = time;
        add({time, end, strength, Timeline::Segment::kRun, ""});
    }

    void add(const Timeline::Segment& segment) { mTimeline.segments.push_back(segment); }

    void readPackets(const std::string& text) {
        std::istringstream numbers(text);
        int64_t count = 0;
        int64_t values[4];
        numbers >> count;
        mPackets.clear();
        while (numbers >> values[0] >> values[1] >> values[2] >> values[3]) {
            mPackets.emplace_back(std::max(0.0, static_cast<double>(values[0]) / 1000),
                                  std::clamp(static_cast<double>(values[1]) / kFull, 0.0, 1.0));
        }
    }

    Timeline& mTimeline;
    double mStrength = 1;
    double mEnd = -std::numeric_limits<double>::infinity();
    long long mDuration = 0;
    std::string mPattern;
    double mQueueStrength = -1;
    std::vector<std::pair<double, double>> mPackets;
};

}  // namespace

Timeline makeTimeline(const std::vector<NodeAccess>& accesses) {
    Timeline timeline;
    Motor motor(&timeline);
    double begin = -1;
    double now = 0;
    for (const NodeAccess& access : accesses) {
        if (access.kind != NodeAccess::kWrite || !access.error.empty()) continue;
        if (begin < 0) begin = access.time;
        // In a trace that was put together the clock may seem to go back.
        now = std::max(now, access.time - begin);
        motor.write(access, now);
    }
    motor.finish();
    return timeline;
}
