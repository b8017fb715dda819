// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <string>

/**
 * What the service remembers, all of it process-wide: which driver layout the kernel has, and the
 * NodePathTable, the fifteen sysfs nodes of that layout. Written only while the Vibrator is
 * constructed, before it can be called, and only read afterwards.
 */
namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

constexpr uint8_t kTimedOutputMode = 0;
constexpr uint8_t kLedTriggerMode = 1;

/** Driver layout: kTimedOutputMode or kLedTriggerMode; the former when there is no driver. */
extern uint8_t DriverMode;

// The same in both layouts: the nodes that tell the layouts apart and run the motor.
extern const std::string THE_DEVICE_ENABLE;
extern const std::string THE_DEVICE_ACTIVATE;
extern const std::string THE_DEVICE_DURATION;
extern const std::string THE_DEVICE_STATE;

// In the directory of the layout that was found; empty when none was.
extern std::string THE_DEVICE_INTENSITY;
extern std::string THE_DEVICE_FORCE_TOUCH_INTENSITY;
extern std::string THE_DEVICE_MULTI_FREQ;
extern std::string THE_DEVICE_HAPTIC_ENGINE;
extern std::string THE_DEVICE_HAPTIC_ENGINE_INDEX;
extern std::string THE_DEVICE_HAPTIC_PLAYBACK_QUEUE;
extern std::string THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES;
extern std::string THE_DEVICE_MOTOR_TYPE;
extern std::string THE_DEVICE_EVENT_CMD;
extern std::string THE_DEVICE_PATTERN_LENGTH;
extern std::string THE_DEVICE_EXT_CONTROL;

/** Sets DriverMode and the paths that depend on it. @param mode one of the two layouts. */
void setDriverMode(uint8_t mode);

/** Logs the paths that depend on the layout. */
void logNodePathTable();

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
