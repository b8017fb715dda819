// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class ExternalControlTest : public BothLayoutsTest {
  protected:
    ExternalControlTest() { start(GetParam()); }
    std::string runningNode() const {
        return GetParam() == Layout::kTimedOutput ? "enable" : "duration";
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(ExternalControlTest);

TEST_P(ExternalControlTest, IsSwitchedWhileTheMotorRests) {
    for (const bool enabled : {true, false}) {
        EXPECT_EQ(Status(mVibrator->setExternalControl(enabled)), Status::OK);
        EXPECT_EQ(trace(), join({read(runningNode(), "0\n", 7),
                                 written("ext_control", enabled ? "1\n" : "0\n")}));
        EXPECT_EQ(log(), join({readLog(runningNode()),
                               {"D isVibrating : false",
                                enabled ? "D setExternalControl external control set as true"
                                        : "D setExternalControl external control set as false"},
                               writeLog("ext_control", enabled ? 1 : 0)}));
    }
}

TEST_P(ExternalControlTest, IsRefusedWhileTheMotorRuns) {
    mVibrator->on(60000);
    trace();
    log();
    EXPECT_EQ(Status(mVibrator->setExternalControl(true)), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(trace().size(), 3U);
    EXPECT_EQ(log(), join({readLog(runningNode()),
                           {"D isVibrating : true",
                            "D setExternalControl external control while vibrating. Not "
                            "supported"}}));
}

TEST_P(ExternalControlTest, UnreadableMotorCountsAsResting) {
    fail(runningNode(), "open", "EACCES");
    EXPECT_EQ(Status(mVibrator->setExternalControl(true)), Status::OK);
}

TEST_P(ExternalControlTest, FailedWriteIsUnsupported) {
    fail("ext_control", "write", "EIO", 1);
    EXPECT_EQ(Status(mVibrator->setExternalControl(false)), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(log().back(), "E THE_DEVICE_EXT_CONTROL is impossible");
    removeNode("ext_control");
    EXPECT_EQ(Status(mVibrator->setExternalControl(true)), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(log().back(), "E THE_DEVICE_EXT_CONTROL is impossible");
    EXPECT_FALSE(mVibrator->supportsExternalControl());
    EXPECT_EQ(log(), probeLog("ext_control", false));
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
