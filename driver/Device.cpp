// SPDX-License-Identifier: Apache-2.0
#include "Device.h"

#include <fcntl.h>
#include <libevdev/libevdev.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <sys/sysmacros.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <optional>
#include <stdexcept>

namespace driver {
namespace {

namespace fs = std::filesystem;

constexpr char kDirectory[] = "/dev/input";

/** @return the first line of a file; empty if there is none. */
std::string firstLine(const std::string& path) {
    std::string line;
    std::getline(std::ifstream(path), line);
    return line;
}

/** @return what can be known of a device that cannot be opened; nothing if it has no motor. */
std::optional<Device> describe(const std::string& path, int error) {
    struct stat info {};
    if (stat(path.c_str(), &info) != 0) return std::nullopt;
    const std::string properties = "/sys/dev/char/" + std::to_string(major(info.st_rdev)) + ":" +
                                   std::to_string(minor(info.st_rdev)) + "/device/";
    const std::string bits = firstLine(properties + "capabilities/ff");
    if (bits.find_first_not_of("0 ") == std::string::npos) return std::nullopt;
    Device device;
    device.path = path;
    device.name = firstLine(properties + "name");
    device.problem = strerror(error);
    if (error == EACCES) {
        device.problem += "; log in at the seat that it belongs to, or join the group \"input\"";
    }
    return device;
}

/** Asks an open device. */
Device ask(const std::string& path, const libevdev* events, int effects) {
    const auto has = [&](unsigned code) {
        return libevdev_has_event_code(events, EV_FF, code) != 0;
    };
    Device device;
    device.path = path;
    device.name = libevdev_get_name(events);
    const char* serial = libevdev_get_uniq(events);
    for (const int number : {libevdev_get_id_bustype(events), libevdev_get_id_vendor(events),
                             libevdev_get_id_product(events)})
        device.identity += std::to_string(number) + ":";
    device.identity += device.name + ":" + (serial == nullptr ? "" : serial);
    // The kernel also offers rumble for a device that plays sine waves, and turns it into those.
    device.effect = has(FF_RUMBLE) ? FF_RUMBLE : has(FF_CONSTANT) ? FF_CONSTANT : 0;
    device.hasGain = has(FF_GAIN);
    device.effects = effects;
    if (device.effect == 0) {
        device.problem = "it plays neither rumble nor constant forces";
    } else if (effects == 0) {
        device.problem = "it holds no effects";
    }
    return device;
}

/** @return the device with a path, if it has a motor. */
std::optional<Device> examine(const std::string& path) {
    const int file = open(path.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK);
    if (file < 0) return describe(path, errno);
    std::optional<Device> device;
    libevdev* events = nullptr;
    if (libevdev_new_from_fd(file, &events) == 0) {
        int effects = 0;
        ioctl(file, EVIOCGEFFECTS, &effects);
        if (libevdev_has_event_type(events, EV_FF) != 0) device = ask(path, events, effects);
        libevdev_free(events);
    }
    close(file);
    return device;
}

}  // namespace

std::string Device::inWords() const {
    if (!problem.empty()) return problem;
    return std::string(effect == FF_RUMBLE ? "rumble, " : "constant forces, ") +
           (hasGain ? "gain, " : "no gain, ") + std::to_string(effects) +
           (effects == 1 ? " effect" : " effects");
}

std::vector<Device> listDevices() {
    std::vector<std::string> paths;
    std::error_code error;
    for (const auto& entry : fs::directory_iterator(kDirectory, error)) {
        if (entry.path().filename().string().rfind("event", 0) == 0) paths.push_back(entry.path());
    }
    std::sort(paths.begin(), paths.end(), [](const std::string& a, const std::string& b) {
        return a.size() != b.size() ? a.size() < b.size() : a < b;
    });
    std::vector<Device> devices;
    for (const std::string& path : paths) {
        if (std::optional<Device> device = examine(path)) devices.push_back(std::move(*device));
    }
    return devices;
}

Device chooseDevice(const std::string& path) {
    std::vector<Device> devices;
    if (path.empty()) {
        devices = listDevices();
    } else if (std::optional<Device> device = examine(path)) {
        devices.push_back(std::move(*device));
    } else {
        const bool isThere = access(path.c_str(), F_OK) == 0;
        throw std::runtime_error("\"" + path +
                                 "\": " + (isThere ? "no force-feedback device" : strerror(errno)) +
                                 "; \"vibrator-driver list\" lists the motors");
    }
    if (devices.empty()) {
        throw std::runtime_error(
                "this machine has no force-feedback motor; plug one in, like a game "
                "controller with rumble");
    }
    const auto isUsable = [](const Device& device) { return device.problem.empty(); };
    const auto usable = std::find_if(devices.begin(), devices.end(), isUsable);
    if (std::count_if(devices.begin(), devices.end(), isUsable) == 1) return *usable;
    std::string devicesInWords;
    for (const Device& device : devices) {
        devicesInWords += (devicesInWords.empty() ? "" : "; ") + device.path + ", \"" +
                          device.name + "\" (" + device.inWords() + ")";
    }
    throw std::runtime_error((usable == devices.end() ? "no motor can be used: "
                                                      : "choose a motor with --device: ") +
                             devicesInWords);
}

}  // namespace driver
