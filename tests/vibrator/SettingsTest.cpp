// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include <functional>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

struct Setting {
    std::string leaf;
    std::function<Return<Status>(Vibrator&, uint32_t)> set;
    uint32_t least;
    uint32_t most;
    std::string refusal;
};

const Setting kSettings[] = {
        {"intensity", [](Vibrator& v, uint32_t n) { return v.daxSetAmplitude(n); }, 1, 10000,
         "E daxSetAmplitude amplitude is abnormal "},
        {"force_touch_intensity",
         [](Vibrator& v, uint32_t n) { return v.daxSetForceTouchAmplitude(n); }, 1, 10000,
         "E daxSetForceTouchAmplitude amplitude is abnormal "},
        {"multi_freq",
         [](Vibrator& v, uint32_t n) {
             return v.daxSetFrequencyType(static_cast<DaxFrequencyType>(n));
         },
         0, 4, "E daxSetFrequencyType is abnormal "},
};

class SettingsTest : public BothLayoutsTest {
  protected:
    SettingsTest() { start(GetParam()); }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(SettingsTest);

TEST_P(SettingsTest, ValuesInRangeReachTheNode) {
    for (const Setting& setting : kSettings) {
        for (const uint32_t value : {setting.least, setting.least + 2, setting.most}) {
            EXPECT_EQ(Status(setting.set(*mVibrator, value)), Status::OK);
            EXPECT_EQ(trace(), written(setting.leaf, std::to_string(value) + "\n"));
            EXPECT_EQ(log(), writeLog(setting.leaf, static_cast<int>(value)));
        }
    }
}

TEST_P(SettingsTest, ValuesOutOfRangeTouchNothing) {
    for (const Setting& setting : kSettings) {
        for (const uint32_t value : {setting.least - 1, setting.most + 1, 4294967295U}) {
            EXPECT_EQ(Status(setting.set(*mVibrator, value)), Status::BAD_VALUE);
            // The frequency type alone is shown as a signed number.
            const std::string shown = setting.least == 0
                                              ? std::to_string(static_cast<int32_t>(value))
                                              : std::to_string(value);
            EXPECT_EQ(log(), Lines{setting.refusal + shown});
        }
    }
    EXPECT_EQ(trace(), Lines());
}

TEST_P(SettingsTest, DriverThatDoesNotTakeTheValueIsUnknownError) {
    for (const Setting& setting : kSettings) {
        fail(setting.leaf, "write", "EBUSY", 1);
        EXPECT_EQ(Status(setting.set(*mVibrator, 3)), Status::UNKNOWN_ERROR);
        EXPECT_EQ(log(), writeLog(setting.leaf, 3, false));
        removeNode(setting.leaf);
        EXPECT_EQ(Status(setting.set(*mVibrator, 3)), Status::UNKNOWN_ERROR);
        EXPECT_EQ(log(), openFailedLog(setting.leaf, 3, ENOENT));
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
