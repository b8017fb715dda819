// SPDX-License-Identifier: Apache-2.0
#include "Device.h"

#include "text/Text.h"

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
#include <set>
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

/** Asks a device that could be opened what it can do. */
void ask(int file, Device& device) {
    int effects = 0;
    ioctl(file, EVIOCGEFFECTS, &effects);
    libevdev* events = nullptr;
    if (const int error = libevdev_new_from_fd(file, &events); error != 0) {
        device.problem = strerror(-error);
        return;
    }
    const auto has = [&](unsigned code) {
        return libevdev_has_event_code(events, EV_FF, code) != 0;
    };
    // The kernel also offers rumble for a device that plays sine waves, and turns it into those.
    device.effect = has(FF_RUMBLE) ? FF_RUMBLE : has(FF_CONSTANT) ? FF_CONSTANT : 0;
    device.hasGain = has(FF_GAIN);
    libevdev_free(events);
    device.abilities = std::string(device.effect == FF_RUMBLE ? "rumble, " : "constant forces, ") +
                       (device.hasGain ? "gain, " : "no gain, ") + std::to_string(effects) +
                       (effects == 1 ? " effect" : " effects");
    if (device.effect == 0) {
        device.problem = "it plays neither rumble nor constant forces";
    } else if (effects == 0) {
        device.problem = "it holds no effects";
    }
}

/** @return the device with a path, if it has a motor. */
std::optional<Device> examine(const std::string& path) {
    struct stat info {};
    if (stat(path.c_str(), &info) != 0) return std::nullopt;
    // What can be known without opening it.
    const std::string properties = "/sys/dev/char/" + std::to_string(major(info.st_rdev)) + ":" +
                                   std::to_string(minor(info.st_rdev)) + "/device/";
    const std::string bits = firstLine(properties + "capabilities/ff");
    if (bits.find_first_not_of("0 ") == std::string::npos) return std::nullopt;
    Device device;
    device.path = path;
    device.name = firstLine(properties + "name");
    device.identity =
            firstLine(properties + "modalias") + device.name + firstLine(properties + "uniq");
    const int file = open(path.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK);
    if (file < 0) {
        const int error = errno;
        device.problem = strerror(error);
        if (error == EACCES)
            device.problem +=
                    "; log in at the seat that it belongs to, or join the group \"input\"";
        return device;
    }
    ask(file, device);
    close(file);
    return device;
}

}  // namespace

std::string Device::inWords() const {
    return path + " " + cli::inQuotes(name) + ": " + (problem.empty() ? abilities : problem);
}

std::vector<Device> listDevices() {
    // By the length first, for event10 comes after event9.
    std::set<std::pair<size_t, std::string>> paths;
    std::error_code error;
    for (const auto& entry : fs::directory_iterator(kDirectory, error)) {
        const std::string path = entry.path();
        if (entry.path().filename().string().rfind("event", 0) == 0)
            paths.emplace(path.size(), path);
    }
    std::vector<Device> devices;
    for (const auto& [size, path] : paths) {
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
    for (const Device& device : devices)
        devicesInWords += (devicesInWords.empty() ? "" : "; ") + device.inWords();
    throw std::runtime_error((usable == devices.end() ? "no motor can be used: "
                                                      : "choose a motor with --device: ") +
                             devicesInWords);
}

}  // namespace driver
