// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"
#include "support/Operations.h"
#include "support/TransientTrigger.h"
#include "support/TransportTest.h"

#include <hwbinder/IPCThreadState.h>
#include <sys/stat.h>

/** Every operation over the kernel's binder, on the real LED trigger, by callers of all kinds. */
namespace {

using ::android::sp;
using ::android::hardware::IPCThreadState;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;
using namespace tests;

const std::string kLed = "/sys/class/leds/vibrator/";

/** @return an operation's answer, and what the nodes that it may write hold afterwards. */
std::string outcome(const Operation& operation, IDaxVibrator& vibrator) {
    const std::string answer = operation.call(vibrator).inWords();
    return answer + " " + readFile(kLed + "duration") + readFile(kLed + "state");
}

class OperationsTest : public TransportTest {};

TEST_F(OperationsTest, TriggerDoesWhatTheSimulatorIsHeldTo) {
    expectTransientTrigger(kLed);
}

/** Compares what the daemon does with what its object does in the caller's own process. */
TEST_F(OperationsTest, AnswersAreThoseOfTheObjectForEveryCaller) {
    serve();
    setenv("ANDROID_LOG_TAGS", "*:S", 1);
    const sp<IDaxVibrator> remote = IDaxVibrator::getService();
    const sp<IDaxVibrator> local = new Vibrator;
    // The object in the caller's own process has the caller's rights alone.
    for (const char* node : {"activate", "duration", "state"})
        ASSERT_EQ(chmod((kLed + node).c_str(), 0666), 0) << node;
    for (const uid_t uid : {0U, 1000U, 2000U, 10123U}) {
        IPCThreadState::self()->restoreCallingIdentity(IPCThreadState::identityToken(uid, 1));
        ASSERT_EQ(seteuid(uid), 0);
        for (const Operation& operation : allOperations()) {
            const std::string expected = outcome(operation, *local);
            EXPECT_EQ(outcome(operation, *remote), expected) << operation.name() << " by " << uid;
        }
        ASSERT_EQ(seteuid(0), 0);
    }
    EXPECT_NE(log().find("Pemission denied (10123)"), std::string::npos) << log();
}

}  // namespace
