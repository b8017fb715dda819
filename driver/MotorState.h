// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Patterns.h"
#include "Player.h"

#include <map>
#include <optional>
#include <string>

namespace driver {

/** The attributes' texts in memory, and a motor that does what they ask for. */
class MotorState : public model::State {
  public:
    MotorState(Player& player, Patterns patterns);

    std::string text(const std::string& leaf) const override;
    int setText(const std::string& leaf, std::string_view text) override;
    uint64_t timeLeft() const override;
    int perform(const model::Action& action) override;

  private:
    int act(std::monostate) { return 0; }
    int act(const model::RunMotor& action);
    int act(const model::SetIntensity& action);
    int act(const model::SetPackets& action);
    int act(const model::SetPattern& action);
    int act(const model::SetQueue& action);
    int act(const model::SetExternalControl& action);
    int choosePattern(int number, std::optional<uint32_t> scale, bool repeats);

    Player& mPlayer;
    const Patterns mPatterns;
    std::map<std::string, std::string> mTexts;
    /** For the next start; without it the motor just runs. */
    std::optional<Performance> mChoice;
    bool mIsExternal = false;
};

}  // namespace driver
