// SPDX-License-Identifier: Apache-2.0
#include "service/System.h"

#include "SimulatedDriver.h"

#include <linux/input.h>
#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>

namespace vibratorctl {

namespace fs = std::filesystem;

System thisSystem() {
    const auto isThere = [](const char* path) { return access(path, F_OK) == 0; };
    if (!simulator::inheritedDirectory().empty()) {
        return {R"("vibrator-sim run" starts it on a simulated driver)",
                R"(end it, and "vibrator-sim run" again)", "", "$VIBRATOR_SIM_DIR/log"};
    }
    if (isThere("/system/build.prop")) {
        return {"start vendor.vibrator-2-1", "stop vendor.vibrator-2-1; start vendor.vibrator-2-1",
                R"("chown system system" in the service's .rc file)",
                "logcat -s QorVibrator-HAL2.1"};
    }
    if (isThere("/run/systemd/system") && (isThere("/lib/systemd/system/vibrator.service") ||
                                           isThere("/etc/systemd/system/vibrator.service"))) {
        // The unit gives the nodes to its user before each start.
        return {"systemctl start vibrator", "systemctl restart vibrator",
                "systemctl restart vibrator", "journalctl -u vibrator"};
    }
    return {"start vendor.velmora.hardware.vibrator@2.1-service",
            "end it, and start vendor.velmora.hardware.vibrator@2.1-service again", "",
            "the daemon's standard error"};
}

std::vector<std::string> forceFeedbackMotors() {
    std::vector<std::string> motors;
    std::error_code error;
    // A simulated driver stands for all of /sys.
    const fs::path devices = simulator::inheritedDirectory() + "/sys/class/input";
    for (const auto& each : fs::directory_iterator(devices, error)) {
        const std::string event = each.path().filename();
        uint64_t kinds = 0;
        std::ifstream(each.path() / "device/capabilities/ev") >> std::hex >> kinds;
        if (event.rfind("event", 0) != 0 || (kinds >> EV_FF & 1U) == 0) continue;
        std::string name;
        std::getline(std::ifstream(each.path() / "device/name"), name);
        motors.push_back(name + " (/dev/input/" + event + ")");
    }
    std::sort(motors.begin(), motors.end());
    return motors;
}

}  // namespace vibratorctl
