// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vibrator.h"

#include <string>

namespace vibratorctl {

/**
 * The driver that this process sees, the kernel's or the simulated one, as the service's own code
 * judges it. It only looks: it writes nothing, leaves nothing in a simulated driver's trace, and
 * uses up none of its faults.
 */
class LocalDriver {
  public:
    using Vibrator = ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

    LocalDriver();

    /** A node as it is now. */
    struct Node {
        bool exists = false;
        bool reads = false;
        bool writes = false;
        std::string mode;
        std::string owner;
        std::string value;

        /** @return the value without the newline that ends it. */
        std::string firstLine() const { return value.substr(0, value.find('\n')); }
    };
    Node look(const std::string& path) const;

    /** @return whether the service's code, run as this user, finds a driver. */
    bool isUsable() const { return mIsUsable; }
    /** @return whether a driver is there, even if this user cannot open it. */
    bool isThere() const { return mIsThere; }
    /** @return "LED trigger", "timed output" or "none". */
    std::string layout() const;
    /** @return where the nodes are; ends in a slash. */
    std::string directory() const;
    bool isVibrating() const;

    struct Motor {
        int32_t number = 0;
        std::string name;
        /** How the service's code found it. */
        std::string found;

        std::string inWords() const {
            return name + ", number " + std::to_string(number) + ", found " + found;
        }
    };
    /** @return the motor of a usable driver, for a user who may make the restricted calls. */
    Motor motor() const;
    /** @return the service's object, which can be called as its clients call it. */
    const ::android::sp<Vibrator>& vibrator() const { return mVibrator; }

  private:
    ::android::sp<Vibrator> mVibrator;
    bool mIsUsable = false;
    bool mIsThere = false;
};

}  // namespace vibratorctl
