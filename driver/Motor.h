// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Amplitude.h"

#include <utils/UniqueFd.h>

#include <cstdint>
#include <map>
#include <string>

namespace driver {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

/** The full strength of a motor. */
constexpr int kFullStrength = product::kMaxAmplitude;

/** @return a strength in proportion to another full one, rounded. */
constexpr int scaled(int strength, int full) {
    return (strength * full + kFullStrength / 2) / kFullStrength;
}

/** The longest time that the kernel promises to play an effect, in ms. */
constexpr int64_t kMaxEffect = 0x7fff;

/** An input device that offers force feedback. It plays one effect, until it is closed at most. */
class Motor {
  public:
    /** @return the motors of this machine, by the numbers of their devices. */
    static std::map<int, Motor> list();
    /**
     * @return the motor with a path; for an empty path the only one that can be used.
     * @throw std::runtime_error that says why there is none, or which ones there are.
     */
    static Motor choose(const std::string& path);

    /** @return its path, and its name. */
    std::string device() const { return mPath + " " + mName; }
    /** @return both, and what it plays or why it cannot be used. */
    std::string inWords() const;

    /** @return whether it is plugged in; one that was unplugged has to be opened again. */
    bool isThere() const;
    /** Looks for the same device if it was unplugged. @return 0, or a negative errno. */
    int openAgain();
    /**
     * Runs the motor from now on, in place of what it did; without a gap if it ran.
     *
     * @param strength up to kFullStrength; 0 stops it, which does not fail.
     * @param milliseconds when the kernel is to stop it, kMaxEffect at most.
     * @return 0, or a negative errno.
     */
    int run(int strength, int64_t milliseconds);

  private:
    /** @param properties the directory where the kernel describes the device. */
    Motor(const std::string& path, const std::string& properties);

    /** Asks the device what it can do. @param error why it could not be opened; 0 if it is open. */
    void ask(int error);
    /** Logs an error. @return it as a negative errno. */
    int fail(int error) const;
    bool send(int code, int value) const;

    std::string mPath;
    std::string mName;
    /** What stays when it is plugged in again. */
    std::string mIdentity;
    android::UniqueFd mFile;
    /** The effect that is used: FF_RUMBLE, else FF_CONSTANT; 0: none. */
    uint16_t mType = 0;
    /** Whether it has a setting for the strength of all its effects. */
    bool mHasGain = false;
    /** Why it cannot be used; empty if it can. */
    std::string mProblem;
    /** The number of the effect; -1 until the kernel has given one. */
    int16_t mEffect = -1;
};

}  // namespace driver
