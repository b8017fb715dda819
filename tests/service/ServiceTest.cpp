// SPDX-License-Identifier: Apache-2.0
#include "support/DaemonTest.h"

#include "support/LogCapture.h"
#include "support/Operations.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <fstream>

namespace {

using Status = ::android::hardware::vibrator::V1_0::Status;

class ServiceTest : public DaemonTest {};

TEST_F(ServiceTest, StartsInItsOrder) {
    createDriver({"--features", "none"});
    start();
    Lines lines = cutDown(log());
    ASSERT_GE(lines.size(), 11U);
    EXPECT_EQ(lines[0].find("D/vendor.velmora.hardware.vibrator@2.1-service("), 0U) << lines[0];
    EXPECT_NE(lines[0].find("): qor-vibrator-2-1 starts"), std::string::npos) << lines[0];
    EXPECT_EQ(lines[1], "D !@QOR VIB HAL init");
    EXPECT_EQ(lines[10], "D Vibrator using LED trigger");
    EXPECT_EQ(lines[21], "D Vibrator THE_DEVICE_EXT_CONTROL /sys/class/leds/vibrator/ext_control");
    EXPECT_EQ(lines.size(), 23U);
    EXPECT_NE(lines[22].find("): calls go over sockets in "), std::string::npos) << lines[22];
}

TEST_F(ServiceTest, RegistersWithoutADriver) {
    start();
    const Lines lines = cutDown(log());
    EXPECT_EQ(std::count(lines.begin(), lines.end(),
                         "D Vibrator driver does not exist. Remove VIB HAL or Setup Vibrator "
                         "Driver"),
              1);
    EXPECT_EQ(lines.end()[-2], "D Vibrator THE_DEVICE_EXT_CONTROL ");
    EXPECT_EQ(Status(IDaxVibrator::getService()->on(5)), Status::UNKNOWN_ERROR);
}

TEST_F(ServiceTest, ServesEveryOperationToEveryCaller) {
    std::vector<uid_t> uids = {geteuid()};
    if (geteuid() == 0) uids = {0, 1000, 1001, 2000, 10123};
    const std::vector<std::string> all = model::featureNames();
    const model::Features features = {{all.begin(), all.end()}};
    for (const model::Layout layout : {model::Layout::kLedTrigger, model::Layout::kTimedOutput}) {
        std::filesystem::remove_all(mDirectory.path() + "/sys");
        ASSERT_EQ(simulator::createDriver(mDirectory.path(), layout, features), 0);
        start();
        const auto vibrator = IDaxVibrator::getService();
        std::ifstream trace(mDirectory.path() + "/trace");
        for (const uid_t uid : uids) {
            Circumstances circumstances;
            if (uid != 0 && uid != 1000) circumstances.refused = uid;
            for (const Operation& operation : allOperations()) {
                SCOPED_TRACE(operation.name + " by " + std::to_string(uid));
                ASSERT_EQ(simulator::createDriver(mDirectory.path(), layout, features), 0);
                const std::vector<Step> steps = parseSteps(layout, operation.steps);
                prepareNodes(mDirectory.path(), layout, steps);
                trace.clear();
                trace.seekg(0, std::ios::end);
                // A message says its sender's real uid.
                ASSERT_EQ(setreuid(uid, static_cast<uid_t>(-1)), 0);
                const Answer answer = operation.call(*vibrator);
                ASSERT_EQ(setreuid(geteuid(), static_cast<uid_t>(-1)), 0);
                Lines accesses;
                for (std::string line; std::getline(trace, line);)
                    accesses.push_back(line.substr(line.find(' ') + 1));
                const Behaviour expected = behaviourOf(layout, steps, operation.answer,
                                                       operation.answerFailed, circumstances);
                EXPECT_EQ(answer.inWords(), expected.answer);
                EXPECT_EQ(accesses, expected.trace);
            }
        }
        mService.kill();
    }
}

TEST_F(ServiceTest, LogIsFilteredAsTheEnvironmentSays) {
    createDriver();
    start({"ANDROID_LOG_TAGS=*:S QorVibrator-HAL2.1:E"});
    EXPECT_EQ(log(), "");
    EXPECT_EQ(Status(IDaxVibrator::getService()->daxSetAmplitude(0)), Status::BAD_VALUE);
    EXPECT_EQ(cutDown(log()), Lines{"E daxSetAmplitude amplitude is abnormal 0"});
}

}  // namespace
