// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "traffic/NodeAccess.h"

#include <string>
#include <vector>

namespace vibratorctl {

/**
 * What the driver was told, as an ideal motor would do it, without delay. As in the kernel, a run
 * ends by itself, and a running LED trigger is not started again. What only the driver knows is
 * assumed: packets of the haptic engine last param0 ms each, one after the other, with full
 * strength at an intensity of 10000; a stored pattern lasts as long as its run.
 */
struct Timeline {
    /** A span in which the motor runs. */
    struct Segment {
        enum Kind { kRun, kPacket, kPattern };
        double start;
        double end;
        /** 1 is full strength; it is greater if the driver was told more. */
        double strength;
        Kind kind;
    };
    /** A client's call, inferred from its node accesses. */
    struct Mark {
        double time;
        /** In the words of a score, like "click light"; without quotation marks and backslashes. */
        std::string label;
        /** Whether it only changes a setting of the motor or of the driver. */
        bool isSetting = false;
    };

    /** In s from the first mark on, in order. */
    std::vector<Segment> segments;
    std::vector<Mark> marks;
    /** Where the timeline begins and ends, in s. */
    double start = 0;
    double end = 0;
    /** Whether the last segment goes on beyond the end. */
    bool goesOn = false;
    /** Whether the source had times; otherwise each call follows the one before. */
    bool isTimed = true;
};

/** @return the timeline of accesses; those that failed are ignored. */
Timeline makeTimeline(const std::vector<NodeAccess>& accesses);

/** Cuts a timeline to the part between two times in it. */
void cut(Timeline* timeline, double from, double to);

/** @return the title of a plot. */
std::string plotTitle(const Timeline& timeline);

/** @return what a plot does not show by itself, like missing times; empty if there is nothing. */
std::string plotNote(const Timeline& timeline);

}  // namespace vibratorctl
