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
    /** Whether the last segment goes on beyond the end. */
    bool goesOn = false;
    /** Whether the source had times; otherwise each call follows the one before. */
    bool isTimed = true;
};

/** @return the timeline of accesses, of which those that failed count for nothing. */
Timeline makeTimeline(const std::vector<NodeAccess>& accesses);

/** Cuts a timeline to the part between two times in it. */
void cut(Timeline* timeline, double from, double to);
