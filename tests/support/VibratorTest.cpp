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
    std::string* const paths[] = {
            &THE_DEVICE_INTENSITY,      &THE_DEVICE_FORCE_TOUCH_INTENSITY,
            &THE_DEVICE_MULTI_FREQ,     &THE_DEVICE_HAPTIC_ENGINE,
            &THE_DEVICE_EVENT_CMD,      &THE_DEVICE_HAPTIC_ENGINE_INDEX,
            &THE_DEVICE_MOTOR_TYPE,     &THE_DEVICE_HAPTIC_PLAYBACK_QUEUE,
            &THE_DEVICE_PATTERN_LENGTH, &THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
            &THE_DEVICE_EXT_CONTROL,
    };
    static const uint8_t initialMode = DriverMode;
    DriverMode = initialMode;
    for (std::string* path : paths)
        path->clear();
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
    model::Features features;
    for (const std::string& name : model::featureNames())
        features.names.insert(name);
    ASSERT_EQ(simulator::createDriver(mDirectory.path(), mLayout, features), 0);
}

void VibratorTest::start(Layout layout) {
    mLayout = layout;
    createDriver();
    construct();
    trace();
    log();
}

Lines VibratorTest::trace() {
    std::ifstream file(simulator::traceFile(mDirectory.path()));
    file.seekg(static_cast<std::streamoff>(mTraceRead));
    Lines lines;
    for (std::string line; std::getline(file, line);) {
        mTraceRead += line.size() + 1;
        lines.push_back(line.substr(line.find(' ') + 1));
    }
    return lines;
}

void VibratorTest::expectBehaviour(const Operation& operation, const std::vector<Step>& steps,
                                   const Circumstances& circumstances) {
    SCOPED_TRACE(operation.name + " " + operation.steps);
    const Behaviour expected =
            behaviourOf(mLayout, steps, operation.answer, operation.answerFailed, circumstances);
    errno = 0;
    EXPECT_EQ(operation.call(*mVibrator).inWords(), expected.answer);
    EXPECT_EQ(trace(), expected.trace);
    EXPECT_EQ(log(), expected.log);
}

void VibratorTest::expect(const Operation& operation, const std::vector<Step>& steps,
                          const Circumstances& circumstances) {
    createDriver();
    prepareNodes(mDirectory.path(), mLayout, steps);
    expectBehaviour(operation, steps, circumstances);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
