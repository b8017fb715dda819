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
 * has an LED named "vibrator". Nothing here is simulated but the machine. What the nodes hold after
 * each operation, "vibratorctl selftest" checks there.
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

Outcome runClient(std::vector<std::string> words) {
    words.insert(words.begin(), "/bin/vibratorctl");
    return runProgram(words, kSystem);
}

TEST(KernelTest, TriggerDoesWhatTheSimulatorIsHeldTo) {
    expectTransientTrigger(kLed);
}

TEST(KernelTest, OnLightsTheLineForItsTime) {
    setenv("HWBINDER_DIR", "/run/hwbinder", 1);
    ASSERT_EQ(mkdir("/run/hwbinder", 0755), 0);
    ASSERT_EQ(chown("/run/hwbinder", kSystem, kSystem), 0);
    ChildProcess daemon;
    daemon.startProgram({kDaemon}, kLog, {}, kSystem);
    ASSERT_TRUE(eventually([] { return runClient({"off"}).exitCode == 0; })) << readFile(kLog);
    for (const int ms : {300, 50, 1000}) {
        // The machine is emulated, and may be held up: of three times the middle one counts.
        std::vector<double> lit;
        for (int i = 0; i < 3; ++i) {
            Watcher watcher;
            EXPECT_EQ(runClient({"on", std::to_string(ms)}).exitCode, 0);
            std::this_thread::sleep_for(std::chrono::milliseconds(ms + 200));
            lit.push_back(watcher.stop());
        }
        std::sort(lit.begin(), lit.end());
        std::cout << "on " << ms << " lit the line for " << lit[1] << " ms\n";
        // The kernel's timer wheel rounds up, by as much as 32 ms from 256 ms on.
        EXPECT_GT(lit[1], ms - 10);
        EXPECT_LT(lit[1], ms + 80);
    }
}

}  // namespace
