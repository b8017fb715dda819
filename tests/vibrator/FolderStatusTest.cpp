// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class FolderStatusTest : public BothLayoutsTest {
  protected:
    FolderStatusTest() { start(GetParam()); }
    Status set(uint32_t status) {
        return mVibrator->daxSetFolderStatus(static_cast<DaxFolderStatus>(status));
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(FolderStatusTest);

const Lines kSetStarts = {"D daxSetFolderStatus starts"};
const Lines kSupportsStarts = {"D daxSupportsFolderStatusSetting starts"};

TEST_P(FolderStatusTest, CommandReachesTheDriver) {
    const std::pair<uint32_t, std::string> cases[] = {{0, "FOLDER_OPEN"}, {1, "FOLDER_CLOSE"}};
    for (const auto& [status, command] : cases) {
        EXPECT_EQ(set(status), Status::OK);
        EXPECT_EQ(trace(), written("event_cmd", command + "\n"));
        const std::string length = std::to_string(command.size() + 1);
        EXPECT_EQ(log(), join({kSetStarts,
                               {"D " + command + "\\n", "D length : " + length, "D ret : " + length,
                                "D daxSetFolderStatus end"}}));
    }
}

TEST_P(FolderStatusTest, OtherStatesAreBadValues) {
    for (const uint32_t status : {2U, 255U, 4294967295U}) {
        EXPECT_EQ(set(status), Status::BAD_VALUE);
        EXPECT_EQ(log(), join({kSetStarts, {"D daxSetFolderStatus BAD_VALUE"}}));
    }
    EXPECT_EQ(trace(), Lines());
}

TEST_P(FolderStatusTest, FailedCommandIsUnknownError) {
    const std::pair<std::string, int> faults[] = {{"EINVAL", -1}, {"short=5", 5}};
    for (const auto& [fault, result] : faults) {
        fail("event_cmd", "write", fault, 1);
        EXPECT_EQ(set(0), Status::UNKNOWN_ERROR);
        EXPECT_EQ(trace().back(), GetParam() == Layout::kTimedOutput
                                          ? "timed_output/event_cmd close = 0"
                                          : "leds/event_cmd close = 0");
        EXPECT_EQ(log(),
                  join({kSetStarts,
                        {"D FOLDER_OPEN\\n", "D length : 12", "D ret : " + std::to_string(result),
                         "D daxSetFolderStatus error"}}));
    }
    removeNode("event_cmd");
    EXPECT_EQ(set(1), Status::UNKNOWN_ERROR);
    EXPECT_EQ(log(),
              join({kSetStarts,
                    {"D FOLDER_CLOSE\\n", "D length : 13", "E daxSetFolderStatus is fail: 2"}}));
    start(GetParam());
    fail("event_cmd", "write", "EINTR", 2);
    EXPECT_EQ(set(0), Status::OK);
}

TEST_P(FolderStatusTest, OneOfFourLettersMeansSupport) {
    const std::pair<std::string, bool> cases[] = {
            {"FOLDER_OPEN\n", true},
            {"OFF", true},
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
    setNode("event_cmd", "FOLDER_OPEN\n");
    trace();
    EXPECT_TRUE(mVibrator->daxSupportsFolderStatusSetting());
    EXPECT_EQ(trace(), read("event_cmd", "FOLDER_OPEN\n", 511, "O_RDWR"));
    EXPECT_EQ(log(), join({kSupportsStarts,
                           {"D daxSupportsFolderStatusSetting str has new-line char at the last",
                            "D daxSupportsFolderStatusSetting string : FOLDER_OPEN ",
                            "D daxSupportsFolderStatusSetting string len : 11 ",
                            "D daxSupportsFolderStatusSetting TRUE"}}));
}

TEST_P(FolderStatusTest, UnreadableNodeMeansNoSupport) {
    const std::string line = "E daxSupportsFolderStatusSetting node: " + path("event_cmd");
    fail("event_cmd", "read", "EIO", 1);
    EXPECT_FALSE(mVibrator->daxSupportsFolderStatusSetting());
    EXPECT_EQ(log(), join({kSupportsStarts, {line + " read failed. errno: 5"}}));
    setNode("event_cmd", "");
    errno = 0;
    EXPECT_FALSE(mVibrator->daxSupportsFolderStatusSetting());
    EXPECT_EQ(log(), join({kSupportsStarts, {line + " read failed. errno: 0"}}));
    setMode("event_cmd", 0444);
    EXPECT_FALSE(mVibrator->daxSupportsFolderStatusSetting());
    EXPECT_EQ(log(), join({kSupportsStarts, {line + " open failed. errno: 13"}}));
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
