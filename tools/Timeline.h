// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "NodeAccess.h"

#include <string>
#include <vector>

/**
 * What the driver was told, as a motor would do it that does all it is told at once. The time of a
 * run is the kernel's, and so is that a running LED trigger is not started anew. What only the
 * driver knows is assumed: a packet of the haptic engine lasts param0 ms, one after the other, and
 * has its full strength at an intensity of 10000; a stored pattern lasts as long as its run.
 */
struct Timeline {
    /** A span in which the motor runs. */
    struct Segment {
        enum Kind { kRun, kPacket, kPattern };
        double start;
        double end;
        /** 1 is full strength; more where the driver was told more. */
        double strength;
        Kind kind;
        /** Whether it goes on beyond its end, which is the timeline's. */
        bool isOpen;
    };
    /** A client's call, as its node accesses show it. */
    struct Mark {
        double time;
        /** In the words of a score, like "click light"; letters, digits, blanks and commas. */
        std::string label;
    };

    /** In s from the first mark on; one after the other. */
    std::vector<Segment> segments;
    std::vector<Mark> marks;
    /** Where the timeline begins and ends, in s. */
    double start = 0;
    double end = 0;
    /** Whether the source had times; otherwise each call follows the one before. */
    bool isTimed = true;
};

/** Makes a timeline of accesses, of which those that failed count for nothing. */
class TimelineMaker {
  public:
    /** Takes the next access. */
    void add(const NodeAccess& access);
    /** @return the timeline of all that was added; nothing can be added after it. */
    Timeline finish();

  private:
    void write(const std::string& leaf, const std::string& bytes);
    void writeIntensity(long long value);
    void writeHapticEngine(const std::string& text);
    void writeIndex(long long value);
    void writeQueue(const std::string& text);
    void start(long long ms);
    void stop();
    void setStrength(double strength);
    void mark(const std::string& label, bool isSetting = false);
    bool isSoon() const;

    /** What a call that has begun may turn out to be. */
    enum Begun { kNothing, kOn, kIntensity, kPattern, kEngine };

    Timeline mTimeline;
    double mFirst = 0;
    double mNow = 0;
    /** When the motor stops, as far as it was told. */
    double mStop = -1;
    double mStrength = 1;
    long long mDuration = 0;
    Begun mBegun = kNothing;
    /** Whether the last access found the node of the strength. */
    bool mProbed = false;
    /** Strength of the pattern in the driver's queue; less than 0 where it has the motor's. */
    double mQueueStrength = -1;
    /** Length in s and strength of the packets that the next start sets off. */
    std::vector<std::pair<double, double>> mPackets;
};

/** Cuts a timeline to the part between two times in it. */
void cut(Timeline* timeline, double from, double to);
