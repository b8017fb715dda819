// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Motor.h"

#include <optional>
#include <vector>

namespace driver {

/** A time with one strength. */
struct Segment {
    uint32_t milliseconds;
    /** 0 to kFullStrength. */
    uint32_t strength;
};

/** What to play. */
struct Performance {
    std::vector<Segment> segments;
    /** What kFullStrength of the segments stands for; none: the strength of the motor. */
    std::optional<uint32_t> scale = {};
    /** Whether it begins again until it is stopped. */
    bool repeats = false;
};

/**
 * Plays strengths one after the other on a motor. It wakes up only when one follows another. Lives
 * as long as its process.
 */
class Player {
  public:
    /** @throw std::system_error if the device cannot be used. */
    Player(Device device, Loop& loop);

    /** Plays from now on, in place of what it played. @return 0, or a negative errno. */
    int start(Performance performance);
    /** Sets the strength of the motor, for what plays, too. @return 0, or a negative errno. */
    int setStrength(uint32_t strength);
    void stop();
    /** @return the time left in ms, rounded up; of what repeats the most that there is. */
    int64_t remaining() const;

  private:
    int apply();
    int advance();
    void setTimer(int64_t time) const;

    int mTimer;
    Motor mMotor;
    Performance mPlayed;
    uint32_t mStrength = kFullStrength;
    /** The segment that is played; past the end: none. */
    size_t mIndex = 0;
    /** When that one ends, and when the last one does, in ns. */
    int64_t mNext = 0;
    int64_t mEnd = 0;
};

}  // namespace driver
