// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"
#include "kernel/Services.h"
#include "support/Operations.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

/** Every operation over the kernel's binder, on the real LED trigger, by callers of all kinds. */
namespace {

using ::android::sp;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

constexpr const char* kNodes[] = {"/sys/class/leds/vibrator/activate",
                                  "/sys/class/leds/vibrator/duration",
                                  "/sys/class/leds/vibrator/state"};

/** @return an operation's answer, and what the nodes that it may write hold afterwards. */
std::string outcome(const Operation& operation, IDaxVibrator& vibrator) {
    const std::string answer = operation.call(vibrator).inWords();
    return answer + " " + readFile("/sys/class/leds/vibrator/duration") +
           readFile("/sys/class/leds/vibrator/state");
}

/** Compares what the daemon does with what its object does in the caller's own process. */
int compareAll() {
    const sp<IDaxVibrator> remote = IDaxVibrator::getService();
    if (remote == nullptr || !remote->ping().isOk()) return 1;
    const sp<IDaxVibrator> local = new Vibrator;
    for (const Operation& operation : allOperations()) {
        const std::string expected = outcome(operation, *local);
        EXPECT_EQ(outcome(operation, *remote), expected)
                << operation.name << " called by uid " << getuid();
    }
    return ::testing::Test::HasFailure() ? 1 : 0;
}

TEST(OperationsTest, AnswersAreThoseOfTheObjectForEveryCaller) {
    Services services;
    ASSERT_TRUE(services.startManager());
    services.startDaemon();
    setenv("ANDROID_LOG_TAGS", "*:S", 1);
    // The object in the caller's own process has the caller's rights alone.
    for (const char* node : kNodes)
        ASSERT_EQ(chmod(node, 0666), 0) << node;
    for (const uid_t uid : {0U, 1000U, 2000U, 10123U}) {
        EXPECT_EQ(runAs(uid, compareAll), 0) << readFile(Services::kDaemonLog);
    }
    for (const char* node : kNodes)
        EXPECT_EQ(chmod(node, 0644), 0) << node;
    unsetenv("ANDROID_LOG_TAGS");
    EXPECT_NE(readFile(Services::kDaemonLog).find("Pemission denied (10123)"), std::string::npos);
}

}  // namespace
