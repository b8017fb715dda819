// SPDX-License-Identifier: Apache-2.0
#include "Player.h"

#include <sys/timerfd.h>
#include <unistd.h>

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

}  // namespace

Player::Player(Device device, Loop& loop)
    : mTimer(timerfd_create(CLOCK_BOOTTIME, TFD_CLOEXEC | TFD_NONBLOCK)),
      mMotor(std::move(device), loop, [this] { stop(); }) {
    if (mTimer < 0) throw std::system_error(errno, std::generic_category(), "timerfd_create");
    loop.watch(mTimer, POLLIN, [this] {
        uint64_t times = 0;
        if (read(mTimer, &times, sizeof(times)) == sizeof(times)) advance();
    });
}

int Player::start(Performance performance) {
    if (!mMotor.isThere()) return -ENODEV;
    mPlayed = std::move(performance);
    mIndex = 0;
    mNext = mEnd = now();
    for (const Segment& segment : mPlayed.segments)
        mEnd += segment.milliseconds * kMillisecond;
    mPlayed.repeats = mPlayed.repeats && mEnd > mNext;
    if (!mPlayed.segments.empty()) mNext += mPlayed.segments[0].milliseconds * kMillisecond;
    return advance();
}

int Player::setStrength(uint32_t strength) {
    mStrength = strength;
    return mIndex < mPlayed.segments.size() && !mPlayed.scale ? apply() : 0;
}

void Player::stop() {
    mPlayed = {};
    mIndex = 0;
    mMotor.stop();
    setTimer(0);
}

int64_t Player::remaining() const {
    if (mIndex >= mPlayed.segments.size()) return 0;
    if (mPlayed.repeats) return std::numeric_limits<int32_t>::max();
    return std::max<int64_t>(0, (mEnd - now() + kMillisecond - 1) / kMillisecond);
}

/** Has the motor do what the current segment says. @return 0, or a negative errno. */
int Player::apply() {
    if (mIndex >= mPlayed.segments.size()) return stop(), 0;
    const Segment& segment = mPlayed.segments[mIndex];
    const uint32_t strength =
            (segment.strength * mPlayed.scale.value_or(mStrength) + kFullStrength / 2) /
            kFullStrength;
    const int64_t left = std::min(remaining(), kLongestEffect);
    int error = 0;
    if (strength == 0) {
        mMotor.stop();
    } else {
        error = mMotor.run(strength, left);
    }
    // A kernel that ends the effect by itself does so not before the motor is stopped.
    if (error == 0)
        setTimer(std::min(mNext, now() + kLongestEffect * kMillisecond - kMargin));
    else
        stop();
    return error;
}

/** Goes on to the segment whose time it is. @return 0, or a negative errno. */
int Player::advance() {
    const int64_t time = now();
    while (mIndex < mPlayed.segments.size() && mNext <= time) {
        ++mIndex;
        if (mIndex == mPlayed.segments.size() && mPlayed.repeats) mIndex = 0;
        if (mIndex < mPlayed.segments.size())
            mNext += mPlayed.segments[mIndex].milliseconds * kMillisecond;
    }
    return apply();
}

void Player::setTimer(int64_t time) const {
    itimerspec timer{};
    timer.it_value.tv_sec = time / kSecond;
    timer.it_value.tv_nsec = time % kSecond;
    timerfd_settime(mTimer, TFD_TIMER_ABSTIME, &timer, nullptr);
}

}  // namespace driver
