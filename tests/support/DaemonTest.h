// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SimulatedDriver.h"
#include "support/Answer.h"
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>

#include <cstdlib>
#include <string>
#include <vector>

using tests::IDaxVibrator;

/** The real daemon, in a process of its own, on a simulated driver. */
class DaemonTest : public ::testing::Test {
  protected:
    DaemonTest() {
        setenv("HWBINDER_DIR", (mDirectory.path() + "/sockets").c_str(), 1);
        setenv("VIBRATOR_SIM_DIR", mDirectory.path().c_str(), 1);
        // A sanitizer's own library does not come first in a process with a preloaded one.
        setenv("ASAN_OPTIONS", "verify_asan_link_order=0", 1);
        simulator::claimDirectory(mDirectory.path());
    }
    ~DaemonTest() override {
        unsetenv("HWBINDER_DIR");
        unsetenv("VIBRATOR_SIM_DIR");
    }

    void SetUp() override {
        if (geteuid() != 0 && geteuid() != 1000) {
            GTEST_SKIP() << "the daemon serves only root and uid 1000 in full";
        }
    }

    /** Makes a driver, with more options of the simulator's create command. */
    void createDriver(const std::vector<std::string>& options = {}) const {
        std::vector<std::string> command = {VIBRATOR_SIM, "create"};
        command.insert(command.end(), options.begin(), options.end());
        const Outcome outcome = runProgram(command);
        ASSERT_EQ(outcome.exitCode, 0) << outcome.errors;
    }

    /** Starts the daemon, and waits until it answers. */
    void start(std::vector<std::string> environment = {}) {
        environment.emplace_back("LD_PRELOAD=" PRELOAD);
        mService.startProgram({SERVICE}, logFile(), environment);
        const auto isThere = [] {
            const auto vibrator = IDaxVibrator::tryGetService();
            return vibrator != nullptr && vibrator->ping().isOk();
        };
        ASSERT_TRUE(eventually(isThere)) << log();
    }

    std::string logFile() const { return mDirectory.path() + "/log"; }
    std::string log() const { return readFile(logFile()); }

    TemporaryDirectory mDirectory;
    ChildProcess mService;
};
