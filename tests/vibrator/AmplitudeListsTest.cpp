// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

using List = std::vector<uint32_t>;

const List kW = {0, 1000, 5000, 9000};
const List kX = {0, 2000, 4000, 6000, 8000, 10000};
const List kY = {0, 3400, 4900, 6500, 8200, 10000};
const List kZ = {0, 3000, 4000, 6000, 8000, 10000};

class AmplitudeListsTest : public BothLayoutsTest {
  protected:
    AmplitudeListsTest() { start(GetParam()); }

    /** @return the list; empty where there is none. */
    List ask(uint32_t type) {
        int answers = 0;
        List answer;
        const Return<void> result =
                mVibrator->daxGetAmplitudeList(static_cast<DaxAmplitudeType>(type),
                                               [&](bool supported, const hidl_vec<uint32_t>& list) {
                                                   answer = list;
                                                   EXPECT_EQ(supported, !answer.empty());
                                                   ++answers;
                                               });
        EXPECT_TRUE(result.isOk());
        EXPECT_EQ(answers, 1);
        return answer;
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(AmplitudeListsTest);

TEST_P(AmplitudeListsTest, MotorAndTypeSelectTheList) {
    const struct {
        std::string motor;
        List type0;
        List type1;
    } cases[] = {{"COINDC", {}, {}},       {"LINEAR", kX, kY},        {"COINDC_PMIC", kW, kW},
                 {"COINDC_INDEX", {}, {}}, {"LINEAR_INDEX", kZ, kX},  {"LINEAR_0832RC", kZ, kX},
                 {"LINEAR_1040", kZ, kX},  {"LINEAR_RCVMOT", kX, kY}, {"LINEAR_1030", kX, kX}};
    for (const auto& [motor, type0, type1] : cases) {
        setNode("motor_type", motor + "\n");
        EXPECT_EQ(ask(0), type0) << motor;
        EXPECT_EQ(ask(1), type1) << motor;
    }
    // For the last motor it matters whether patterns can be selected by index.
    setMode("cp_trigger_index", 0444);
    EXPECT_EQ(ask(0), kX);
    EXPECT_EQ(ask(1), kY);
}

TEST_P(AmplitudeListsTest, MotorWithoutAListIsLogged) {
    setNode("motor_type", "COINDC\n");
    removeNode("cp_trigger_index");
    EXPECT_EQ(ask(0), List());
    Lines lines = log();
    lines.erase(lines.begin(), lines.begin() + 5);
    EXPECT_EQ(lines, join({{"D daxGetAmplitudeList type: 0 : 1"},
                           probeLog("cp_trigger_index", false),
                           {"D daxGetAmplitudeList NOT support index method",
                            "D daxGetAmplitudeList false"}}));
}

TEST_P(AmplitudeListsTest, UnnamedMotorIsInferredFromTheFeatures) {
    start(GetParam(), {"motor-name", "haptic-engine"});
    EXPECT_EQ(ask(0), kX);
    const std::string fallback = "D Vibrator motor type is NONE. but ran vib method fallback : 9";
    const Lines lines = log();
    EXPECT_EQ(std::count(lines.begin(), lines.end(), fallback), 1);
    EXPECT_EQ(ask(1), kX);
    start(GetParam(), {"motor-name", "haptic-engine", "prebaked", "intensity"});
    EXPECT_EQ(ask(0), List());
}

TEST_P(AmplitudeListsTest, UnknownTypeIsRefusedAfterTheMotorIsKnown) {
    for (const uint32_t type : {2U, 4294967295U}) {
        EXPECT_EQ(ask(type), List());
        EXPECT_EQ(trace(), read("motor_type", "LINEAR_1040\n", 31, "O_RDWR"));
        EXPECT_EQ(log().back(),
                  "E daxGetAmplitudeList is abnormal " + std::to_string(static_cast<int>(type)));
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
