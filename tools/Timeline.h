// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "NodeAccess.h"

#include <string>
#include <vector>

/**
 * What the motor did, made of what the driver was told. The driver's own part is the kernel's as
 * far as that is known: the time of a run, and that a running LED trigger is not started anew.
 * Where only the driver knows, this is how it is shown: a packet of the haptic engine lasts param0
 * ms, one after the other, at its intensity of 10000; a stored pattern fills the time that the
 * motor runs.
 */
struct Timeline {
    /** A span in which something moved, at a strength of 0 to 1. */
    struct Segment {
        enum Kind { kRun, kPacket, kPattern };
        double start;
        double end;
        double strength;
        Kind kind;
        std::string label;
    };
    /** A call, as its writes show it. */
    struct Mark {
        double time;
        std::string label;
    };

    /** In s from the first mark on, in the order of their starts. */
    std::vector<Segment> segments;
    std::vector<Mark> marks;
    /** Where the last of both ends, in s. */
    double length = 0;
};

/** @return what the motor did by the accesses, of which the failed ones and the reads count for
 * nothing. */
Timeline makeTimeline(const std::vector<NodeAccess>& accesses);
