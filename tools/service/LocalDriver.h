// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "MotorType.h"
#include "NodePathTable.h"
#include "service/Process.h"

#include <cstdint>
#include <string>
#include <vector>

namespace vibratorctl {

/**
 * The driver that this process sees, the kernel's or the simulated one, as a service would judge
 * it. It only looks: it writes nothing, and leaves nothing in a simulated driver's trace.
 */
class LocalDriver {
  public:
    /** @param opener who opens the nodes: the service's process, or else this one. */
    explicit LocalDriver(Process opener);

    /** A node as it is now. */
    struct Node {
        bool exists = false;
        /** Whether the opener may open it. */
        bool reads = false;
        bool writes = false;
        std::string mode;
        uid_t uid = 0;
        /** That user, "root" or a number. */
        std::string owner;
        /** Empty where this process cannot read it. */
        std::string value;

        /** @return the value without the newline that ends it. */
        std::string firstLine() const { return value.substr(0, value.find('\n')); }
    };
    /** @return a node of the driver's layout by its leaf, or any file by its path. */
    Node look(const std::string& name) const;
    /** @return the path of a node of the driver's layout. */
    std::string path(const std::string& leaf) const;

    /** @return whether a service finds a driver. */
    bool isUsable() const { return mIsUsable; }
    /** @return whether a driver is there, even if the service cannot open it. */
    bool isThere() const { return mIsThere; }
    /** @return the layout, a DriverMode; of what is there where the service finds none. */
    uint8_t mode() const { return mMode; }

    /** What is different in each layout. */
    struct Layout {
        const char* name;
        /** The node that starts the motor, and holds 0 when it does not move. */
        const char* start;
        /** The node whose number tells whether the motor counts as running. */
        const char* running;
        /** The command after which it does not. */
        const char* howToStop;
    };
    const Layout& layout() const;
    /** @return whether the motor counts as running. */
    bool isVibrating() const;
    /** @return whether external control is on. */
    bool isControlled() const { return look("ext_control").firstLine() == "1"; }

    struct Motor {
        int32_t number = 0;
        std::string name;
        /** How it is known. */
        std::string found;
        /** Path and name of the input device that vibrator-driver moves; empty for the kernel's. */
        std::string device;

        std::string inWords() const {
            return name + ", number " + std::to_string(number) + ", found " + found +
                   (device.empty() ? "" : "; through vibrator-driver, " + device);
        }
    };
    /** @return the motor of a usable driver. */
    Motor motor() const;
    /** @return the ladder of intensities of a usable driver; empty where there is none. */
    std::vector<uint32_t> ladder(uint32_t type) const;

    // What a service answers to a permitted caller; the names are those of IDaxVibrator.
    bool daxSupportsAmplitudeControl() const { return opens("intensity"); }
    bool daxSupportsForceTouchAmplitudeControl() const { return opens("force_touch_intensity"); }
    bool daxSupportsFrequencyControl() const { return opens("multi_freq"); }
    bool daxSupportsHapticEngine() const { return opens("haptic_engine"); }
    bool daxSupportsPrebakedHapticPattern() const { return opens("cp_trigger_index"); }
    bool daxSupportsFolderStatusSetting() const;
    bool daxSupportsEnhancedVelmoraHapticPattern() const;
    bool supportsExternalControl() const { return opens("ext_control"); }

  private:
    bool opens(const std::string& name) const;

    Process mOpener;
    bool mIsUsable = false;
    bool mIsThere = false;
    uint8_t mMode;
};

}  // namespace vibratorctl
