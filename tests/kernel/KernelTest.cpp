// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"
#include "support/TransientTrigger.h"

#include <gtest/gtest.h>
#include <sys/stat.h>

#include <algorithm>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <iostream>
#include <thread>

/**
 * The daemon and the client on a real kernel, as the one program of a virtual machine whose board
 * has an LED named "vibrator". Nothing here is simulated but the machine.
 */
namespace {

using Clock = std::chrono::steady_clock;

const std::string kLed = "/sys/class/leds/vibrator/";
constexpr char kDaemon[] = "/bin/vendor.velmora.hardware.vibrator@2.1-service";
constexpr char kLog[] = "/tmp/log";
constexpr uid_t kSystem = 1000;

/** Watches the LED's brightness, which is the line's level, until it goes out of scope. */
class Watcher {
  public:
    Watcher()
        : mThread([this] {
              while (!mStop) {
                  const bool lit = getNode(kLed + "brightness") != "0\n";
                  const Clock::time_point now = Clock::now();
                  if (lit && mFirst == Clock::time_point()) mFirst = now;
                  if (lit) mLast = now;
              }
          }) {}
    Watcher(const Watcher&) = delete;
    Watcher& operator=(const Watcher&) = delete;
    ~Watcher() { stop(); }

    /** @return how long the LED was lit, in ms. */
    double stop() {
        mStop = true;
        if (mThread.joinable()) mThread.join();
        return std::chrono::duration<double, std::milli>(mLast - mFirst).count();
    }

  private:
    std::atomic<bool> mStop{false};
    Clock::time_point mFirst;
    Clock::time_point mLast;
    std::thread mThread;
};

class KernelTest : public ::testing::Test {
  protected:
    static void SetUpTestSuite() {
        setenv("HWBINDER_DIR", "/run/hwbinder", 1);
        ASSERT_EQ(mkdir("/run/hwbinder", 0755), 0);
        ASSERT_EQ(chown("/run/hwbinder", kSystem, kSystem), 0);
        sDaemon = new ChildProcess;
        sDaemon->startProgram({kDaemon}, kLog, {}, kSystem);
        ASSERT_TRUE(eventually([] { return run({"status"}).exitCode == 0; })) << readFile(kLog);
    }
    static void TearDownTestSuite() { delete sDaemon; }

    KernelTest() { run({"off"}); }

    static Outcome run(std::vector<std::string> words) {
        words.insert(words.begin(), {"/bin/vibratorctl", "-v"});
        return runProgram(words, kSystem);
    }
    static void wait(int milliseconds) {
        std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
    }
    /** Shows a figure beside the check that it belongs to. */
    static void show(const std::string& what, double figure, const std::string& unit) {
        std::cout << "             " << what << ": " << figure << ' ' << unit << '\n';
    }

    static ChildProcess* sDaemon;
};

ChildProcess* KernelTest::sDaemon = nullptr;

TEST_F(KernelTest, LayoutIsFoundAsLedTrigger) {
    const std::string log = readFile(kLog);
    EXPECT_NE(log.find("Vibrator using LED trigger"), std::string::npos) << log;
    EXPECT_NE(log.find("THE_DEVICE_INTENSITY " + kLed + "intensity"), std::string::npos) << log;
}

TEST_F(KernelTest, TriggerDoesWhatTheSimulatorIsHeldTo) {
    expectTransientTrigger(kLed);
}

TEST_F(KernelTest, OnLightsTheLineForItsTime) {
    for (const int ms : {300, 50, 1000}) {
        // The machine is emulated, and may be held up: of three times the middle one counts.
        std::vector<double> lit;
        for (int i = 0; i < 3; ++i) {
            Watcher watcher;
            EXPECT_EQ(run({"on", std::to_string(ms)}).exitCode, 0);
            EXPECT_EQ(getNode(kLed + "duration"), std::to_string(ms) + "\n");
            wait(ms + 200);
            lit.push_back(watcher.stop());
        }
        std::sort(lit.begin(), lit.end());
        show("on " + std::to_string(ms) + " lit the line for", lit[1], "ms");
        // The kernel's timer wheel rounds up, by as much as 32 ms from 256 ms on.
        EXPECT_GT(lit[1], ms - 10);
        EXPECT_LT(lit[1], ms + 80);
    }
}

TEST_F(KernelTest, OffEndsItEarly) {
    Watcher watcher;
    EXPECT_EQ(run({"on", "60000"}).exitCode, 0);
    wait(200);
    EXPECT_EQ(getNode(kLed + "activate"), "1\n");
    EXPECT_EQ(run({"off"}).exitCode, 0);
    EXPECT_EQ(getNode(kLed + "brightness"), "0\n");
    EXPECT_EQ(getNode(kLed + "activate"), "0\n");
    wait(50);
    const double lit = watcher.stop();
    show("on 60000, off after 200 ms: lit for", lit, "ms");
    EXPECT_GT(lit, 150);
    EXPECT_LT(lit, 1000);
}

TEST_F(KernelTest, ClickLightsTheLine) {
    Watcher watcher;
    // Without an intensity node its strength is not set, and it is played all the same.
    EXPECT_EQ(run({"click"}).output, "click: OK, 20 ms [perform: OK]\n");
    wait(200);
    show("click lit the line for", watcher.stop(), "ms");
    EXPECT_EQ(getNode(kLed + "duration"), "20\n");
}

}  // namespace
