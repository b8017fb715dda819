// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "SimulatedDriver.h"
#include "support/TransportTest.h"

#include <string>

/** The daemon on a simulated driver. */
class DaemonTest : public TransportTest {
  protected:
    DaemonTest() {
        setenv("HWBINDER_DIR", (mDirectory.path() + "/sockets").c_str(), 1);
        setenv("VIBRATOR_SIM_DIR", mDirectory.path().c_str(), 1);
        // A sanitizer's own library does not come first in a process with a preloaded one.
        setenv("ASAN_OPTIONS", "verify_asan_link_order=0", 1);
        simulator::claimDirectory(mDirectory.path());
    }
    ~DaemonTest() override { unsetenv("VIBRATOR_SIM_DIR"); }

    void SetUp() override {
        if (geteuid() != 0 && geteuid() != 1000) {
            GTEST_SKIP() << "the daemon serves only root and uid 1000 in full";
        }
    }

    /** Makes a driver, with more options of the simulator's create command. */
    static void createDriver(const std::string& options = {}) {
        const Outcome outcome = runProgram({"/bin/sh", "-c", VIBRATOR_SIM " create " + options});
        ASSERT_EQ(outcome.exitCode, 0) << outcome.errors;
    }

    /** Starts the daemon on the driver, and waits until it answers. */
    void start(const std::string& tags = {}) {
        serve("export LD_PRELOAD=" PRELOAD " ANDROID_LOG_TAGS='" + tags + "'");
    }
};
