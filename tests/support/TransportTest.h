// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "support/Answer.h"
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <csignal>
#include <cstdlib>
#include <string>

using tests::Answer;
using tests::answerTo;
using tests::IDaxVibrator;
using tests::VibratorStatus;

/**
 * The daemon, without a look at what its driver is, and a way to it: a directory of sockets, or the
 * kernel's binder where HWBINDER_DEVICE names it.
 */
class TransportTest : public ::testing::Test {
  protected:
    TransportTest() {
        if (!isKernel()) setenv("HWBINDER_DIR", mDirectory.path().c_str(), 1);
    }
    ~TransportTest() override { unsetenv("HWBINDER_DIR"); }

    static bool isKernel() { return getenv("HWBINDER_DEVICE") != nullptr; }

    /** Starts a daemon. @param limits shell commands that come first. */
    void startDaemon(Child& daemon, const std::string& limits = "true") const {
        daemon.startProgram({"/bin/sh", "-c", limits + "; exec \"$0\"", SERVICE}, logFile());
    }
    /** Starts the daemon, and waits until it answers. */
    void serve(const std::string& limits = "true") {
        startDaemon(mServer, limits);
        ASSERT_TRUE(eventually(answers)) << log();
    }
    /** Stops the daemon, and waits until it has stopped. */
    void stopServer() const {
        ::kill(mServer.pid(), SIGSTOP);
        EXPECT_EQ(waitpid(mServer.pid(), nullptr, WUNTRACED), mServer.pid());
    }

    /** @return what an effect of 1.1, which is never played, is answered with. */
    template <typename Interface>
    static Answer call(Interface& vibrator) {
        return answerTo([&](const auto& callback) {
            return vibrator.perform_1_1(::android::hardware::vibrator::V1_1::Effect_1_1::CLICK,
                                        ::android::hardware::vibrator::V1_0::EffectStrength::LIGHT,
                                        callback);
        });
    }
    /** @return whether a new client gets a right answer. */
    static bool answers() {
        const auto vibrator = IDaxVibrator::tryGetService();
        return vibrator != nullptr && call(*vibrator).inWords() == "(UNSUPPORTED_OPERATION, 0)";
    }

    std::string logFile() const { return mDirectory.path() + "/log"; }
    std::string log() const { return readFile(logFile()); }

    TemporaryDirectory mDirectory;
    Child mServer;
};
