// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Vibrator.h"
#include "support/Answer.h"
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>
#include <hidl/HidlTransportSupport.h>
#include <sys/resource.h>

#include <cstdlib>
#include <string>

/**
 * A directory for sockets, and a process that serves an object in it. The operation that is called
 * is one that answers without a look at the driver.
 */
class TransportTest : public ::testing::Test {
  protected:
    using Status = VibratorStatus;
    using Vibrator = ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

    TransportTest() {
        setenv("HWBINDER_DIR", mDirectory.path().c_str(), 1);
        // What the object does is not looked at here.
        setenv("ANDROID_LOG_TAGS", "QorVibrator-HAL2.1:S", 1);
    }
    ~TransportTest() override {
        unsetenv("HWBINDER_DIR");
        unsetenv("ANDROID_LOG_TAGS");
    }

    /** @param descriptors the limit that the process has; 0 leaves it as it is. */
    void serve(const std::string& instance = "default", rlim_t descriptors = 0) {
        mServer.start([&](const auto& ready) {
            if (descriptors != 0) {
                const rlimit limit{descriptors, descriptors};
                setrlimit(RLIMIT_NOFILE, &limit);
            }
            const android::sp<IDaxVibrator> vibrator = new Vibrator;
            android::hardware::configureRpcThreadpool(1, true);
            if (vibrator->registerAsService(instance) != android::OK) _exit(1);
            ready();
            android::hardware::joinRpcThreadpool();
        });
    }

    /** @return what an effect of 1.1, which is never played, is answered with. */
    template <typename Interface>
    static Answer call(Interface& vibrator) {
        return answerTo<StatusAndNumber>([&](const auto& callback) {
            return vibrator.perform_1_1(::android::hardware::vibrator::V1_1::Effect_1_1::CLICK,
                                        ::android::hardware::vibrator::V1_0::EffectStrength::LIGHT,
                                        callback);
        });
    }
    /** @return whether a new client gets a right answer. */
    static bool answers(const std::string& instance = "default") {
        return call(*IDaxVibrator::getService(instance)).inWords() == "(UNSUPPORTED_OPERATION, 0)";
    }

    TemporaryDirectory mDirectory;
    ChildProcess mServer;
};
