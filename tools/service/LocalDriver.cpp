// SPDX-License-Identifier: Apache-2.0
#include "service/LocalDriver.h"

#include "Log.h"
#include "MotorType.h"
#include "NodePathTable.h"
#include "SimulatedDriver.h"
#include "TraceFile.h"

#include <fcntl.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>

namespace vibratorctl {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

LocalDriver::LocalDriver() {
    simulator::onlyLook();
    // Only the daemon logs.
    setenv("ANDROID_LOG_TAGS", (std::string(kLogTag) + ":S").c_str(), 1);
    mVibrator = new Vibrator();
    mIsUsable = !THE_DEVICE_INTENSITY.empty();
    mIsThere = mIsUsable || look(THE_DEVICE_ENABLE).exists || look(THE_DEVICE_ACTIVATE).exists;
    // The service's code ignores nodes that this user cannot open; doctor shows them.
    if (mIsUsable) return;
    DriverMode = look(THE_DEVICE_ENABLE).exists ? kTimedOutputMode : kLedTriggerMode;
    for (const NodeInfo& node : NodePathTable) {
        if (node.path != nullptr) *node.path = node.pathIn(DriverMode);
    }
}

LocalDriver::Node LocalDriver::look(const std::string& path) const {
    simulator::Node simulated;
    const std::string simulation = simulator::inheritedDirectory();
    const bool isSimulated =
            !simulation.empty() && simulator::findNode(simulation, path.c_str(), &simulated);
    struct stat info {};
    Node node;
    if (stat(isSimulated ? simulated.file.c_str() : path.c_str(), &info) != 0) return node;
    node.exists = true;
    const int readable = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    const int writable = open(path.c_str(), O_WRONLY | O_CLOEXEC | O_NONBLOCK);
    // Root may open any file, but the mode of a driver's attribute binds it, too.
    node.reads = (info.st_mode & 0444) != 0 && readable >= 0;
    node.writes = (info.st_mode & 0222) != 0 && writable >= 0;
    if (node.reads) {
        char text[512];
        const ssize_t size = read(readable, text, sizeof(text));
        node.value.assign(text, static_cast<size_t>(std::max<ssize_t>(size, 0)));
    }
    if (readable >= 0) close(readable);
    if (writable >= 0) close(writable);
    char mode[8];
    snprintf(mode, sizeof(mode), "%04o", info.st_mode & 07777);
    node.mode = mode;
    const passwd* user = getpwuid(info.st_uid);
    node.owner = user != nullptr ? user->pw_name : std::to_string(info.st_uid);
    return node;
}

std::string LocalDriver::layout() const {
    if (!mIsThere) return "none";
    return DriverMode == kTimedOutputMode ? "timed output" : "LED trigger";
}

std::string LocalDriver::directory() const {
    return THE_DEVICE_INTENSITY.substr(0, THE_DEVICE_INTENSITY.rfind('/') + 1);
}

bool LocalDriver::isVibrating() const {
    return mVibrator->isVibrating();
}

LocalDriver::Motor LocalDriver::motor() const {
    int32_t number = mVibrator->getMotorIndex();
    const char* found = "by the driver's name for it";
    if (number == kMotorNone) {
        number = mVibrator->getMotorIndexbyMethod();
        found = "by the features of the driver";
    }
    return {number, MotorTypeNames[number], found};
}

}  // namespace vibratorctl
