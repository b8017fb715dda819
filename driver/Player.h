// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Motor.h"
#include "Patterns.h"

#include <map>
#include <optional>
#include <string>
#include <vector>

namespace driver {

/**
 * The attributes' texts in memory, and a motor that does what they ask for: it plays packets, one
 * after the other. Lives as long as its process.
 */
class Player : public model::State {
  public:
    /** @throw std::system_error if the system has no timer left. */
    Player(Motor motor, Patterns patterns);

    std::string text(const std::string& leaf) const override { return mTexts.at(leaf); }
    int setText(const std::string& leaf, std::string_view text) override;
    uint64_t timeLeft() const override;
    int perform(const model::Action& action) override;

    std::string device() const { return mMotor.device(); }
    /** @return a descriptor that can be read when advance is to be called. */
    int timer() const { return mTimer; }
    /** Has the motor do what it is time for. @return 0, or a negative errno. */
    int advance();

  private:
    /** What is played from a time on. */
    struct Performance {
        /** Each is a strength, intensity, that lasts for param0 ms. */
        std::vector<model::Packet> packets = {};
        /** What kFullStrength of the packets stands for; none: the strength of the motor. */
        std::optional<int> scale = {};
        /** Whether it begins again until it is stopped. */
        bool repeats = false;
    };

    int choosePattern(int number, std::optional<int> scale, bool repeats);
    int start(uint64_t milliseconds);
    int stop();
    int64_t remaining() const;
    void setTimer(int64_t time) const;

    std::map<std::string, std::string> mTexts;
    Motor mMotor;
    const Patterns mPatterns;
    int mTimer;
    int mStrength = kFullStrength;
    bool mIsExternal = false;
    /** For the next start; without it the motor just runs. */
    std::optional<Performance> mChoice;
    Performance mPlayed;
    /** When it began, for the last time if it repeats, and how long it is once. */
    int64_t mStart = 0;
    int64_t mLength = 0;
};

}  // namespace driver
