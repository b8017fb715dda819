// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"

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

const std::string FOLDER_OPEN_COMMAND = "FOLDER_OPEN\n";
const std::string FOLDER_CLOSE_COMMAND = "FOLDER_CLOSE\n";

const NodeInfo NodePathTable[] = {
        {"enable", nullptr, nullptr, false, kTimedOutputMode},
        {"activate", nullptr, nullptr, false, kLedTriggerMode},
        {"duration", nullptr, nullptr, false, kLedTriggerMode},
        {"state", nullptr, nullptr, false, kLedTriggerMode},
        {"intensity", &THE_DEVICE_INTENSITY, "Vibrator THE_DEVICE_INTENSITY %s"},
        {"force_touch_intensity", &THE_DEVICE_FORCE_TOUCH_INTENSITY,
         "Vibrator THE_DEVICE_FORCE_TOUCH_INTENSITY %s"},
        {"multi_freq", &THE_DEVICE_MULTI_FREQ, "Vibrator THE_DEVICE_MULTI_FREQ %s"},
        {"haptic_engine", &THE_DEVICE_HAPTIC_ENGINE, "Vibrator THE_DEVICE_HAPTIC_ENGINE %s"},
        {"cp_trigger_index", &THE_DEVICE_HAPTIC_ENGINE_INDEX,
         "Vibrator THE_DEVICE_HAPTIC_ENGINE_INDEX %s"},
        {"cp_trigger_queue", &THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
         "Vibrator THE_DEVICE_HAPTIC_PLAYBACK_QUEUE %s"},
        {"num_waves", &THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
         "Vibrator THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES %s", true},
        {"motor_type", &THE_DEVICE_MOTOR_TYPE, "Vibrator THE_DEVICE_MOTOR_TYPE %s"},
        {"event_cmd", &THE_DEVICE_EVENT_CMD, "Vibrator THE_DEVICE_EVENT_CMD %s"},
        {"pattern_length", &THE_DEVICE_PATTERN_LENGTH, "Vibrator THE_DEVICE_PATTERN_LENGTH %s",
         true},
        {"ext_control", &THE_DEVICE_EXT_CONTROL, "Vibrator THE_DEVICE_EXT_CONTROL %s"},
};

std::optional<uint8_t> findDriverMode(const std::function<bool(const std::string& node)>& opens) {
    if (opens(THE_DEVICE_ENABLE)) return kTimedOutputMode;
    if (opens(THE_DEVICE_ACTIVATE) && opens(THE_DEVICE_DURATION) && opens(THE_DEVICE_STATE)) {
        return kLedTriggerMode;
    }
    return std::nullopt;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
