// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"

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
    /** Format of the log line that shows the path. */
    const char* format;
    std::string& path;
    const char* leaf;
};

/** In the order in which they are logged. */
const ModeDependentNode kModeDependentNodes[] = {
        {"Vibrator THE_DEVICE_INTENSITY %s", THE_DEVICE_INTENSITY, "intensity"},
        {"Vibrator THE_DEVICE_FORCE_TOUCH_INTENSITY %s", THE_DEVICE_FORCE_TOUCH_INTENSITY,
         "force_touch_intensity"},
        {"Vibrator THE_DEVICE_MULTI_FREQ %s", THE_DEVICE_MULTI_FREQ, "multi_freq"},
        {"Vibrator THE_DEVICE_HAPTIC_ENGINE %s", THE_DEVICE_HAPTIC_ENGINE, "haptic_engine"},
        {"Vibrator THE_DEVICE_HAPTIC_ENGINE_INDEX %s", THE_DEVICE_HAPTIC_ENGINE_INDEX,
         "cp_trigger_index"},
        {"Vibrator THE_DEVICE_HAPTIC_PLAYBACK_QUEUE %s", THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
         "cp_trigger_queue"},
        {"Vibrator THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES %s", THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
         "num_waves"},
        {"Vibrator THE_DEVICE_MOTOR_TYPE %s", THE_DEVICE_MOTOR_TYPE, "motor_type"},
        {"Vibrator THE_DEVICE_EVENT_CMD %s", THE_DEVICE_EVENT_CMD, "event_cmd"},
        {"Vibrator THE_DEVICE_PATTERN_LENGTH %s", THE_DEVICE_PATTERN_LENGTH, "pattern_length"},
        {"Vibrator THE_DEVICE_EXT_CONTROL %s", THE_DEVICE_EXT_CONTROL, "ext_control"},
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

void logNodePathTable() {
    for (const ModeDependentNode& node : kModeDependentNodes) {
        LOG_DEBUG(node.format, node.path.c_str());
    }
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
