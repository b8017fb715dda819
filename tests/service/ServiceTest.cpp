// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"
#include "support/DaemonTest.h"
#include "support/LogCapture.h"
#include "support/Operations.h"

#include <unistd.h>

#include <algorithm>
#include <filesystem>
#include <regex>

namespace {

using namespace tests;

using ::vendor::velmora::hardware::vibrator::V2_1::implementation::NodePathTable;

class ServiceTest : public DaemonTest {};

TEST_F(ServiceTest, StartsInItsOrder) {
    createDriver(model::Layout::kLedTrigger, {{}, "NONE", 0});
    start();
    const std::string text = cutDown(log());
    size_t at = 0;
    for (const char* part :
         {"D/vendor.velmora.hardware.vibrator@2.1-service(",
          "): qor-vibrator-2-1 starts\nD !@QOR VIB HAL init\n", "D Vibrator using LED trigger\n",
          "\nD Vibrator THE_DEVICE_EXT_CONTROL /sys/class/leds/vibrator/ext_control\n",
          "): calls go over sockets in "}) {
        at = text.find(part, at);
        ASSERT_NE(at, std::string::npos) << part << text;
    }
    const auto paths = std::count_if(std::begin(NodePathTable), std::end(NodePathTable),
                                     [](const auto& node) { return node.path != nullptr; });
    // And one of the call that has shown that it answers.
    EXPECT_EQ(std::count(text.begin(), text.end(), '\n'), 12 + paths + 1);
}

TEST_F(ServiceTest, ServesEveryOperationToEveryCaller) {
    std::vector<uid_t> uids = {geteuid()};
    if (geteuid() == 0) uids = {0, 1000, 1001, 2000, 10123};
    for (const model::Layout layout : {model::Layout::kLedTrigger, model::Layout::kTimedOutput}) {
        std::filesystem::remove_all(mDirectory.path() + "/sys");
        createDriver(layout);
        start();
        const auto vibrator = IDaxVibrator::getService();
        const std::string trace = mDirectory.path() + "/trace";
        for (const uid_t uid : uids) {
            for (const Operation& operation : allOperations()) {
                SCOPED_TRACE(operation.name() + " by " + std::to_string(uid));
                createDriver(layout);
                const Steps steps = parseSteps(layout, operation.steps);
                prepareNodes(mDirectory.path(), layout, steps);
                std::filesystem::remove(trace);
                // The effective uid counts.
                ASSERT_EQ(seteuid(uid), 0);
                const Answer answer = operation.call(*vibrator);
                ASSERT_EQ(seteuid(uids[0]), 0);
                const Behaviour expected = behaviourOf(layout, operation, steps, uid);
                EXPECT_EQ(answer.inWords(), expected.answer);
                static const std::regex time("(^|\n)[0-9.]+ ");
                EXPECT_EQ(std::regex_replace(readFile(trace), time, "$1"), expected.trace);
            }
        }
        mServer.kill();
    }
}

}  // namespace
