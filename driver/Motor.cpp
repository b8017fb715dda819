// SPDX-License-Identifier: Apache-2.0
#include "Motor.h"

#include <fcntl.h>
#include <linux/input.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iostream>
#include <system_error>
#include <utility>

namespace driver {

Motor::Motor(const Device& device) {
    if (!open(device)) throw std::system_error(errno, std::generic_category(), device.path);
}

bool Motor::open(const Device& device) {
    const int file = ::open(device.path.c_str(), O_RDWR | O_CLOEXEC | O_NONBLOCK);
    if (file < 0) return false;
    if (mFile >= 0) close(mFile);
    mDevice = device;
    mFile = file;
    mEffect = -1;
    mRuns = false;
    // What another program has set stays until somebody sets it again.
    if (mDevice.hasGain) send(FF_GAIN, 0xffff);
    return true;
}

bool Motor::isThere() const {
    pollfd state{mFile, 0, 0};
    return poll(&state, 1, 0) == 0;
}

bool Motor::openAgain() {
    if (isThere()) return true;
    for (const Device& device : listDevices()) {
        if (device.identity != mDevice.identity || !device.problem.empty()) continue;
        if (!open(device)) continue;
        std::cerr << "vibrator-driver: \"" << mDevice.name << "\" is back, as " << mDevice.path
                  << std::endl;
        return true;
    }
    return false;
}

int Motor::fail() const {
    const int error = errno;
    if (error != ENODEV) {
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
    if (ioctl(mFile, EVIOCSFF, &effect) != 0) return fail();
    // A change of the strength goes on without a gap. Only a length that is renewed needs a start.
    mEffect = effect.id;
    const uint32_t before = std::exchange(mStrength, strength);
    if (mRuns && before != strength) return 0;
    if (!send(static_cast<uint16_t>(mEffect), 1)) return fail();
    mRuns = true;
    return 0;
}

void Motor::stop() {
    if (mRuns && !send(static_cast<uint16_t>(mEffect), 0)) fail();
    mRuns = false;
}

}  // namespace driver
