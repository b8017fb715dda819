// SPDX-License-Identifier: Apache-2.0
#include "support/TransientTrigger.h"
#include "support/VibratorTest.h"

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
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

TEST_F(SimulatedDriverTest, TimedOutputCountsDown) {
    start(Layout::kTimedOutput);
    EXPECT_EQ(get("enable"), "0\n");
    EXPECT_EQ(put("enable", "10000"), 0);
    sleep(20);
    const int left = std::stoi(get("enable"));
    EXPECT_LT(left, 9981);
    EXPECT_GT(left, 1000);
    EXPECT_EQ(put("enable", "30"), 0);
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

TEST_F(SimulatedDriverTest, ValuesAreCheckedAsTheKernelDoes) {
    start(Layout::kLedTrigger);
    const struct {
        std::string leaf;
        std::string text;
        int error;
    } cases[] = {
            {"intensity", "10000\n", 0},
            {"intensity", "10001\n", EINVAL},
            {"intensity", "-1", EINVAL},
            {"intensity", "99999999999", ERANGE},
            {"multi_freq", "5", EINVAL},
            {"cp_trigger_index", "65536", EINVAL},
            {"cp_trigger_queue", "3.50, 10, 0~", EINVAL},
            {"haptic_engine", "4 1 2 3 4\n", 0},
            {"haptic_engine", "4 1 2 3 4", EINVAL},
            {"haptic_engine", "4 1 2 3\n", EINVAL},
            {"haptic_engine", "3 1 2 3\n", EINVAL},
            {"haptic_engine", "4 1 2  3 4\n", EINVAL},
            {"haptic_engine", "4 1 2 3 4 \n", EINVAL},
            {"haptic_engine", "4 1 2 3 4\n\n", EINVAL},
            {"event_cmd", "FOLDER_AJAR\n", EINVAL},
            {"motor_type", "LINEAR\n", EIO},
            {"num_waves", "1", EACCES},
            {"absent", "1", ENOENT},
    };
    for (const auto& [leaf, text, error] : cases) {
        const std::string before = error == ENOENT ? "" : get(leaf);
        EXPECT_EQ(put(leaf, text), error) << leaf << ' ' << testing::PrintToString(text);
        if (error != 0 && error != ENOENT) {
            EXPECT_EQ(get(leaf), before);
        }
    }
    setMode("intensity", 0200);
    EXPECT_EQ(::open(path("intensity").c_str(), O_RDONLY), -1);
    EXPECT_EQ(errno, EACCES);
}

TEST_F(SimulatedDriverTest, AtMostAPageIsTakenAtOnce) {
    start(Layout::kLedTrigger);
    setNode("scratch", "");
    const int file = ::open(path("scratch").c_str(), O_RDWR);
    const std::string text(5000, 'x');
    EXPECT_EQ(::write(file, text.data(), text.size()), 4096);
    ::close(file);
}

TEST_F(SimulatedDriverTest, OtherFilesAreNotTouched) {
    start(Layout::kLedTrigger);
    const std::string plain = mDirectory.path() + "/plain";
    const int file = ::open(plain.c_str(), O_RDWR | O_CREAT, 0600);
    ASSERT_GE(file, 0);
    EXPECT_EQ(::write(file, "abc", 3), 3);
    EXPECT_EQ(::close(file), 0);
    EXPECT_EQ(trace(), Lines());
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
