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
        simulator::claimDirectory(mDirectory.path());
    }
    ~DaemonTest() override { unsetenv("VIBRATOR_SIM_DIR"); }

    void SetUp() override {
        if (geteuid() != 0 && geteuid() != 1000) {
            GTEST_SKIP() << "the daemon serves only root and uid 1000 in full";
        }
    }

    /** Makes a driver. */
    void createDriver(simulator::Layout layout = simulator::Layout::kLedTrigger,
                      const simulator::Features& features = {}) const {
        ASSERT_EQ(simulator::createDriver(mDirectory.path(), layout, features), 0);
    }
    /** Starts the daemon on the driver, and waits until it answers. */
    void start() { serve("export LD_PRELOAD=" PRELOAD); }
};
