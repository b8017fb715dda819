// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** Overrides what operations call of the same object: notes the call, and does nothing else. */
class Noting : public Vibrator {
  public:
    Return<Status> on(uint32_t timeoutMs) override {
        mCalls.push_back("on " + std::to_string(timeoutMs));
        return Status::OK;
    }
    Return<Status> setAmplitude(uint8_t amplitude) override {
        mCalls.push_back("setAmplitude " + std::to_string(amplitude));
        return Status::OK;
    }
    Return<bool> daxSupportsAmplitudeControl() override { return note("intensity"); }
    Return<bool> daxSupportsHapticEngine() override { return note("engine"); }
    Return<bool> daxSupportsPrebakedHapticPattern() override { return note("prebaked"); }
    Return<bool> daxSupportsEnhancedVelmoraHapticPattern() override { return note("enhanced"); }

    /** The calls, and what the queries answer. */
    Lines mCalls;
    std::set<std::string> mFeatures;

  private:
    bool note(const std::string& query) {
        mCalls.push_back(query + "?");
        return mFeatures.count(query) != 0;
    }
};

TEST_F(VibratorTest, InnerCallsAreVirtual) {
    start(Layout::kTimedOutput);
    const android::sp<Noting> vibrator = new Noting;
    const auto ignore = [](auto...) {};
    using Click = ::android::hardware::vibrator::V1_0::Effect;
    const struct {
        const char* name;
        std::function<void()> call;
        Lines inner;
        std::set<std::string> features = {};
    } cases[] = {
            {"perform",
             [&] { vibrator->perform(Click::CLICK, EffectStrength::LIGHT, ignore); },
             {"on 20", "setAmplitude 36"}},
            {"supportsAmplitudeControl",
             [&] { vibrator->supportsAmplitudeControl(); },
             {"intensity?"}},
            {"setAmplitude", [&] { vibrator->Vibrator::setAmplitude(1); }, {"intensity?"}},
            {"pattern",
             [&] { vibrator->daxPerformPrebakedHapticPattern(3, 1, false); },
             {"on 1000"}},
            {"queue", [&] { vibrator->daxPerformPrebakedHapticPattern(3, 1, true); }, {"on 1000"}},
            {"engine", [&] { vibrator->daxPerformHapticEngine({}, 1); }, {"on 1"}},
            {"motor",
             [&] { vibrator->getMotorIndexbyMethod(); },
             {"prebaked?", "engine?", "intensity?"}},
            {"motor of an index",
             [&] { vibrator->getMotorIndexbyMethod(); },
             {"prebaked?", "engine?"},
             {"prebaked"}},
            {"motor of an engine",
             [&] { vibrator->getMotorIndexbyMethod(); },
             {"prebaked?", "engine?", "enhanced?"},
             {"engine"}},
            {"enhanced",
             [&] {
                 THE_DEVICE_MOTOR_TYPE.clear();
                 vibrator->Vibrator::daxSupportsEnhancedVelmoraHapticPattern();
             },
             {"engine?"}},
    };
    for (const auto& each : cases) {
        vibrator->mCalls.clear();
        vibrator->mFeatures = each.features;
        each.call();
        EXPECT_EQ(vibrator->mCalls, each.inner) << each.name;
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
