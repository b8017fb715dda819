// SPDX-License-Identifier: Apache-2.0
#include "support/Operations.h"

#include "Faults.h"
#include "support/VibratorTest.h"

#include <fcntl.h>

#include <algorithm>
#include <cstring>
#include <filesystem>
#include <iostream>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** The errors that the kernel can give for each system call on a node. */
const Lines kOpenErrors = {"EACCES", "EBUSY",  "EFAULT",  "EFBIG",  "EINVAL", "EIO",
                           "EISDIR", "ELOOP",  "EMFILE",  "ENFILE", "ENODEV", "ENOENT",
                           "ENOMEM", "ENOSPC", "ENOTDIR", "ENXIO",  "EPERM",  "EROFS"};
const Lines kWriteErrors = {"EAGAIN", "EBADF",  "EBUSY", "EFAULT", "EINVAL", "EIO",       "ENODEV",
                            "ENOMEM", "ENOSPC", "EPERM", "ERANGE", "ENXIO",  "EOPNOTSUPP"};
const Lines kReadErrors = {"EAGAIN", "EBADF",  "EBUSY",  "EFAULT", "EINVAL",
                           "EIO",    "EISDIR", "ENODEV", "ENOMEM", "ENXIO"};
const Lines kCloseErrors = {"EBADF", "EINTR", "EIO", "ENOSPC"};

/** One thing that goes wrong during an operation. */
struct Case {
    std::string call;
    std::string fault;
    unsigned times;
    std::string answer;
    /** Whether the operation fails, rather than going on as if nothing had happened. */
    bool fails;
};

std::vector<Case> casesOf(const Operation& operation, const Access& access) {
    std::vector<Case> cases;
    for (const std::string& error : kOpenErrors)
        cases.push_back({"open", error, 1, access.answerFailed, true});
    for (const std::string& error : kCloseErrors)
        cases.push_back({"close", error, 1, operation.answer, false});
    Lines interrupted = {"open"};
    if (access.kind != Access::kProbe) {
        const bool reads = access.kind == Access::kRead;
        const std::string call = reads ? "read" : "write";
        for (const std::string& error : reads ? kReadErrors : kWriteErrors)
            cases.push_back({call, error, 1, access.answerTransferFailed, true});
        cases.push_back({call, "short=0", 1, access.answerTransferFailed, true});
        cases.push_back({call, "short=1", 1, access.answerOneByte, true});
        interrupted.push_back(call);
    }
    for (const std::string& call : interrupted) {
        for (const unsigned times : {1U, 1000U})
            cases.push_back({call, "EINTR", times, operation.answer, false});
    }
    return cases;
}

bool contains(const std::string& line, const std::string& part) {
    return line.find(part) != std::string::npos;
}

