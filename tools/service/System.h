// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace vibratorctl {

/** How the service is run on this system, for advice. */
struct System {
    /** What starts it, and starts it anew. */
    std::string start;
    std::string restart;
    /** What gives its user the driver's nodes; empty where nothing does. */
    std::string give;
    /** Where its log is. */
    std::string log;
};

/** @return what holds here. */
System thisSystem();

/** @return the input devices with force feedback: "gpio-vibrator (/dev/input/event3)". */
std::vector<std::string> forceFeedbackMotors();

}  // namespace vibratorctl
