// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

namespace platform = ::android::hardware::vibrator;

class EffectPlaybackTest : public BothLayoutsTest {
  protected:
    EffectPlaybackTest() { start(GetParam()); }

    /** Takes the answer to a perform operation, which must come exactly once. */
    std::function<void(Status, uint32_t)> expect(Status status, uint32_t lengthMs) {
        mAnswers = 0;
        return [this, status, lengthMs](Status answered, uint32_t answeredMs) {
            EXPECT_EQ(answered, status);
            EXPECT_EQ(answeredMs, lengthMs);
            ++mAnswers;
        };
    }
    void performClick(uint8_t strength) {
        const Return<void> result =
                mVibrator->perform(platform::V1_0::Effect::CLICK,
                                   static_cast<EffectStrength>(strength), expect(Status::OK, 20));
        EXPECT_TRUE(result.isOk());
        EXPECT_EQ(mAnswers, 1);
    }

    int mAnswers = 0;
};
INSTANTIATE_FOR_BOTH_LAYOUTS(EffectPlaybackTest);

TEST_P(EffectPlaybackTest, ClickStartsTheMotorThenSetsItsStrength) {
    const std::pair<uint8_t, int> cases[] = {{0, 1379}, {1, 5001}, {2, 10000}};
    for (const auto& [strength, intensity] : cases) {
        performClick(strength);
        EXPECT_EQ(trace(), join({switchedOn("20"), probed("intensity"),
                                 written("intensity", std::to_string(intensity) + "\n")}));
        EXPECT_EQ(log(),
                  join({{"D perform start effect : 0, strength : " + std::to_string(strength)},
                        onLog(20),
                        probeLog("intensity", true),
                        {"D Setting amplitude to: " + std::to_string(intensity)},
                        writeLog("intensity", intensity),
                        {"D perform end effect"}}));
    }
}

TEST_P(EffectPlaybackTest, ClickIsReportedAsPlayedWhateverTheDriverDoes) {
    const std::string leaf = GetParam() == Layout::kTimedOutput ? "enable" : "state";
    removeNode(leaf);
    removeNode("intensity");
    performClick(1);
    EXPECT_EQ(log().back(), "D perform end effect");

    const CallerIdentity caller(2000);
    performClick(1);
    Lines lines = log();
    lines.erase(lines.begin(), lines.end() - 3);
    EXPECT_EQ(lines,
              (Lines{"E Pemission denied (2000)",
                     "E setAmplitude is impossible because of intensity", "D perform end effect"}));
}

TEST_P(EffectPlaybackTest, OtherEffectsAndStrengthsAreUnsupported) {
    const struct {
        uint32_t effect;
        uint8_t strength;
        Lines end;
    } cases[] = {{1, 0, {"D perform end effect"}},
                 {1, 3, {"D perform end effect"}},
                 {4294967295U, 1, {"D perform end effect"}},
                 {0, 3, {}},
                 {0, 255, {}}};
    for (const auto& [effect, strength, end] : cases) {
        mVibrator->perform(static_cast<platform::V1_0::Effect>(effect),
                           static_cast<EffectStrength>(strength),
                           expect(Status::UNSUPPORTED_OPERATION, 0));
        EXPECT_EQ(mAnswers, 1);
        EXPECT_EQ(log(),
                  join({{"D perform start effect : " + std::to_string(static_cast<int>(effect)) +
                         ", strength : " + std::to_string(strength)},
                        end}));
    }
    EXPECT_EQ(trace(), Lines());
}

TEST_P(EffectPlaybackTest, LaterVersionsPlayNothing) {
    const auto strong = EffectStrength::STRONG;
    mVibrator->perform_1_1(platform::V1_1::Effect_1_1::CLICK, strong,
                           expect(Status::UNSUPPORTED_OPERATION, 0));
    EXPECT_EQ(mAnswers, 1);
    mVibrator->perform_1_2(platform::V1_2::Effect::HEAVY_CLICK, strong,
                           expect(Status::UNSUPPORTED_OPERATION, 0));
    EXPECT_EQ(mAnswers, 1);
    mVibrator->perform_1_3(platform::V1_3::Effect::TEXTURE_TICK, static_cast<EffectStrength>(9),
                           expect(Status::UNSUPPORTED_OPERATION, 0));
    EXPECT_EQ(mAnswers, 1);
    EXPECT_EQ(trace(), Lines());
    EXPECT_EQ(log(), (Lines{"D perform_1_1 start effect : 0, strength : 2",
                            "D perform_1_2 start effect : 5, strength : 2",
                            "D perform_1_3 start effect : 21, strength : 9"}));
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
