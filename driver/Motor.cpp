// SPDX-License-Identifier: Apache-2.0
#include "Motor.h"

#include <fcntl.h>
#include <sys/inotify.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iostream>
#include <system_error>
#include <utility>

namespace driver {
namespace {

/** @return a strength as a device has it, in proportion and rounded. */
uint32_t scaled(uint32_t strength, uint32_t full) {
    return (strength * full + kFullStrength / 2) / kFullStrength;
}

}  // namespace

Motor::Motor(Device device, Loop& loop, std::function<void()> whenLost)
    : mDevice(std::move(device)),
      mLoop(loop),
      mWhenLost(std::move(whenLost)),
      mChanges(inotify_init1(IN_CLOEXEC | IN_NONBLOCK)) {
    if (mChanges < 0) throw std::system_error(errno, std::generic_category(), "inotify_init1");
    const int error = open(mDevice.path);
    if (error != 0) throw std::system_error(error, std::generic_category(), mDevice.path);
    mLoop.watch(mChanges, POLLIN, [this] {
        char events[4096];
        while (read(mChanges, events, sizeof(events)) > 0) {
        }
        look();
    });
    look();
}

int Motor::open(const std::string& path) {
    mFile = ::open(path.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK);
    if (mFile < 0) return errno;
    mEffect = -1;
    // What another program has set stays until somebody sets it again.
    if (mDevice.hasGain) send(FF_GAIN, 0xffff);
    mLoop.watch(mFile, 0, [this] { lose(); });
    return 0;
}

/** Waits for changes of the devices, and opens the motor if it is back. */
void Motor::look() {
    // The directory is removed with the last device.
    inotify_add_watch(mChanges, "/dev", IN_CREATE);
    inotify_add_watch(mChanges, "/dev/input", IN_CREATE | IN_ATTRIB);
    if (isThere()) return;
    for (const Device& device : listDevices()) {
        if (device.identity != mDevice.identity || !device.problem.empty()) continue;
        if (open(device.path) != 0) continue;
        mDevice = device;
        std::cerr << "vibrator-driver: \"" << mDevice.name << "\" is back, as " << mDevice.path
                  << std::endl;
        return;
    }
}

void Motor::lose() {
    mLoop.forget(mFile);
    close(mFile);
    mFile = -1;
    mRuns = false;
    std::cerr << "vibrator-driver: \"" << mDevice.name << "\" was unplugged" << std::endl;
    mWhenLost();
    look();
}

int Motor::fail(int error) {
    if (error == ENODEV) {
        if (isThere()) lose();
    } else {
        std::cerr << "vibrator-driver: \"" << mDevice.name << "\": "
                  << (error == ENOSPC ? "other programs use all of its effects" : strerror(error))
                  << std::endl;
    }
    return -error;
}

bool Motor::send(uint16_t code, int32_t value) const {
    input_event event{};
    event.type = EV_FF;
    event.code = code;
    event.value = value;
    return write(mFile, &event, sizeof(event)) == sizeof(event);
}

int Motor::run(uint32_t strength, int64_t milliseconds) {
    if (!isThere()) return -ENODEV;
    ff_effect effect{};
    effect.id = mEffect;
    effect.type = static_cast<uint16_t>(mDevice.effect);
    if (effect.type == FF_RUMBLE) {
        const auto magnitude = static_cast<uint16_t>(scaled(strength, 0xffff));
        effect.u.rumble = {magnitude, magnitude};
    } else {
        effect.u.constant.level = static_cast<int16_t>(scaled(strength, 0x7fff));
    }
    effect.replay.length =
            static_cast<uint16_t>(std::clamp<int64_t>(milliseconds, 1, kLongestEffect));
    if (ioctl(mFile, EVIOCSFF, &effect) != 0) return fail(errno);
    // A change of the strength goes on without a gap. Only a length that is renewed needs a start.
    mEffect = effect.id;
    const uint32_t before = std::exchange(mStrength, strength);
    if (mRuns && before != strength) return 0;
    if (!send(static_cast<uint16_t>(mEffect), 1)) return fail(errno);
    mRuns = true;
    return 0;
}

void Motor::stop() {
    if (mRuns && !send(static_cast<uint16_t>(mEffect), 0)) fail(errno);
    mRuns = false;
}

}  // namespace driver