class OperationsTest : public BothLayoutsTest {
  protected:
    /** Brings the driver to rest. */
    void rest(const Operation& operation) {
        mVibrator->off();
        setNode("motor_type", operation.motor);
        if (mLayout == Layout::kLedTrigger) setNode("duration", "0\n");
        setNode("event_cmd", "FOLDER_OPEN\n");
        trace();
        log();
    }
    static size_t descriptors() {
        const std::filesystem::directory_iterator files("/proc/self/fd");
        return static_cast<size_t>(std::distance(begin(files), end(files)));
    }
    /** Makes the call of an operation's access go wrong, and not those of the accesses before. */
    void arm(const Operation& operation, size_t index, const Case& each) const {
        const Access& access = operation.accesses[index];
        const bool isTransfer = each.call == "read" || each.call == "write";
        const auto* first = operation.accesses.data();
        const auto before = std::count_if(first, first + index, [&](const Access& other) {
            return other.leaf == access.leaf && (!isTransfer || other.kind == access.kind);
        });
        fail(access.leaf, each.call, each.fault, each.times, static_cast<unsigned>(before));
    }
    /** Checks the trace of a call in which something went wrong. */
    static void checkTrace(const Lines& trace, const Case& each, const Access& access,
                           const Lines& undisturbed) {
        const auto fails = [](const std::string& line) { return contains(line, " = -1 E"); };
        const std::string shortResult =
                each.fault[0] == 's' ? " = " + each.fault.substr(strlen("short=")) + " " : "none";
        if (each.fails) {
            auto broken = std::find_if(trace.begin(), trace.end(), [&](const std::string& line) {
                return fails(line) ||
                       (contains(line, " " + each.call + " ") && contains(line + " ", shortResult));
            });
            ASSERT_NE(broken, trace.end());
            Lines written;
            for (auto line = broken + 1; line != trace.end(); ++line) {
                const size_t start = line->find('/') + 1;
                if (!contains(*line, " write ")) continue;
                written.push_back(line->substr(start, line->find(' ') - start));
            }
            EXPECT_EQ(written, access.writtenAfter);
        } else if (each.call != "close") {
            Lines whole;
            std::copy_if(trace.begin(), trace.end(), std::back_inserter(whole),
                         [&](const std::string& line) { return !fails(line); });
            EXPECT_EQ(whole, undisturbed);
            EXPECT_EQ(trace.size() - whole.size(), each.times);
        }
        const auto opened = std::count_if(trace.begin(), trace.end(), [&](const std::string& line) {
            return contains(line, " open ") && !fails(line);
        });
        const auto closed = std::count_if(trace.begin(), trace.end(), [](const std::string& line) {
            return contains(line, " close ");
        });
        EXPECT_EQ(opened, closed);
    }
    void tryCase(const Operation& operation, size_t index, const Case& each) {
        const Access& access = operation.accesses[index];
        rest(operation);
        arm(operation, index, each);
        errno = 0;
        EXPECT_EQ(operation.call(*mVibrator).inWords(), each.answer);
        checkTrace(trace(), each, access, undisturbedTrace(mLayout, operation));
        const auto fault = simulator::parseFault(each.fault);
        const bool opens = each.call != "open";
        if (!each.fails) {
            EXPECT_EQ(log(), undisturbedLog(mLayout, operation));
        } else if (!access.goesOn && !(access.kind == Access::kRead && each.fault == "short=1")) {
            const int result = fault->error != 0 ? -1 : static_cast<int>(fault->bytes);
            EXPECT_EQ(log(), failedLog(mLayout, operation, index, opens, fault->error, result));
        }
        rest(operation);
        EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answer) << "the next call";
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(OperationsTest);

TEST_P(OperationsTest, EachAnswersAccessesAndLogsAsTheTableSays) {
    start(GetParam());
    for (const Operation& operation : allOperations(GetParam())) {
        SCOPED_TRACE(operation.name);
        rest(operation);
        EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answer);
        EXPECT_EQ(trace(), undisturbedTrace(GetParam(), operation));
        EXPECT_EQ(log(), undisturbedLog(GetParam(), operation));
    }
}

TEST_P(OperationsTest, ThoseWithAGateRefuseAllButSystemAndRoot) {
    start(GetParam());
    size_t gated = 0;
    for (const Operation& operation : allOperations(GetParam())) {
        if (operation.answerRefused.empty()) continue;
        ++gated;
        for (const uid_t uid : {2000U, 1001U, 999U, 10123U, 4294967295U}) {
            rest(operation);
            const CallerIdentity caller(uid);
            EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answerRefused);
            Lines lines = operation.accesses[0].before;
            lines.resize(operation.linesBeforeGate);
            lines.push_back("E Pemission denied (" + std::to_string(static_cast<int>(uid)) + ")");
            EXPECT_EQ(log(), lines) << operation.name;
            EXPECT_EQ(trace(), Lines()) << operation.name;
        }
        rest(operation);
        const CallerIdentity caller(1000);
        EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answer);
    }
    EXPECT_EQ(gated, 16U) << "fifteen, and one of them played both ways";
}

TEST_P(OperationsTest, EachFailsInItsOwnWayWithoutADriver) {
    construct();
    trace();
    for (const Operation& operation : allOperations(GetParam())) {
        EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answerWithoutDriver)
                << operation.name;
        for (const std::string& line : trace()) {
            EXPECT_TRUE(contains(line, "timed_output/enable open ")) << line;
            EXPECT_TRUE(contains(line, " = -1 ENOENT")) << line;
        }
    }
}

TEST_P(OperationsTest, EverySystemCallMayFail) {
    start(GetParam());
    const size_t open = descriptors();
    size_t cases = 0;
    for (const Operation& operation : allOperations(GetParam())) {
        for (size_t i = 0; i < operation.accesses.size(); ++i) {
            for (const Case& each : casesOf(operation, operation.accesses[i])) {
                SCOPED_TRACE(operation.name + ": " + each.call + " of " +
                             operation.accesses[i].leaf + " gives " + each.fault + " " +
                             std::to_string(each.times) + " times");
                tryCase(operation, i, each);
                ASSERT_EQ(descriptors(), open);
                ++cases;
                if (HasFailure()) return;
            }
        }
    }
    std::cout << cases << " cases\n";
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
