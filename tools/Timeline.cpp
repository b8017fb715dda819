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
/** The index that makes the driver play its queue. */
constexpr long long kQueueIndex = 0xFFFE;
/** A run that nothing ends is shown for so long after the last call, in s. */
constexpr double kOpenEnd = 1;

/** Follows the driver from write to write. */
class Motor {
  public:
    explicit Motor(Timeline* timeline) : mTimeline(*timeline) {}

    void write(const NodeAccess& access, double time) {
        struct Node {
            const char* leaf;
            void (Motor::*write)(double time, long long value, const std::string& bytes);
        };
        constexpr Node kNodes[] = {
                {"enable", &Motor::writeEnable},
                {"duration", &Motor::writeDuration},
                {"activate", &Motor::writeActivate},
                {"intensity", &Motor::writeIntensity},
                {"haptic_engine", &Motor::writeHapticEngine},
                {"cp_trigger_index", &Motor::writeIndex},
                {"cp_trigger_queue", &Motor::writeQueue},
                {"event_cmd", &Motor::writeEvent},
                {"ext_control", &Motor::writeExternalControl},
                {"multi_freq", &Motor::writeFrequency},
                {"force_touch_intensity", &Motor::writeForceTouch},
        };
        const std::string leaf = access.leaf();
        for (const Node& node : kNodes) {
            if (leaf != node.leaf) continue;
            const long long value = strtoll(access.bytes.c_str(), nullptr, 10);
            (this->*node.write)(time, value, access.bytes);
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
    using Bytes = const std::string&;

    void writeEnable(double time, long long value, Bytes /* bytes */) { switchMotor(time, value); }
    void writeDuration(double /* time */, long long value, Bytes /* bytes */) { mDuration = value; }
    void writeActivate(double time, long long value, Bytes /* bytes */) {
        // While it runs, the trigger goes on as it is; what has been selected is set off.
        if (value != 0 && time < mEnd && mPattern.empty() && mPackets.empty()) {
            mark(time, "on " + std::to_string(mDuration) + ", runs already");
        } else {
            switchMotor(time, value == 0 ? 0 : mDuration);
        }
    }
    void writeIntensity(double time, long long value, Bytes /* bytes */) {
        mark(time, "intensity " + std::to_string(value));
        setStrength(time, static_cast<double>(value) / kFull);
    }
    void writeHapticEngine(double time, long long /* value */, Bytes bytes) {
        readPackets(bytes);
        mark(time, "engine, " + std::to_string(mPackets.size()) + " packets");
    }
    void writeIndex(double time, long long value, Bytes /* bytes */) {
        if (value == kQueueIndex) return;
        const std::string label = "pattern " + std::to_string(value);
        mPattern = value == 0 ? "" : label;
        mark(time, label);
    }
    void writeQueue(double time, long long /* value */, Bytes bytes) {
        const std::string play = bytes.substr(0, bytes.find(','));
        const size_t point = play.find('.');
        const std::string number = play.substr(0, point);
        const std::string percent = point == std::string::npos ? "0" : play.substr(point + 1);
        mPattern = "pattern " + number;
        mQueueStrength = std::clamp(strtod(percent.c_str(), nullptr) / 100, 0.0, 1.0);
        mark(time, "queue " + number + " at " + percent + " %");
    }
    void writeEvent(double time, long long /* value */, Bytes bytes) {
        mark(time, bytes == "FOLDER_OPEN\n" ? "fold open" : "fold close");
    }
    void writeExternalControl(double time, long long value, Bytes /* bytes */) {
        mark(time, value == 0 ? "external off" : "external on");
    }
    void writeFrequency(double time, long long value, Bytes /* bytes */) {
        mark(time, "frequency " + std::to_string(value));
    }
    void writeForceTouch(double time, long long value, Bytes /* bytes */) {
        mark(time, "force touch " + std::to_string(value));
    }

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
