// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class OnOffTest : public BothLayoutsTest {
  protected:
    OnOffTest() { start(GetParam()); }
    bool isTimed() const { return GetParam() == Layout::kTimedOutput; }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(OnOffTest);

TEST_P(OnOffTest, OnHandsTheTimeToTheDriver) {
    for (const uint32_t ms : {0U, 1U, 2147483647U}) {
        EXPECT_EQ(Status(mVibrator->on(ms)), Status::OK);
        EXPECT_EQ(trace(), switchedOn(std::to_string(ms)));
    }
}

TEST_P(OnOffTest, TimeBeyondSignedRangeReachesTheDriverAsNegative) {
    const Status status = mVibrator->on(4294967295U);
    if (isTimed()) {
        EXPECT_EQ(status, Status::OK);
        EXPECT_EQ(trace(), written("enable", "-1\n"));
    } else {
        // The kernel's trigger takes unsigned numbers only.
        EXPECT_EQ(status, Status::UNKNOWN_ERROR);
        EXPECT_EQ(trace(),
                  join({written("state", "1\n"),
                        {"leds/duration open O_RDWR = 0",
                         "leds/duration write \"-1\\n\" = -1 EINVAL", "leds/duration close = 0"}}));
        EXPECT_EQ(log(), join({writeLog("state", 1),
                               writeLog("duration", -1, false),
                               {"E THE_DEVICE_DURATION is impossible"}}));
    }
}

TEST_P(OnOffTest, VibratingIsWhatTheDriverSays) {
    const std::string leaf = isTimed() ? "enable" : "duration";
    // With the timed output the remaining time is the driver's own, not what the file holds.
    const std::pair<std::string, bool> cases[] = {{"1\n", true},   {"2500", true}, {"0\n", false},
                                                  {"-1\n", false}, {"", false},    {"on\n", false}};
    if (!isTimed()) {
        for (const auto& [text, vibrating] : cases) {
            setNode(leaf, text);
            EXPECT_EQ(VibratorPeer::isVibrating(*mVibrator), vibrating) << text;
            EXPECT_EQ(trace(), read(leaf, text, 7));
            EXPECT_EQ(log(),
                      join({readLog(leaf),
                            {vibrating ? "D isVibrating : true" : "D isVibrating : false"}}));
        }
    }
    mVibrator->on(60000);
    EXPECT_TRUE(VibratorPeer::isVibrating(*mVibrator));
    removeNode(leaf);
    EXPECT_FALSE(VibratorPeer::isVibrating(*mVibrator));
}

class AmplitudeTest : public BothLayoutsTest {
  protected:
    AmplitudeTest() { start(GetParam()); }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(AmplitudeTest);

TEST_P(AmplitudeTest, MapsEveryAmplitudeByRoundingHalfUp) {
    for (int amplitude = 1; amplitude <= 255; ++amplitude) {
        ASSERT_EQ(Status(mVibrator->setAmplitude(static_cast<uint8_t>(amplitude))), Status::OK);
        // 1 + (amplitude - 1) * 9999 / 254, rounded half up, in whole numbers.
        const int intensity = 1 + ((amplitude - 1) * 9999 * 2 + 254) / 508;
        ASSERT_EQ(trace(), join({probed("intensity"),
                                 written("intensity", std::to_string(intensity) + "\n")}));
    }
    const std::pair<int, int> published[] = {{1, 1},      {2, 40},     {3, 80},     {36, 1379},
                                             {64, 2481},  {127, 4961}, {128, 5001}, {129, 5040},
                                             {192, 7520}, {254, 9961}, {255, 10000}};
    log();
    for (const auto& [amplitude, intensity] : published) {
        mVibrator->setAmplitude(static_cast<uint8_t>(amplitude));
        EXPECT_EQ(log(), join({probeLog("intensity", true),
                               {"D Setting amplitude to: " + std::to_string(intensity)},
                               writeLog("intensity", intensity)}));
    }
}

TEST_P(AmplitudeTest, ZeroIsBadValueOnlyWhereAmplitudesCanBeSet) {
    EXPECT_EQ(Status(mVibrator->setAmplitude(0)), Status::BAD_VALUE);
    EXPECT_EQ(trace(), probed("intensity"));
    EXPECT_EQ(log(),
              join({probeLog("intensity", true), {"E setAmplitude amplitude is BAD_VALUE 0"}}));
    removeNode("intensity");
    EXPECT_EQ(Status(mVibrator->setAmplitude(0)), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(trace(), missing("intensity"));
    EXPECT_EQ(log(), join({probeLog("intensity", false),
                           {"E setAmplitude is impossible because of intensity"}}));
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
