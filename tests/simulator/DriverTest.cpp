// SPDX-License-Identifier: Apache-2.0
#include "Faults.h"
#include "Folder.h"
#include "TraceFile.h"
#include "TraceLine.h"
#include "support/Child.h"
#include "support/TransientTrigger.h"
#include "support/VibratorTest.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <fstream>
#include <thread>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class SimulatedDriverTest : public VibratorTest {
  protected:
    int put(const std::string& leaf, const std::string& text) const {
        return putNode(path(leaf), text);
    }
    std::string get(const std::string& leaf) const { return getNode(path(leaf)); }
    static void sleep(int milliseconds) {
        std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
    }
};

TEST_F(SimulatedDriverTest, ValuesAreCheckedAsTheKernelDoes) {
    start(Layout::kLedTrigger);
    using namespace std::string_literals;
    const struct {
        std::string leaf;
        std::string text;
        int error;
    } cases[] = {
            {"intensity", "10000\n", 0},
            {"intensity", "0", 0},
            {"intensity", "10001\n", EINVAL},
            {"intensity", "-1", EINVAL},
            {"intensity", "99999999999", ERANGE},
            {"multi_freq", "4", 0},
            {"multi_freq", "5", EINVAL},
            {"cp_trigger_index", "65535", 0},
            {"cp_trigger_index", "65536", EINVAL},
            {"cp_trigger_queue", "3.50, 10, 0~\0"s, 0},
            {"cp_trigger_queue", "3.50, 10, 0~", EINVAL},
            {"cp_trigger_queue", "3.50, 10, 0~\n", EINVAL},
            {"cp_trigger_queue", "3.50, 10~\0"s, EINVAL},
            {"haptic_engine", "4 1 2 3 4\n", 0},
            {"haptic_engine", "8 1 2 3 4 5 6 7 -8\n", 0},
            {"haptic_engine", "0\n", 0},
            {"haptic_engine", "4 1 2 3 4", EINVAL},
            {"haptic_engine", "4 1 2 3\n", EINVAL},
            {"haptic_engine", "3 1 2 3\n", EINVAL},
            {"haptic_engine", "4 1 2 3 4 \n", EINVAL},
            {"event_cmd", "FOLDER_CLOSE\n", 0},
            {"event_cmd", "FOLDER_AJAR\n", EINVAL},
            {"ext_control", "1", 0},
            {"motor_type", "LINEAR\n", EIO},
    };
    for (const auto& [leaf, text, error] : cases) {
        const std::string before = get(leaf);
        EXPECT_EQ(put(leaf, text), error) << leaf << ' ' << text;
        if (error != 0) {
            EXPECT_EQ(get(leaf), before) << leaf << ' ' << text;
        }
    }
}

TEST_F(SimulatedDriverTest, TimedOutputCountsDown) {
    start(Layout::kTimedOutput);
    EXPECT_EQ(get("enable"), "0\n");
    EXPECT_EQ(put("enable", "10000"), 0);
    sleep(20);
    const int left = std::stoi(get("enable"));
    EXPECT_LT(left, 9981);
    EXPECT_GT(left, 1000);
    EXPECT_EQ(put("enable", "seven"), EINVAL);
    EXPECT_EQ(put("enable", "30 ms"), 0);
    sleep(40);
    EXPECT_EQ(get("enable"), "0\n");
    put("enable", "10000");
    EXPECT_EQ(put("enable", "-1"), 0);
    EXPECT_EQ(get("enable"), "0\n");
}

TEST_F(SimulatedDriverTest, TransientTriggerIsTheKernels) {
    start(Layout::kLedTrigger);
    expectTransientTrigger(sysfsDirectory(Layout::kLedTrigger));
}

TEST_F(SimulatedDriverTest, ModesBindRootToo) {
    start(Layout::kLedTrigger);
    ASSERT_EQ(chmod((mDirectory.path() + path("intensity")).c_str(), 0200), 0);
    EXPECT_EQ(::open(path("intensity").c_str(), O_RDONLY), -1);
    EXPECT_EQ(errno, EACCES);
    EXPECT_EQ(put("num_waves", "1"), EACCES);
    EXPECT_EQ(put("absent", "1"), ENOENT);
}

