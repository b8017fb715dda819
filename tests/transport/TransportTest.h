// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "support/FakeVibrator.h"
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>
#include <hidl/HidlTransportSupport.h>
#include <sys/resource.h>

#include <cstdlib>
#include <string>

/** A directory for sockets, and a process that serves a FakeVibrator in it. */
class TransportTest : public ::testing::Test {
  protected:
    using IDaxVibrator = ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;
    using Status = FakeVibrator::Status;

    TransportTest() { setenv("HWBINDER_DIR", mDirectory.path().c_str(), 1); }
    ~TransportTest() override { unsetenv("HWBINDER_DIR"); }

    /** @param descriptors the limit that the process has; 0 leaves it as it is. */
    void serve(const std::string& instance = "default", rlim_t descriptors = 0) {
        mServer.start([&](const auto& ready) {
            if (descriptors != 0) {
                const rlimit limit{descriptors, descriptors};
                setrlimit(RLIMIT_NOFILE, &limit);
            }
            const android::sp<IDaxVibrator> vibrator = new FakeVibrator;
            android::hardware::configureRpcThreadpool(1, true);
            if (vibrator->registerAsService(instance) != android::OK) _exit(1);
            ready();
            android::hardware::joinRpcThreadpool();
        });
    }

    /** @return whether a new client gets a right answer. */
    static bool answers(const std::string& instance = "default") {
        const auto result = IDaxVibrator::getService(instance)->on(6);
        return result.isOk() && result == Status::BAD_VALUE;
    }

    TemporaryDirectory mDirectory;
    ChildProcess mServer;
};
