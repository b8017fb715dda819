// SPDX-License-Identifier: Apache-2.0
#include "Reasons.h"

#include "LocalDriver.h"
#include "NodePathTable.h"

#include <algorithm>
#include <cstring>
#include <iterator>

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

/** What a call needs. */
struct Needs {
    const char* operation;
    /** Of its arguments, in words. */
    const char* range;
    /** Nodes beside those that run the motor, up to the first nullptr. */
    const char* nodes[3];
};

constexpr Needs kNeeds[] = {
        {"setAmplitude", "an amplitude is 1 to 255", {"intensity"}},
        {"setExternalControl", "", {"ext_control"}},
        {"daxSetAmplitude", "an intensity is 1 to 10000", {"intensity"}},
        {"daxSetForceTouchAmplitude", "an intensity is 1 to 10000", {"force_touch_intensity"}},
        {"daxSetFrequencyType", "a frequency type is 0 to 4", {"multi_freq"}},
        {"daxSetFolderStatus", "", {"event_cmd"}},
        {"daxGetNumberOfPrebakedHapticPattern", "", {"num_waves"}},
        {"daxPerformPrebakedHapticPattern",
         "an amplitude is 1 to 10000",
         {"cp_trigger_index", "intensity", "cp_trigger_queue"}},
        {"daxPerformHapticEngine",
         "at most 339 packets, an amplitude of 1 to 10000, values of at most 8 characters",
         {"haptic_engine"}},
        {"daxGetAmplitudeList", "the type is 0 or 1", {}},
        // All others; stands last.
        {"", "", {}},
};

/** @return why external control is refused while the motor counts as running. */
std::string runningReason(const LocalDriver& driver) {
    const bool isLed = DriverMode == kLedTriggerMode;
    std::string value = driver.look(isLed ? THE_DEVICE_DURATION : THE_DEVICE_ENABLE).value;
    if (!value.empty() && value.back() == '\n') value.pop_back();
    return std::string("refused while the motor counts as running (") +
           (isLed ? "duration" : "enable") + " is " + value + "); first: vibratorctl " +
           (isLed ? "on 0" : "off");
}

}  // namespace

std::string reasonOf(const Call& call, VibratorStatus status) {
    if (call.restricted && !mayCallRestricted()) return notPermitted();
    const auto* needs = std::find_if(
            std::begin(kNeeds), std::end(kNeeds) - 1,
            [&](const Needs& each) { return strcmp(each.operation, call.operation) == 0; });
    if (status == VibratorStatus::BAD_VALUE) return std::string("out of range: ") + needs->range;
    const LocalDriver driver;
    if (!driver.isThere()) {
        return "no vibrator driver is found; \"vibratorctl doctor\" says what to do";
    }
    if (strcmp(call.operation, "setExternalControl") == 0 && driver.isVibrating()) {
        return runningReason(driver);
    }
    for (const char* name : needs->nodes) {
        if (name == nullptr) break;
        const LocalDriver::Node node = driver.look(driver.directory() + name);
        if (!node.exists) return std::string("this driver has no node \"") + name + "\"";
        if (driver.isUsable() && !(node.reads && node.writes)) {
            return std::string("the node \"") + name +
                   R"(" cannot be opened; "vibratorctl doctor" says more)";
        }
    }
    return "the driver has refused it; the service's log has the error";
}
