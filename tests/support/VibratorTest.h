// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "NodePathTable.h"
#include "SimulatedDriver.h"
#include "Vibrator.h"
#include "libhwbinder/Driver.h"
#include "support/LogCapture.h"
#include "support/Operations.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>

#include <ostream>
#include <string>
#include <vector>

namespace model {

inline void PrintTo(Layout layout, std::ostream* out) {
    *out << (layout == Layout::kTimedOutput ? "TimedOutput" : "LedTrigger");
}

}  // namespace model

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

using ::android::hardware::CallerIdentity;
using model::Layout;
using namespace ::tests;

/** A service object on a simulated driver, with the driver's trace and the log to look at. */
class VibratorTest : public ::testing::Test {
  protected:
    VibratorTest();
    ~VibratorTest() override;

    /** Makes a driver with all features, at rest, and the service object on it. */
    void start(Layout layout);
    /** Makes the driver anew. */
    void createDriver();
    /** Makes the service object on what there is. */
    void construct() { mVibrator = new Vibrator(); }

    /** @return where the node is on a device. */
    std::string path(const std::string& leaf) const { return sysfsDirectory(mLayout) + leaf; }
    /** @return the accesses of nodes since the last call, a line each, without their times. */
    std::string trace();
    /** @return the lines of the log since the last call, cut down. */
    std::string log() { return cutDown(mLog.takeText()); }

    /** Makes a call on what there is, and compares all that it shows with its steps. */
    void expectBehaviour(const Operation& operation, const Steps& steps, uid_t uid = 1000);
    /** The same on a driver made anew. */
    void expect(const Operation& operation, const Steps& steps, uid_t uid = 1000);
    void expect(const Operation& operation, uid_t uid = 1000) {
        expect(operation, parseSteps(mLayout, operation.steps), uid);
    }

    /** The system user calls, whoever runs the tests. */
    CallerIdentity mCaller{1000, 1};
    TemporaryDirectory mDirectory;
    LogCapture mLog;
    Layout mLayout = Layout::kLedTrigger;
    android::sp<Vibrator> mVibrator;

  private:
    size_t mTraceRead = 0;
};

/** The same in both layouts. */
class BothLayoutsTest : public VibratorTest, public ::testing::WithParamInterface<Layout> {
  protected:
    BothLayoutsTest() { start(GetParam()); }

    /** Expects of a call an answer and steps, which also tell what goes wrong. */
    void row(const Call& call, const std::string& answer, const std::string& steps) {
        expect({call, answer, steps, ""});
    }
};

#define INSTANTIATE_FOR_BOTH_LAYOUTS(Suite)                                        \
    INSTANTIATE_TEST_SUITE_P(Layouts, Suite, ::testing::ValuesIn(model::kLayouts), \
                             ::testing::PrintToStringParamName())

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
