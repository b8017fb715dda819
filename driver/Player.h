// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Attributes.h"
#include "Motor.h"

#include <optional>
#include <vector>

namespace driver {

/** What to play. */
struct Performance {
    /** Each is a strength, intensity, that lasts for param0 ms. */
    std::vector<model::Packet> packets;
    /** What kFullStrength of the packets stands for; none: the strength of the motor. */
    std::optional<uint32_t> scale = {};
    /** Whether it begins again until it is stopped. */
    bool repeats = false;
};

/**
 * Plays packets one after the other on a motor. It is to be woken up only when one follows another.
 * Lives as long as its process.
 */
class Player {
  public:
    /** @throw std::system_error if the device cannot be used. */
    explicit Player(const Device& device);

    /** Plays from now on, in place of what it played. @return 0, or a negative errno. */
    int start(Performance performance);
    /** Sets the strength of the motor, for what plays, too. @return 0, or a negative errno. */
    int setStrength(uint32_t strength);
    void stop();
    /** @return the time left in ms, rounded up; of what repeats the most that there is. */
    int64_t remaining() const;

    /** @return a descriptor that can be read when advance is to be called. */
    int timer() const { return mTimer; }
    /** Has the motor do what it is time for. @return 0, or a negative errno. */
    int advance();

  private:
    void setTimer(int64_t time) const;

    int mTimer;
    Motor mMotor;
    Performance mPlayed;
    /** When it began, for the last time if it repeats, in ns. */
    int64_t mStart = 0;
    uint32_t mStrength = kFullStrength;
};

}  // namespace driver