TEST_F(SimulatedDriverTest, AtMostAPageIsTakenAtOnce) {
    start(Layout::kLedTrigger);
    std::ofstream(mDirectory.path() + path("scratch"));
    const int file = ::open(path("scratch").c_str(), O_RDWR);
    const std::string text(5000, 'x');
    EXPECT_EQ(::write(file, text.data(), text.size()), 4096);
    ::close(file);
}

TEST_F(SimulatedDriverTest, TwoProcessesShareTheTimesOfAFault) {
    start(Layout::kLedTrigger);
    constexpr int kTimes = 100;
    ASSERT_TRUE(simulator::setFault(mDirectory.path(), "intensity", "read",
                                    simulator::Fault{EIO, 0, kTimes, 50}));
    const simulator::Folder directory(mDirectory.path());
    const auto countFaults = [&] {
        int count = 0;
        for (int i = 0; i < 2 * kTimes; ++i)
            count += simulator::takeFault(directory, "intensity", "read") ? 1 : 0;
        return count;
    };
    const pid_t other = fork();
    if (other == 0) _exit(countFaults());
    const int own = countFaults();
    int status = 0;
    waitpid(other, &status, 0);
    EXPECT_EQ(own + WEXITSTATUS(status), kTimes);
}

TEST_F(SimulatedDriverTest, ReadersNeverSeeHalfAValue) {
    start(Layout::kLedTrigger);
    const Child writer([&] {
        for (;;) {
            put("intensity", "1\n");
            put("intensity", "10000\n");
        }
    });
    std::set<std::string> seen;
    for (int i = 0; i < 3000; ++i)
        seen.insert(get("intensity"));
    EXPECT_EQ(seen, (std::set<std::string>{"1\n", "10000\n"}));
}

TEST_F(SimulatedDriverTest, TraceIsLimitedAndStaysInsideMarkedFolders) {
    start(Layout::kLedTrigger);
    const std::string file = simulator::traceFile(mDirectory.path());
    const auto size = [&] {
        struct stat info {};
        return stat(file.c_str(), &info) == 0 ? info.st_size : -1;
    };
    ASSERT_EQ(truncate(file.c_str(), model::kTraceLimit - 1), 0);
    get("intensity");
    const off_t full = size();
    EXPECT_GT(full, model::kTraceLimit);
    get("intensity");
    EXPECT_EQ(size(), full);

    // A link is not followed; without the mark, nothing is written.
    const std::string victim = mDirectory.path() + "/victim";
    for (const bool isMarked : {true, false}) {
        remove(file.c_str());
        if (isMarked) {
            ASSERT_EQ(symlink(victim.c_str(), file.c_str()), 0);
        } else {
            ASSERT_EQ(remove((mDirectory.path() + "/.vibrator-sim").c_str()), 0);
        }
        get("intensity");
        EXPECT_EQ(access((isMarked ? victim : file).c_str(), F_OK), -1) << isMarked;
    }
}

TEST_F(SimulatedDriverTest, NamesStayInTheirFolder) {
    const simulator::Folder folder(mDirectory.path());
    for (const char* name : {"a/b", ".", "..", "../x", ""}) {
        EXPECT_NE(folder.replace(name, "x", 0600), 0) << name;
        EXPECT_FALSE(folder.open(name, O_RDONLY).isValid()) << name;
    }
    for (const char* path : {"..", "sys/../../x"})
        EXPECT_NE(simulator::Folder(folder, path, true).error(), 0) << path;
    start(Layout::kLedTrigger);
    for (const char* leaf : {"../../../../../victim", ".deadline", ""})
        EXPECT_NE(put(leaf, "1"), 0) << leaf;
    ASSERT_EQ(mkfifo((mDirectory.path() + path("pipe")).c_str(), 0600), 0);
    EXPECT_EQ(put("pipe", "1"), EINVAL) << "must not wait for a reader";
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
