// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Device.h"
#include "Loop.h"

#include <linux/input.h>

#include <cstdint>

namespace driver {

/** The full strength of a motor. */
constexpr int kFullStrength = 10000;

/** The longest time that the kernel plays an effect, in ms. */
constexpr int64_t kLongestEffect = 0xffff;

/**
 * A force-feedback motor. It plays one effect, which it changes while it plays. The kernel stops it
 * when this process ends; it lives as long. A motor that is unplugged is opened again when it is
 * back.
 */
class Motor {
  public:
    /** @throw std::system_error if the device cannot be opened. */
    Motor(Device device, Loop& loop, std::function<void()> whenLost);
    bool isThere() const { return mFile >= 0; }
    /**
     * Runs the motor from now on, or changes its strength while it runs.
     *
     * @param strength 1 to kFullStrength.
     * @param milliseconds when the kernel is to stop it, at most; kLongestEffect is the most.
     * @return 0, or a negative errno.
     */
    int run(uint32_t strength, int64_t milliseconds);
    void stop();

  private:
    int open(const std::string& path);
    void look();
    void lose();
    /** @return the errno as a negative number. */
    int fail(int error);
    bool send(uint16_t code, int32_t value) const;

    Device mDevice;
    Loop& mLoop;
    std::function<void()> mWhenLost;
    int mChanges;
    int mFile = -1;
    /** The number of the effect; -1 until the kernel has given one. */
    int16_t mEffect = -1;
    uint32_t mStrength = 0;
    bool mRuns = false;
};

}  // namespace driver
