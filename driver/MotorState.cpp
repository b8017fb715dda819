// SPDX-License-Identifier: Apache-2.0
#include "MotorState.h"

#include "PrebakedPatterns.h"

#include <algorithm>
#include <cerrno>
#include <limits>

namespace driver {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

MotorState::MotorState(Player& player, Patterns patterns)
    : mPlayer(player), mPatterns(std::move(patterns)) {}

std::string MotorState::text(const std::string& leaf) const {
    const auto found = mTexts.find(leaf);
    return found == mTexts.end() ? "" : found->second;
}

int MotorState::setText(const std::string& leaf, std::string_view text) {
    mTexts[leaf] = text;
    return 0;
}

uint64_t MotorState::timeLeft() const {
    // What was chosen is started whatever runs, although a running LED trigger ignores a start.
    return mChoice ? 0 : static_cast<uint64_t>(mPlayer.remaining());
}

int MotorState::perform(const model::Action& action) {
    return std::visit([this](const auto& each) { return act(each); }, action);
}

int MotorState::act(const model::RunMotor& action) {
    constexpr uint64_t kMost = std::numeric_limits<int32_t>::max();
    const auto milliseconds = static_cast<int>(std::min(action.milliseconds, kMost));
    Performance performance{{{milliseconds, kFullStrength, 0, 0}}};
    if (mChoice) performance = std::move(*mChoice);
    mChoice.reset();
    if (milliseconds == 0) return mPlayer.stop(), 0;
    return mIsExternal ? -EBUSY : mPlayer.start(std::move(performance));
}

int MotorState::act(const model::SetIntensity& action) {
    return mPlayer.setStrength(static_cast<uint32_t>(action.value));
}

int MotorState::act(const model::SetPackets& action) {
    mChoice = Performance{action.packets, kFullStrength};
    return 0;
}

int MotorState::act(const model::SetPattern& action) {
    mChoice.reset();
    // The queue follows, and tells which one.
    if (action.index == 0 || action.index == product::kQueueIndex) return 0;
    return choosePattern(action.index, {}, false);
}

int MotorState::act(const model::SetQueue& action) {
    const int strength = std::clamp(action.percent, 0, 100) * (kFullStrength / 100);
    return choosePattern(action.pattern, static_cast<uint32_t>(strength), true);
}

int MotorState::choosePattern(int number, std::optional<uint32_t> scale, bool repeats) {
    if (number < 1 || static_cast<size_t>(number) > mPatterns.size()) return -EINVAL;
    mChoice = Performance{mPatterns[static_cast<size_t>(number) - 1], scale, repeats};
    return 0;
}

int MotorState::act(const model::SetExternalControl& action) {
    mIsExternal = action.isOn;
    if (mIsExternal) mPlayer.stop();
    return 0;
}

}  // namespace driver
