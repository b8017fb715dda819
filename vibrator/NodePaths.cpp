// SPDX-License-Identifier: Apache-2.0
#include "NodePaths.h"

#include "Log.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

uint8_t DriverMode = kTimedOutputMode;

const std::string THE_DEVICE_ENABLE = "/sys/class/timed_output/vibrator/enable";
const std::string THE_DEVICE_ACTIVATE = "/sys/class/leds/vibrator/activate";
const std::string THE_DEVICE_DURATION = "/sys/class/leds/vibrator/duration";
const std::string THE_DEVICE_STATE = "/sys/class/leds/vibrator/state";

std::string THE_DEVICE_INTENSITY;
std::string THE_DEVICE_FORCE_TOUCH_INTENSITY;
std::string THE_DEVICE_MULTI_FREQ;
std::string THE_DEVICE_HAPTIC_ENGINE;
std::string THE_DEVICE_HAPTIC_ENGINE_INDEX;
std::string THE_DEVICE_HAPTIC_PLAYBACK_QUEUE;
std::string THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES;
std::string THE_DEVICE_MOTOR_TYPE;
std::string THE_DEVICE_EVENT_CMD;
std::string THE_DEVICE_PATTERN_LENGTH;
std::string THE_DEVICE_EXT_CONTROL;

namespace {

struct ModeDependentNode {
    const char* name;
    std::string& path;
    const char* leaf;
};

/** In the order in which they are logged. */
const ModeDependentNode kModeDependentNodes[] = {
        {"THE_DEVICE_INTENSITY", THE_DEVICE_INTENSITY, "intensity"},
        {"THE_DEVICE_FORCE_TOUCH_INTENSITY", THE_DEVICE_FORCE_TOUCH_INTENSITY,
         "force_touch_intensity"},
        {"THE_DEVICE_MULTI_FREQ", THE_DEVICE_MULTI_FREQ, "multi_freq"},
        {"THE_DEVICE_HAPTIC_ENGINE", THE_DEVICE_HAPTIC_ENGINE, "haptic_engine"},
        {"THE_DEVICE_HAPTIC_ENGINE_INDEX", THE_DEVICE_HAPTIC_ENGINE_INDEX, "cp_trigger_index"},
        {"THE_DEVICE_HAPTIC_PLAYBACK_QUEUE", THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, "cp_trigger_queue"},
        {"THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES", THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, "num_waves"},
        {"THE_DEVICE_MOTOR_TYPE", THE_DEVICE_MOTOR_TYPE, "motor_type"},
        {"THE_DEVICE_EVENT_CMD", THE_DEVICE_EVENT_CMD, "event_cmd"},
        {"THE_DEVICE_PATTERN_LENGTH", THE_DEVICE_PATTERN_LENGTH, "pattern_length"},
        {"THE_DEVICE_EXT_CONTROL", THE_DEVICE_EXT_CONTROL, "ext_control"},
};

/** Directory of each layout, indexed by DriverMode. */
constexpr const char* kDirectories[] = {
        "/sys/class/timed_output/vibrator/",
        "/sys/class/leds/vibrator/",
};

}  // namespace

void setDriverMode(uint8_t mode) {
    DriverMode = mode;
    for (const ModeDependentNode& node : kModeDependentNodes) {
        node.path = std::string(kDirectories[mode]) + node.leaf;
    }
}

void logNodePaths() {
    for (const ModeDependentNode& node : kModeDependentNodes) {
        LOG_DEBUG("Vibrator %s %s", node.name, node.path.c_str());
    }
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
