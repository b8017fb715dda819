// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>
#include <vector>

namespace driver {

/** An input device that offers force feedback. */
struct Device {
    std::string path;
    std::string name;
    /** Its kind, name and serial number, which stay when it is plugged in again. */
    std::string identity;
    /** The effect that is used: FF_RUMBLE, else FF_CONSTANT; 0: none. */
    int effect = 0;
    /** Whether it has a setting for the strength of all its effects. */
    bool hasGain = false;
    /** What it can do, in words. */
    std::string abilities;
    /** Why it cannot be used; empty if it can. */
    std::string problem;

    /** @return its path and name, and what it can do or why it cannot be used. */
    std::string inWords() const;
};

/** @return the force-feedback devices of this machine, in the order of their numbers. */
std::vector<Device> listDevices();

/**
 * @return the device with a path; for an empty path the only one that can be used.
 * @throw std::runtime_error that says why there is none, or which ones there are.
 */
Device chooseDevice(const std::string& path);

}  // namespace driver
