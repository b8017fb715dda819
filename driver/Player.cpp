// SPDX-License-Identifier: Apache-2.0
#include "Player.h"

#include "PrebakedPatterns.h"

#include <sys/timerfd.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <ctime>
#include <system_error>

namespace driver {
namespace {

// All times are in ms.

/** How long before its end the kernel's time for an effect is renewed. */
constexpr int64_t kMargin = 5000;
/** The longest time that the attributes show. */
constexpr int kForever = INT32_MAX;

/**
 * @return the time, rounded up. It goes on while the machine is suspended: what was to end
 * meanwhile does not begin again.
 */
int64_t now() {
    timespec time{};
    clock_gettime(CLOCK_BOOTTIME, &time);
    return time.tv_sec * 1000 + (time.tv_nsec + 999'999) / 1'000'000;
}

}  // namespace

Player::Player(Motor motor, Patterns patterns)
    : mMotor(std::move(motor)),
      mPatterns(std::move(patterns)),
      mTimer(timerfd_create(CLOCK_BOOTTIME, TFD_CLOEXEC)) {
    if (mTimer < 0) throw std::system_error(errno, std::generic_category(), "timerfd_create");
}

int Player::setText(const std::string& leaf, std::string_view text) {
    mTexts[leaf] = text;
    return 0;
}

uint64_t Player::timeLeft() const {
    // What was chosen is started whatever runs, although a running LED trigger ignores a start.
    return mChoice ? 0 : static_cast<uint64_t>(remaining());
}

int Player::perform(const model::Action& action) {
    if (const auto* run = std::get_if<model::RunMotor>(&action)) return start(run->milliseconds);
    if (const auto* intensity = std::get_if<model::SetIntensity>(&action)) {
        mStrength = intensity->value;
        return remaining() > 0 ? advance() : 0;
    }
    if (const auto* packets = std::get_if<model::SetPackets>(&action))
        mChoice = Performance{packets->packets, kFullStrength};
    if (const auto* pattern = std::get_if<model::SetPattern>(&action)) {
        mChoice.reset();
        // A queue follows this number, and tells which pattern.
        const bool isWhole = pattern->index != 0 && pattern->index != product::kQueueIndex;
        return isWhole ? choosePattern(pattern->index, {}, false) : 0;
    }
    if (const auto* queue = std::get_if<model::SetQueue>(&action)) {
        const int scale = std::clamp(queue->percent, 0, 100) * (kFullStrength / 100);
        return choosePattern(queue->pattern, scale, true);
    }
    if (const auto* control = std::get_if<model::SetExternalControl>(&action)) {
        mIsExternal = control->isOn;
        if (mIsExternal) return stop();
    }
    return 0;
}

int Player::choosePattern(int number, std::optional<int> scale, bool repeats) {
    if (number < 1 || static_cast<size_t>(number) > mPatterns.size()) return -EINVAL;
    mChoice = Performance{mPatterns[static_cast<size_t>(number) - 1], scale, repeats};
    return 0;
}

int Player::start(uint64_t milliseconds) {
    const auto choice = std::exchange(mChoice, {});
    if (milliseconds == 0) return stop();
    if (mIsExternal) return -EBUSY;
    if (const int error = mMotor.openAgain(); error != 0) return error;
    const auto length = static_cast<int>(std::min<uint64_t>(milliseconds, kForever));
    mPlayed = choice.value_or(Performance{{{length, kFullStrength, 0, 0}}});
    mStart = now();
    mLength = 0;
    for (model::Packet& packet : mPlayed.packets)
        mLength += packet.param0 = std::max(packet.param0, 0);
    return advance();
}

int Player::stop() {
    mPlayed = {};
    mLength = 0;
    setTimer(0);
    return mMotor.run(0, 0);
}

int64_t Player::remaining() const {
    if (!mMotor.isThere()) return 0;
    if (mPlayed.repeats) return kForever;
    return std::max<int64_t>(0, mStart + mLength - now());
}

int Player::advance() {
    const int64_t time = now();
    if (mPlayed.repeats && mLength > 0) mStart = time - (time - mStart) % mLength;
    int64_t end = mStart;
    const auto packet =
            std::find_if(mPlayed.packets.begin(), mPlayed.packets.end(),
                         [&](const model::Packet& each) { return (end += each.param0) > time; });
    if (packet == mPlayed.packets.end()) return stop();
    const int strength = scaled(std::clamp(packet->intensity, 0, kFullStrength),
                                mPlayed.scale.value_or(mStrength));
    setTimer(std::min(end, time + kMaxEffect - kMargin));
    const int error = mMotor.run(strength, remaining());
    if (error != 0) stop();
    return error;
}

void Player::setTimer(int64_t time) const {
    const itimerspec timer{{}, {time / 1000, time % 1000 * 1'000'000}};
    timerfd_settime(mTimer, TFD_TIMER_ABSTIME, &timer, nullptr);
}

}  // namespace driver
