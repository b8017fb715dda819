// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"
#include "support/VibratorTest.h"

#include <unistd.h>

#include <iostream>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** What the kernel gives for a system call on a node; EINTR is a case of its own. */
const std::vector<std::string> kErrors = {"EACCES", "EAGAIN", "EBADF",  "EBUSY",  "EINVAL",
                                          "EIO",    "EMFILE", "ENODEV", "ENOENT", "ENOMEM",
                                          "ENOSPC", "ENXIO",  "EPERM",  "EROFS"};

/** A system call that goes wrong. */
struct Trouble {
    std::string call;
    std::string fault;
    unsigned times;
};

/** @return all that can go wrong with an access. */
std::vector<Trouble> troublesOf(const Step& access) {
    std::vector<Trouble> troubles;
    for (const std::string& call : {std::string("open"), access.transfer(), std::string("close")}) {
        if (call.empty()) continue;
        for (const std::string& error : kErrors)
            troubles.push_back({call, error, 1});
        troubles.push_back({call, "EINTR", 1});
        if (call != "close") troubles.push_back({call, "EINTR", 1000});
    }
    if (access.kind != Step::kProbe) troubles.push_back({access.transfer(), "short=0", 1});
    // A short read is as good as a node that holds no more.
    if (access.kind == Step::kWrite) troubles.push_back({"write", "short=1", 1});
    return troubles;
}

class OperationsTest : public BothLayoutsTest {};
INSTANTIATE_FOR_BOTH_LAYOUTS(OperationsTest);

TEST_P(OperationsTest, EachDoesWhatItsStepsTell) {
    for (const Operation& operation : allOperations())
        expect(operation);
}

TEST_P(OperationsTest, NodeMayGetTheDescriptorOfStandardInput) {
    const int input = dup(STDIN_FILENO);
    close(STDIN_FILENO);
    for (const Operation& operation : allOperations())
        expect(operation);
    dup2(input, STDIN_FILENO);
    close(input);
}

TEST_P(OperationsTest, GateRefusesAllButSystemAndRoot) {
    size_t others = 0;
    for (const Operation& operation : allOperations()) {
        for (const uid_t uid : {0U, 2000U, 1001U, 999U, 1U, 10123U, 4294967295U})
            expect(operation, uid);
        const bool isGated = operation.steps.find('@') != std::string::npos;
        if (operation.name().compare(0, 3, "dax") == 0) {
            EXPECT_TRUE(isGated) << operation.name();
        } else if (isGated) {
            ++others;
        }
    }
    EXPECT_EQ(others, 3U) << "those that call one that is gated";
}

TEST_P(OperationsTest, EverySystemCallMayFail) {
    const size_t open = descriptorsOf(getpid());
    size_t cases = 0;
    for (const Operation& operation : allOperations()) {
        Steps steps = parseSteps(mLayout, operation.steps);
        for (Step* access : accessesOf(steps)) {
            const Step sound = *access;
            for (const auto& [call, fault, times] : troublesOf(sound)) {
                SCOPED_TRACE(call + " of " + access->leaf + " gives " + fault + " " +
                             std::to_string(times) + " times");
                access->faults[call] = fault;
                access->times = times;
                expect(operation, steps);
                *access = sound;
                ASSERT_EQ(descriptorsOf(getpid()), open);
                ++cases;
                if (HasFailure()) return;
            }
        }
    }
    std::cout << cases << " cases\n";
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
