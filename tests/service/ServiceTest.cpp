// SPDX-License-Identifier: Apache-2.0
#include "support/ServiceTest.h"

#include "support/LogCapture.h"
#include "support/Operations.h"

#include <algorithm>
#include <csignal>
#include <filesystem>
#include <fstream>

namespace {

using Status = ::android::hardware::vibrator::V1_0::Status;

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

TEST_F(ServiceTest, ServesEveryOperationAsTheTableSays) {
    for (const auto& [name, layout] : {std::pair("led", simulator::Layout::kLedTrigger),
                                       std::pair("timed", simulator::Layout::kTimedOutput)}) {
        std::filesystem::remove_all(mDirectory.path() + "/sys");
        createDriver({"--layout", name});
        start();
        const auto vibrator = IDaxVibrator::getService();
        for (const Operation& operation : allOperations()) {
            SCOPED_TRACE(operation.name);
            createDriver({"--layout", name});
            const std::vector<Step> steps = parseSteps(layout, operation.steps);
            prepareNodes(mDirectory.path(), layout, steps);
            std::ifstream trace(mDirectory.path() + "/trace");
            trace.seekg(0, std::ios::end);
            EXPECT_EQ(operation.call(*vibrator).inWords(), operation.answer);
            Lines accesses;
            for (std::string line; std::getline(trace, line);)
                accesses.push_back(line.substr(line.find(' ') + 1));
            EXPECT_EQ(accesses, behaviourOf(layout, steps, operation.answer, "").trace);
        }
        mService.kill();
    }
}

TEST_F(ServiceTest, GateJudgesTheRealCaller) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    createDriver();
    start();
    const std::pair<uid_t, bool> callers[] = {
            {0, true}, {1000, true}, {1001, false}, {2000, false}, {10123, false}};
    for (const auto& [uid, permitted] : callers) {
        const bool expected = permitted;
        EXPECT_EQ(runAs(uid,
                        [expected] {
                            const auto vibrator = IDaxVibrator::getService();
                            const bool dax = vibrator->daxSupportsHapticEngine();
                            const bool standard = vibrator->supportsAmplitudeControl();
                            const Status set = vibrator->daxSetAmplitude(4321);
                            const Status bad = vibrator->daxSetAmplitude(0);
                            const Status on = vibrator->on(1);
                            return dax == expected && standard == expected &&
                                                   set == (expected ? Status::OK
                                                                    : Status::UNKNOWN_ERROR) &&
                                                   bad == (expected ? Status::BAD_VALUE
                                                                    : Status::UNKNOWN_ERROR) &&
                                                   on == Status::OK
                                           ? 0
                                           : 1;
                        }),
                  0)
                << uid;
        EXPECT_EQ(node("intensity"), permitted ? "4321\n" : "10000\n") << uid;
        const std::string refusal = "Pemission denied (" + std::to_string(uid) + ")";
        EXPECT_EQ(log().find(refusal) != std::string::npos, !permitted) << uid;
        createDriver();
    }
}

TEST_F(ServiceTest, LogIsFilteredAsTheEnvironmentSays) {
    createDriver();
    start({"ANDROID_LOG_TAGS=*:S QorVibrator-HAL2.1:E"});
    EXPECT_EQ(log(), "");
    EXPECT_EQ(Status(IDaxVibrator::getService()->daxSetAmplitude(0)), Status::BAD_VALUE);
    EXPECT_EQ(cutDown(log()), Lines{"E daxSetAmplitude amplitude is abnormal 0"});
}

TEST_F(ServiceTest, SurvivesTheLossOfItsLog) {
    // Closed: neither a node nor a connection must get the log's descriptor, and its lines with it.
    // A pipe that nobody reads from: it must neither kill nor hold up the daemon.
    for (const std::string way :
         {"2>&-", "2> >(exec true)", "2> >(exec sleep 20 >/dev/null 2>&1)"}) {
        SCOPED_TRACE(way);
        createDriver();
        startDaemon(mService, way);
        ASSERT_TRUE(eventually(isThere));
        if (way == "2>&-") {
            EXPECT_EQ(std::filesystem::read_symlink("/proc/" + std::to_string(mService.pid()) +
                                                    "/fd/2"),
                      "/dev/null");
        }
        const auto vibrator = IDaxVibrator::getService();
        for (uint32_t i = 1; i <= 1000; ++i)
            ASSERT_EQ(Status(vibrator->on(i)), Status::OK);
        EXPECT_EQ(node("duration"), "1000\n");
        mService.kill();
    }
}

}  // namespace
