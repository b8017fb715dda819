// SPDX-License-Identifier: Apache-2.0
#include "service/LocalDriver.h"

#include "AmplitudeLists.h"
#include "FolderStatus.h"
#include "SimulatedDriver.h"
#include "TextNode.h"

#include <fcntl.h>
#include <unistd.h>
#include <utils/UniqueFd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <utility>

namespace vibratorctl {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

namespace {

/** What is different in each layout, indexed by DriverMode. */
constexpr LocalDriver::Layout kLayouts[] = {
        {"timed output", "enable", "enable", "vibratorctl off"},
        // Switching the LED trigger off does not reset its duration.
        {"LED trigger", "activate", "duration", "vibratorctl on 0"},
};

/** @return what a node shows; empty where this process cannot read it. */
std::string readNode(const std::string& path, const simulator::Node* simulated) {
    if (simulated != nullptr) {
        const ::android::UniqueFd file(simulator::openNode(*simulated, O_RDONLY));
        return file.isValid() ? simulator::show(*simulated) : "";
    }
    char text[512];
    const ::android::UniqueFd file(open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK));
    const ssize_t size = read(file.get(), text, sizeof(text));
    return {text, static_cast<size_t>(std::max<ssize_t>(size, 0))};
}

}  // namespace

LocalDriver::LocalDriver(Process opener) : mOpener(std::move(opener)) {
    const auto found = findDriverMode([this](const std::string& node) { return opens(node); });
    const bool isTimed = look(THE_DEVICE_ENABLE).exists;
    mIsUsable = found.has_value();
    mIsThere = isTimed || look(THE_DEVICE_ACTIVATE).exists;
    mMode = found.value_or(isTimed ? kTimedOutputMode : kLedTriggerMode);
}

std::string LocalDriver::path(const std::string& leaf) const {
    return kNodeDirectories[mMode] + leaf;
}

LocalDriver::Node LocalDriver::look(const std::string& name) const {
    std::string path = name[0] == '/' ? name : this->path(name);
    simulator::Node simulated;
    const std::string simulation = simulator::inheritedDirectory();
    const bool isSimulated =
            !simulation.empty() && simulator::findNode(simulation, path.c_str(), &simulated);
    // The packaged service sees those of vibrator-driver there.
    constexpr std::string_view kClasses = "/sys/class";
    const std::string driver = "/run/vibrator-driver/class";
    if (!isSimulated && path.find(kClasses) == 0 && access(driver.c_str(), F_OK) == 0) {
        path.replace(0, kClasses.size(), driver);
    }
    struct stat info {};
    Node node;
    if (stat(((isSimulated ? simulation : "") + path).c_str(), &info) != 0) return node;
    node.exists = true;
    node.reads = mOpener.mayOpen(info, S_IROTH);
    node.writes = mOpener.mayOpen(info, S_IWOTH);
    node.value = readNode(path, isSimulated ? &simulated : nullptr);
    char mode[8];
    snprintf(mode, sizeof(mode), "%04o", info.st_mode & 07777);
    node.mode = mode;
    node.uid = info.st_uid;
    node.owner = info.st_uid == 0 ? "root" : std::to_string(info.st_uid);
    return node;
}

bool LocalDriver::opens(const std::string& name) const {
    const Node node = look(name);
    return node.reads && node.writes;
}

const LocalDriver::Layout& LocalDriver::layout() const {
    return kLayouts[mMode];
}

bool LocalDriver::isVibrating() const {
    return atoi(look(layout().running).value.c_str()) > 0;
}

bool LocalDriver::daxSupportsFolderStatusSetting() const {
    return opens("event_cmd") &&
           takesFolderStatus(textOf(look("event_cmd").value.substr(0, kFolderTextSize)));
}

bool LocalDriver::daxSupportsEnhancedVelmoraHapticPattern() const {
    const Node node = look("motor_type");
    if (!node.reads) return daxSupportsHapticEngine();
    return motorOfName(textOf(node.value.substr(0, kMotorNameSize))) == kMotorLinear1040;
}

LocalDriver::Motor LocalDriver::motor() const {
    MotorType number = kMotorNone;
    const char* found = "by the driver's name for it";
    if (opens("motor_type")) {
        number = motorOfName(textOf(look("motor_type").value.substr(0, kMotorNameSize)));
    }
    if (number == kMotorNone) {
        number = motorOfFeatures(*this);
        found = "by the features of the driver";
    }
    return {number, MotorTypeNames[number], found, look("input_device").firstLine()};
}

std::vector<uint32_t> LocalDriver::ladder(uint32_t type) const {
    using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
    return selectAmplitudeList(motor().number, static_cast<DaxAmplitudeType>(type),
                               daxSupportsPrebakedHapticPattern());
}

}  // namespace vibratorctl
