// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

/**
 * What the service remembers, all of it process-wide: which driver layout the kernel has, and the
 * paths of the fifteen sysfs nodes in that layout. Written only while the Vibrator is constructed,
 * before it can be called, and only read afterwards.
 */
namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

constexpr uint8_t kTimedOutputMode = 0;
constexpr uint8_t kLedTriggerMode = 1;

/** Directory of each layout, indexed by DriverMode; ends in a slash. */
inline constexpr const char* kNodeDirectories[] = {
        "/sys/class/timed_output/vibrator/",
        "/sys/class/leds/vibrator/",
};

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

/** What THE_DEVICE_EVENT_CMD takes when the device is opened, and when it is closed. */
extern const std::string FOLDER_OPEN_COMMAND;
extern const std::string FOLDER_CLOSE_COMMAND;

/** What is known of a node, whether or not there is a driver. */
struct NodeInfo {
    /** Last part of its path, the same in each layout. */
    const char* leaf;
    /** The string that is given its path once the layout is known; nullptr if its path is fixed. */
    std::string* path;
    /** Format of the log line that shows that string. */
    const char* logFormat;
    /** Whether the service never writes it, so that it may be read-only. */
    bool isOnlyRead = false;
    /** The one layout that has it; nothing if a driver of each layout may have it. */
    std::optional<uint8_t> onlyMode = {};

    /** @return whether a driver of a layout may have it. */
    constexpr bool isIn(uint8_t mode) const { return !onlyMode || *onlyMode == mode; }
    /** @return its path in a layout. */
    std::string pathIn(uint8_t mode) const { return std::string(kNodeDirectories[mode]) + leaf; }
};

/** All nodes: those with fixed paths, then the others in the order in which they are logged. */
extern const NodeInfo NodePathTable[15];

/**
 * Decides which layout the driver has; touches no node itself.
 *
 * @param opens is asked, as long as the answer is open, whether a node can be opened for reading
 *     and writing.
 * @return the layout; nothing where there is no driver.
 */
std::optional<uint8_t> findDriverMode(const std::function<bool(const std::string& node)>& opens);

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
