// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Device.h"

#include <cstdint>

namespace driver {

/** The full strength of a motor. */
constexpr int kFullStrength = 10000;

/** @return a strength in proportion to another full one, rounded. */
constexpr uint32_t scaled(uint32_t strength, uint32_t full) {
    return (strength * full + kFullStrength / 2) / kFullStrength;
}

/** The longest time that the kernel plays an effect, in ms. */
constexpr int64_t kLongestEffect = 0xffff;

/**
 * A force-feedback motor. It plays one effect, which it changes while it plays. The kernel stops it
 * when this process ends; it lives as long.
 */
class Motor {
  public:
    /** @throw std::system_error if the device cannot be opened. */
    explicit Motor(const Device& device);
    /** @return whether it is plugged in; one that was unplugged has to be opened again. */
    bool isThere() const;
    /** Looks for the same device if it was unplugged. @return whether it is there. */
    bool openAgain();
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
    bool open(const Device& device);
    /** @return errno as a negative number. */
    int fail() const;
    bool send(uint16_t code, int32_t value) const;

    Device mDevice;
    int mFile = -1;
    /** The number of the effect; -1 until the kernel has given one. */
    int16_t mEffect = -1;
    uint32_t mStrength = 0;
    bool mRuns = false;
};

}  // namespace driver
