// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class FolderStatusTest : public BothLayoutsTest {
  protected:
    FolderStatusTest() { start(GetParam()); }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(FolderStatusTest);

TEST_P(FolderStatusTest, OneOfFourLettersMeansSupport) {
    const std::pair<std::string, bool> cases[] = {
            {"FOLDER_OPEN\n", true},
            {"OFF", true},
            {"ON\n", true},
            {"D", true},
            {"xFx\n", true},
            {"00L00", true},
            {"0\n", false},
            {"1", false},
            {"fold\n", false},
            {"\n", false},
            {"GEN\n", false},
            {std::string("a\0D", 3), false},
            {std::string(511, 'x') + "F", false},
            {std::string(510, 'x') + "F", true},
    };
    for (const auto& [text, supported] : cases) {
        setNode("event_cmd", text);
        EXPECT_EQ(bool(mVibrator->daxSupportsFolderStatusSetting()), supported) << text;
        EXPECT_EQ(log().back(), supported ? "D daxSupportsFolderStatusSetting TRUE"
                                          : "D daxSupportsFolderStatusSetting FALSE");
    }
    // An empty node is as good as none.
    setNode("event_cmd", "");
    errno = 0;
    EXPECT_FALSE(mVibrator->daxSupportsFolderStatusSetting());
    EXPECT_EQ(log().back(), "E daxSupportsFolderStatusSetting node: " + path("event_cmd") +
                                    " read failed. errno: 0");
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
