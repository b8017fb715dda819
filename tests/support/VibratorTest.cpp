// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include "TraceFile.h"

#include <cerrno>
#include <cstdlib>
#include <fstream>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** What the process remembers of the driver before it makes its one service object. */
void forgetDriver() {
    static const uint8_t initialMode = DriverMode;
    DriverMode = initialMode;
    for (const NodeInfo& node : NodePathTable) {
        if (node.path != nullptr) node.path->clear();
    }
}

}  // namespace

VibratorTest::VibratorTest() {
    setenv("VIBRATOR_SIM_DIR", mDirectory.path().c_str(), 1);
    simulator::claimDirectory(mDirectory.path());
    forgetDriver();
}

VibratorTest::~VibratorTest() {
    unsetenv("VIBRATOR_SIM_DIR");
}

void VibratorTest::createDriver() {
    ASSERT_EQ(simulator::createDriver(mDirectory.path(), mLayout, {}), 0);
}

void VibratorTest::start(Layout layout) {
    mLayout = layout;
    createDriver();
    construct();
    trace();
    log();
}

std::string VibratorTest::trace() {
    std::ifstream file(simulator::traceFile(mDirectory.path()));
    file.seekg(static_cast<std::streamoff>(mTraceRead));
    std::string text;
    for (std::string line; std::getline(file, line);) {
        mTraceRead += line.size() + 1;
        text += line.substr(line.find(' ') + 1) + "\n";
    }
    return text;
}

void VibratorTest::expectBehaviour(const Operation& operation, const Steps& steps, uid_t uid) {
    const CallerIdentity caller(uid, 1);
    errno = 0;
    Behaviour shown;
    shown.answer = operation.call(*mVibrator).inWords();
    shown.trace = trace();
    shown.log = log();
    EXPECT_EQ(shown.text(), behaviourOf(mLayout, operation, steps, uid).text())
            << operation.name() << " " << operation.steps;
}

void VibratorTest::expect(const Operation& operation, const Steps& steps, uid_t uid) {
    createDriver();
    prepareNodes(mDirectory.path(), mLayout, steps);
    expectBehaviour(operation, steps, uid);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
