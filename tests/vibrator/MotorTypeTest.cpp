// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include "MotorType.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class MotorTypeTest : public BothLayoutsTest {
  protected:
    MotorTypeTest() { start(GetParam()); }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(MotorTypeTest);

constexpr char kEnhanced[] = "daxSupportsEnhancedVelmoraHapticPattern";
const Lines kStart = {"D getMotorIndex return motor type >>"};

TEST_P(MotorTypeTest, NameGivesTheNumber) {
    const std::string names[] = {"NONE",          "COINDC",       "LINEAR",        "COINDC_PMIC",
                                 "COINDC_INDEX",  "LINEAR_INDEX", "LINEAR_0832RC", "LINEAR_1040",
                                 "LINEAR_RCVMOT", "LINEAR_1030"};
    for (int number = 0; number < 10; ++number) {
        const std::string& name = names[number];
        for (const std::string& text : {name + "\n", name}) {
            setNode("motor_type", text);
            EXPECT_EQ(VibratorPeer::getMotorIndex(*mVibrator), number) << text;
            EXPECT_EQ(log().back(),
                      "D getMotorIndex return motor type : " + std::to_string(number) + " <<");
        }
    }
}

TEST_P(MotorTypeTest, OnlyTheExactNameCounts) {
    const std::string texts[] = {"LINEAR_1040\n\n",
                                 "linear_1040\n",
                                 "LINEAR_1040 \n",
                                 " LINEAR_1040\n",
                                 "LINEAR_1040\r\n",
                                 "LINEAR_104\n",
                                 "LINEAR_10400\n",
                                 "\n",
                                 "9\n",
                                 std::string(40, 'L')};
    for (const std::string& text : texts) {
        setNode("motor_type", text);
        EXPECT_EQ(VibratorPeer::getMotorIndex(*mVibrator), 0) << testing::PrintToString(text);
        EXPECT_EQ(log().back(), "D getMotorIndex return motor type : 0 <<");
        EXPECT_FALSE(mVibrator->daxSupportsEnhancedVelmoraHapticPattern());
        EXPECT_EQ(log().back(),
                  std::string("D ") + kEnhanced + " can not supports. Out of capability");
    }
    // What follows a zero byte, or the 31st byte, is not looked at.
    setNode("motor_type", std::string("LINEAR\0_1040\n", 13));
    EXPECT_EQ(VibratorPeer::getMotorIndex(*mVibrator), 2);
}

TEST_P(MotorTypeTest, EmptyNameIsNoMotor) {
    setNode("motor_type", "");
    errno = 0;
    EXPECT_EQ(VibratorPeer::getMotorIndex(*mVibrator), 0);
    EXPECT_EQ(log(),
              join({kStart,
                    {"E getMotorIndex node: " + path("motor_type") + " read failed. errno: 0"}}));
    EXPECT_FALSE(mVibrator->daxSupportsEnhancedVelmoraHapticPattern());
    fail("motor_type", "open", "EACCES", 1);
    EXPECT_EQ(VibratorPeer::getMotorIndex(*mVibrator), 0);
    EXPECT_EQ(log().back(),
              "E getMotorIndex node: " + path("motor_type") + " open failed. errno: 13");
}

TEST_P(MotorTypeTest, FeaturesGiveTheNumberOtherwise) {
    const struct {
        std::set<std::string> without;
        bool unnamed;
        int number;
        std::vector<std::string> asked;
    } cases[] = {
            {{}, false, 5, {"cp_trigger_index", "haptic_engine"}},
            {{"haptic-engine"}, false, 9, {"cp_trigger_index", "haptic_engine"}},
            {{"prebaked"}, false, 7, {"cp_trigger_index", "haptic_engine", "motor_type"}},
            {{"prebaked", "motor-name"},
             true,
             7,
             {"cp_trigger_index", "haptic_engine", "motor_type", "haptic_engine"}},
            {{"prebaked", "haptic-engine"},
             false,
             2,
             {"cp_trigger_index", "haptic_engine", "intensity"}},
            {{"prebaked", "haptic-engine", "intensity"},
             false,
             1,
             {"cp_trigger_index", "haptic_engine", "intensity"}},
    };
    for (const auto& [without, unnamed, number, asked] : cases) {
        start(GetParam(), without);
        EXPECT_EQ(VibratorPeer::getMotorIndexbyMethod(*mVibrator), number);
        std::vector<std::string> opened;
        for (const std::string& line : trace()) {
            const size_t leaf = line.find('/') + 1;
            const std::string name = line.substr(leaf, line.find(' ') - leaf);
            if (line.find(" open ") != std::string::npos &&
                (opened.empty() || opened.back() != name)) {
                opened.push_back(name);
            }
        }
        EXPECT_EQ(opened, asked);
        const Lines lines = log();
        EXPECT_EQ(lines.front(), "D getMotorIndexbyMethod >> ");
        EXPECT_EQ(lines.back(), "D getMotorIndexbyMethod : " + std::to_string(number) + " <<");
    }
    start(GetParam(), {"prebaked"});
    setNode("motor_type", "LINEAR_0832RC\n");
    EXPECT_EQ(VibratorPeer::getMotorIndexbyMethod(*mVibrator), 6);
}

TEST_P(MotorTypeTest, WithoutANameTheEngineDecidesOnEnhancedPatterns) {
    removeNode("motor_type");
    const Lines probe = {"D isNodeExistForRead node:" + path("motor_type") + " ", "D false"};
    EXPECT_TRUE(mVibrator->daxSupportsEnhancedVelmoraHapticPattern());
    EXPECT_EQ(log(), join({probe,
                           probeLog("haptic_engine", true),
                           {std::string("E ") + kEnhanced + " Enhanced supports motor"}}));
    removeNode("haptic_engine");
    EXPECT_FALSE(mVibrator->daxSupportsEnhancedVelmoraHapticPattern());
    EXPECT_EQ(log(), join({probe,
                           probeLog("haptic_engine", false),
                           {std::string("E ") + kEnhanced + " not supports"}}));
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
