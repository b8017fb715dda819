// SPDX-License-Identifier: Apache-2.0
#include "Player.h"

#include <sys/timerfd.h>

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <limits>
#include <system_error>

namespace driver {
namespace {

constexpr int64_t kMillisecond = 1'000'000;
constexpr int64_t kSecond = 1000 * kMillisecond;
/** How long before its end the kernel's time for an effect is renewed. */
constexpr int64_t kMargin = 5 * kSecond;

/** Goes on while the machine is suspended: what was to end meanwhile does not begin again. */
int64_t now() {
    timespec time{};
    clock_gettime(CLOCK_BOOTTIME, &time);
    return time.tv_sec * kSecond + time.tv_nsec;
}

/** @return how long a packet lasts, in ns. */
int64_t lengthOf(const model::Packet& packet) {
    return std::max(packet.param0, 0) * kMillisecond;
}

int64_t lengthOf(const std::vector<model::Packet>& packets) {
    int64_t length = 0;
    for (const model::Packet& packet : packets)
        length += lengthOf(packet);
    return length;
}

}  // namespace

Player::Player(const Device& device)
    : mTimer(timerfd_create(CLOCK_BOOTTIME, TFD_CLOEXEC)), mMotor(device) {
    if (mTimer < 0) throw std::system_error(errno, std::generic_category(), "timerfd_create");
}

int Player::start(Performance performance) {
    if (!mMotor.openAgain()) return -ENODEV;
    mPlayed = std::move(performance);
    mStart = now();
    return advance();
}

int Player::setStrength(uint32_t strength) {
    mStrength = strength;
    return remaining() > 0 && !mPlayed.scale ? advance() : 0;
}

void Player::stop() {
    mPlayed = {};
    mMotor.stop();
    setTimer(0);
}

int64_t Player::remaining() const {
    if (!mMotor.isThere()) return 0;
    if (mPlayed.repeats) return std::numeric_limits<int32_t>::max();
    const int64_t left = mStart + lengthOf(mPlayed.packets) - now();
    return std::max<int64_t>(0, (left + kMillisecond - 1) / kMillisecond);
}

int Player::advance() {
    const int64_t time = now();
    const int64_t length = lengthOf(mPlayed.packets);
    if (mPlayed.repeats && length > 0) mStart = time - (time - mStart) % length;
    int64_t end = mStart;
    const auto packet =
            std::find_if(mPlayed.packets.begin(), mPlayed.packets.end(),
                         [&](const model::Packet& each) { return (end += lengthOf(each)) > time; });
    if (packet == mPlayed.packets.end()) return stop(), 0;
    const auto intensity = static_cast<uint32_t>(std::clamp(packet->intensity, 0, kFullStrength));
    const uint32_t strength = scaled(intensity, mPlayed.scale.value_or(mStrength));
    int error = 0;
    if (strength == 0) {
        mMotor.stop();
    } else {
        error = mMotor.run(strength, remaining());
    }
    // A kernel that ends the effect by itself does so not before the motor is stopped.
    if (error == 0)
        setTimer(std::min(end, time + kLongestEffect * kMillisecond - kMargin));
    else
        stop();
    return error;
}

void Player::setTimer(int64_t time) const {
    itimerspec timer{};
    timer.it_value.tv_sec = time / kSecond;
    timer.it_value.tv_nsec = time % kSecond;
    timerfd_settime(mTimer, TFD_TIMER_ABSTIME, &timer, nullptr);
}

}  // namespace driver
