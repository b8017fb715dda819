// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include <set>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** Overrides what operations call of the same object: notes the call, and does nothing else. */
class Noting : public Vibrator {
  public:
    Return<Status> on(uint32_t ms) override { return note("on " + std::to_string(ms)); }
    Return<Status> setAmplitude(uint8_t amplitude) override {
        return note("setAmplitude " + std::to_string(amplitude));
    }
    Return<bool> daxSupportsAmplitudeControl() override { return ask("intensity?"); }
    Return<bool> daxSupportsHapticEngine() override { return ask("engine?"); }
    Return<bool> daxSupportsPrebakedHapticPattern() override { return ask("prebaked?"); }
    Return<bool> daxSupportsEnhancedVelmoraHapticPattern() override { return ask("enhanced?"); }

    std::string mCalls;
    /** The one question that is answered with yes. */
    std::string mYes;

  private:
    Status note(const std::string& call) {
        mCalls += call + "; ";
        return Status::OK;
    }
    bool ask(const std::string& question) {
        note(question);
        return question == mYes;
    }
};

TEST_F(VibratorTest, InnerCallsAreVirtual) {
    start(Layout::kTimedOutput);
    const android::sp<Noting> vibrator = new Noting;
    const Call click = CALL(perform)(0, 0);
    const struct {
        std::function<void()> call;
        std::string inner;
        std::string yes = {};
    } cases[] = {
            {[&] { click(*vibrator); }, "on 20; setAmplitude 36; "},
            {[&] { vibrator->supportsAmplitudeControl(); }, "intensity?; "},
            {[&] { vibrator->Vibrator::setAmplitude(1); }, "intensity?; "},
            {[&] { vibrator->daxPerformPrebakedHapticPattern(3, 1, false); }, "on 1000; "},
            {[&] { vibrator->daxPerformPrebakedHapticPattern(3, 1, true); }, "on 1000; "},
            {[&] { vibrator->daxPerformHapticEngine({}, 1); }, "on 1; "},
            {[&] { vibrator->getMotorIndexbyMethod(); }, "prebaked?; engine?; intensity?; "},
            {[&] { vibrator->getMotorIndexbyMethod(); }, "prebaked?; engine?; ", "prebaked?"},
            {[&] { vibrator->getMotorIndexbyMethod(); }, "prebaked?; engine?; enhanced?; ",
             "engine?"},
            {[&] {
                 THE_DEVICE_MOTOR_TYPE.clear();
                 vibrator->Vibrator::daxSupportsEnhancedVelmoraHapticPattern();
             },
             "engine?; "},
    };
    for (const auto& each : cases) {
        vibrator->mCalls.clear();
        vibrator->mYes = each.yes;
        each.call();
        EXPECT_EQ(vibrator->mCalls, each.inner);
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
