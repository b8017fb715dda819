// SPDX-License-Identifier: Apache-2.0
#include "Motor.h"

#include "text/Text.h"

#include <fcntl.h>
#include <libevdev/libevdev.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <stdexcept>
#include <vector>

namespace driver {
namespace {

namespace fs = std::filesystem;

/** @return the first line of a file; empty if there is none. */
std::string firstLine(const std::string& path) {
    std::string line;
    std::getline(std::ifstream(path), line);
    return line;
}

}  // namespace

Motor::Motor(const std::string& path, const std::string& properties)
    : mPath(path),
      mName(firstLine(properties + "/name")),
      mIdentity(firstLine(properties + "/modalias") + mName + firstLine(properties + "/uniq")),
      mFile(open(path.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK)) {
    ask(mFile.isValid() ? 0 : errno);
}

void Motor::ask(int error) {
    libevdev* device = nullptr;
    if (error == 0) error = -libevdev_new_from_fd(mFile.get(), &device);
    if (error != 0) mProblem = strerror(error);
    if (error == EACCES)
        mProblem += "; log in at the seat that it belongs to, or join the group \"input\"";
    if (error != 0) return;
    const auto has = [&](unsigned code) {
        return libevdev_has_event_code(device, EV_FF, code) != 0;
    };
    // The kernel also offers rumble for a device that plays sine waves, and turns it into those.
    mType = has(FF_RUMBLE) ? FF_RUMBLE : has(FF_CONSTANT) ? FF_CONSTANT : 0;
    mHasGain = has(FF_GAIN);
    libevdev_free(device);
    if (mType == 0) mProblem = "it plays neither rumble nor constant forces";
}

std::map<int, Motor> Motor::list() {
    std::map<int, Motor> motors;
    std::error_code error;
    for (const auto& entry : fs::directory_iterator("/sys/dev/char", error)) {
        const fs::path device = fs::canonical(entry.path(), error);
        int number = 0;
        if (sscanf(device.filename().c_str(), "event%d", &number) != 1) continue;
        const std::string properties = device / "device";
        if (firstLine(properties + "/capabilities/ff") == "0") continue;
        motors.emplace(number, Motor("/dev/input" / device.filename(), properties));
    }
    return motors;
}

Motor Motor::choose(const std::string& path) {
    std::error_code error;
    const fs::path asked = fs::canonical(path, error);
    std::vector<Motor> usable;
    std::string all;
    for (auto& [number, motor] : list()) {
        all += (all.empty() ? "" : "; ") + motor.inWords();
        if (motor.mProblem.empty() && (path.empty() || motor.mPath == asked))
            usable.push_back(std::move(motor));
    }
    if (usable.size() == 1) return std::move(usable[0]);
    throw std::runtime_error(
            (!path.empty()    ? cli::inQuotes(path) + " is no motor that can be used: "
             : usable.empty() ? "no motor can be used: "
                              : "choose a motor with --device: ") +
            (all.empty() ? "this machine has none; plug one in, like a game controller with rumble"
                         : all));
}

std::string Motor::inWords() const {
    const char* effect = mType == FF_RUMBLE ? "rumble" : "constant forces";
    return mPath + " " + cli::inQuotes(mName) + ": " + (mProblem.empty() ? effect : mProblem);
}

bool Motor::isThere() const {
    pollfd state{mFile.get(), 0, 0};
    return poll(&state, 1, 0) == 0;
}

int Motor::openAgain() {
    if (isThere()) return 0;
    for (auto& [number, motor] : list()) {
        if (motor.mIdentity != mIdentity || !motor.mProblem.empty()) continue;
        *this = std::move(motor);
        return 0;
    }
    return fail(ENODEV);
}

int Motor::fail(int error) const {
    std::cerr << "vibrator-driver: " << cli::inQuotes(mName) << ": "
              << (error == ENOSPC ? "other programs use all of its effects" : strerror(error))
              << std::endl;
    return -error;
}

bool Motor::send(int code, int value) const {
    input_event event{};
    event.type = EV_FF;
    event.code = static_cast<uint16_t>(code);
    event.value = value;
    return write(mFile.get(), &event, sizeof(event)) == sizeof(event);
}

int Motor::run(int strength, int64_t milliseconds) {
    if (strength == 0) {
        if (mEffect >= 0) send(mEffect, 0);
        return 0;
    }
    // What another program has set stays until somebody sets it again.
    if (mEffect < 0 && mHasGain) send(FF_GAIN, 0xffff);
    ff_effect effect{};
    effect.id = mEffect;
    effect.type = mType;
    if (mType == FF_RUMBLE) {
        const auto magnitude = static_cast<uint16_t>(scaled(strength, 0xffff));
        effect.u.rumble = {magnitude, magnitude};
    } else {
        effect.u.constant.level = static_cast<int16_t>(scaled(strength, 0x7fff));
    }
    effect.replay.length = static_cast<uint16_t>(std::clamp<int64_t>(milliseconds, 1, kMaxEffect));
    if (ioctl(mFile.get(), EVIOCSFF, &effect) != 0) return fail(errno);
    mEffect = effect.id;
    return send(mEffect, 1) ? 0 : fail(errno);
}

}  // namespace driver
