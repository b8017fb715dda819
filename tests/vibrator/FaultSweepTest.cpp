// SPDX-License-Identifier: Apache-2.0
#include "support/Operations.h"
#include "support/VibratorTest.h"

#include <fcntl.h>

#include <algorithm>
#include <filesystem>
#include <iostream>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** The errors that the kernel can give for each system call on a node. */
const std::vector<std::string> kOpenErrors = {
        "EACCES", "EBUSY",  "EFAULT", "EFBIG",  "EINVAL", "EIO",     "EISDIR", "ELOOP", "EMFILE",
        "ENFILE", "ENODEV", "ENOENT", "ENOMEM", "ENOSPC", "ENOTDIR", "ENXIO",  "EPERM", "EROFS"};
const std::vector<std::string> kWriteErrors = {"EAGAIN", "EBADF",  "EBUSY",     "EFAULT", "EINVAL",
                                               "EIO",    "ENODEV", "ENOMEM",    "ENOSPC", "EPERM",
                                               "ERANGE", "ENXIO",  "EOPNOTSUPP"};
const std::vector<std::string> kReadErrors = {"EAGAIN", "EBADF",  "EBUSY",  "EFAULT", "EINVAL",
                                              "EIO",    "EISDIR", "ENODEV", "ENOMEM", "ENXIO"};
const std::vector<std::string> kCloseErrors = {"EBADF", "EINTR", "EIO", "ENOSPC"};

/** One thing that goes wrong during an operation. */
struct Case {
    std::string call;
    std::string fault;
    unsigned times;
    std::string answer;
    /** The nodes written after what went wrong; nothing where the call ends as if nothing had. */
    std::optional<Lines> writtenAfter;
};

std::vector<Case> casesOf(const Operation& operation, const Access& access) {
    std::vector<Case> cases;
    for (const std::string& error : kOpenErrors)
        cases.push_back({"open", error, 1, access.afterOpen, access.writtenAfter});
    for (const std::string& error : kCloseErrors)
        cases.push_back({"close", error, 1, operation.answer, std::nullopt});
    std::vector<std::string> interrupted = {"open"};
    if (access.kind != Access::kProbe) {
        const bool reads = access.kind == Access::kRead;
        const std::string call = reads ? "read" : "write";
        for (const std::string& error : reads ? kReadErrors : kWriteErrors)
            cases.push_back({call, error, 1, access.afterTransfer, access.writtenAfter});
        cases.push_back({call, "short=0", 1, access.afterTransfer, access.writtenAfter});
        cases.push_back({call, "short=1", 1, access.afterOneByte, access.writtenAfter});
        interrupted.push_back(call);
    }
    for (const std::string& call : interrupted) {
        for (const unsigned times : {1U, 1000U})
            cases.push_back({call, "EINTR", times, operation.answer, std::nullopt});
    }
    return cases;
}

class FaultSweepTest : public BothLayoutsTest {
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
    /** What the trace shows of an operation that nothing disturbs. */
    Lines undisturbed(const Operation& operation) const {
        Lines lines;
        for (const Access& access : operation.accesses) {
            const std::string mode = access.mode == O_RDWR ? "O_RDWR" : "O_RDONLY";
            const Lines more = access.kind == Access::kProbe ? probed(access.leaf, mode)
                               : access.kind == Access::kWrite
                                       ? written(access.leaf, access.text)
                                       : read(access.leaf, access.text, access.size, mode);
            lines.insert(lines.end(), more.begin(), more.end());
        }
        return lines;
    }
    /** Makes the call of an operation's access go wrong, and not those of the accesses before. */
    void arm(const Operation& operation, size_t index, const Case& each) const {
        const Access& access = operation.accesses[index];
        unsigned before = 0;
        for (size_t i = 0; i < index; ++i) {
            const Access& other = operation.accesses[i];
            const bool makesCall =
                    each.call == "open" || each.call == "close" || other.kind == access.kind;
            if (other.leaf == access.leaf && makesCall) ++before;
        }
        fail(access.leaf, each.call, each.fault, each.times, before);
    }
    static void expectTrace(const Lines& trace, const Case& each, const Lines& undisturbed) {
        const auto fails = [&](const std::string& line) {
            return line.find(" = -1 E") != std::string::npos;
        };
        if (each.writtenAfter) {
            auto broken = std::find_if(trace.begin(), trace.end(), fails);
            if (broken == trace.end()) {
                const std::string result = " = " + each.fault.substr(strlen("short=")) + " ";
                broken = std::find_if(trace.begin(), trace.end(), [&](const std::string& line) {
                    return line.find(" " + each.call + " ") != std::string::npos &&
                           (line + " ").find(result) != std::string::npos;
                });
            }
            ASSERT_NE(broken, trace.end());
            Lines written;
            for (auto line = broken + 1; line != trace.end(); ++line) {
                const size_t end = line->find(" write ");
                if (end == std::string::npos) continue;
                const size_t start = line->find('/') + 1;
                written.push_back(line->substr(start, end - start));
            }
            EXPECT_EQ(written, *each.writtenAfter);
        } else if (each.call != "close") {
            Lines whole;
            std::copy_if(trace.begin(), trace.end(), std::back_inserter(whole),
                         [&](const std::string& line) { return !fails(line); });
            EXPECT_EQ(whole, undisturbed);
            EXPECT_EQ(trace.size() - whole.size(), each.times);
        }
        const auto count = [&](const std::string& part) {
            return std::count_if(trace.begin(), trace.end(), [&](const std::string& line) {
                return line.find(part) != std::string::npos && (part == " close " || !fails(line));
            });
        };
        EXPECT_EQ(count(" open "), count(" close "));
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(FaultSweepTest);

TEST_P(FaultSweepTest, EverySystemCallOfEveryOperationMayFail) {
    start(GetParam());
    setNode("event_cmd", "FOLDER_OPEN\n");
    const size_t open = descriptors();
    size_t cases = 0;
    for (const Operation& operation : allOperations(GetParam())) {
        const Lines whole = undisturbed(operation);
        rest(operation);
        EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answer) << operation.name;
        EXPECT_EQ(trace(), whole) << operation.name;
        for (size_t i = 0; i < operation.accesses.size(); ++i) {
            for (const Case& each : casesOf(operation, operation.accesses[i])) {
                SCOPED_TRACE(operation.name + ": " + each.call + " of " +
                             operation.accesses[i].leaf + " gives " + each.fault + " " +
                             std::to_string(each.times) + " times");
                rest(operation);
                arm(operation, i, each);
                EXPECT_EQ(operation.call(*mVibrator).inWords(), each.answer);
                expectTrace(trace(), each, whole);
                ASSERT_EQ(descriptors(), open);
                rest(operation);
                EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answer)
                        << "the next call";
                ++cases;
                if (HasFailure()) return;
            }
        }
    }
    std::cout << cases << " cases\n";
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
