// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include "Faults.h"
#include "Trace.h"

#include <hwbinder/IPCThreadState.h>
#include <sys/stat.h>

#include <cstdlib>
#include <fstream>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

CallerIdentity::CallerIdentity(uid_t uid) {
    auto* thread = ::android::hardware::IPCThreadState::self();
    mOwn = thread->clearCallingIdentity();
    thread->restoreCallingIdentity(static_cast<int64_t>(uint64_t{uid} << 32 | 1));
}

CallerIdentity::~CallerIdentity() {
    ::android::hardware::IPCThreadState::self()->restoreCallingIdentity(mOwn);
}

VibratorTest::VibratorTest() {
    setenv("VIBRATOR_SIM_DIR", mDirectory.path().c_str(), 1);
    // What the process has before it makes its one service object.
    DriverMode = kTimedOutputMode;
    for (std::string* path :
         {&THE_DEVICE_INTENSITY, &THE_DEVICE_FORCE_TOUCH_INTENSITY, &THE_DEVICE_MULTI_FREQ,
          &THE_DEVICE_HAPTIC_ENGINE, &THE_DEVICE_HAPTIC_ENGINE_INDEX,
          &THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, &THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
          &THE_DEVICE_MOTOR_TYPE, &THE_DEVICE_EVENT_CMD, &THE_DEVICE_PATTERN_LENGTH,
          &THE_DEVICE_EXT_CONTROL}) {
        path->clear();
    }
}

VibratorTest::~VibratorTest() {
    unsetenv("VIBRATOR_SIM_DIR");
}

void VibratorTest::start(Layout layout, const std::set<std::string>& without) {
    mLayout = layout;
    simulator::Features features;
    for (const std::string& name : simulator::featureNames()) {
        if (without.count(name) == 0) features.names.insert(name);
    }
    ASSERT_EQ(createDriver(mDirectory.path(), layout, features), 0);
    construct();
    trace();
    log();
}

void VibratorTest::construct() {
    mVibrator = new Vibrator();
}

void VibratorTest::setNode(const std::string& leaf, const std::string& text) const {
    std::ofstream(mDirectory.path() + path(leaf)) << text;
}

void VibratorTest::removeNode(const std::string& leaf) const {
    ASSERT_EQ(remove((mDirectory.path() + path(leaf)).c_str()), 0);
}

void VibratorTest::setMode(const std::string& leaf, unsigned mode) const {
    ASSERT_EQ(chmod((mDirectory.path() + path(leaf)).c_str(), mode), 0);
}

void VibratorTest::fail(const std::string& leaf, const std::string& operation,
                        const std::string& fault, unsigned times, unsigned after) const {
    auto parsed = simulator::parseFault(fault);
    ASSERT_TRUE(parsed) << fault;
    parsed->times = times;
    parsed->after = after;
    ASSERT_TRUE(simulator::setFault(mDirectory.path(), leaf, operation, parsed));
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

std::string VibratorTest::nodeName(const std::string& leaf) const {
    return (mLayout == Layout::kTimedOutput ? "timed_output/" : "leds/") + leaf;
}

Lines VibratorTest::written(const std::string& leaf, const std::string& text) const {
    const std::string node = nodeName(leaf);
    return {node + " open O_RDWR = 0",
            node + " write " + simulator::quote(text) + " = " + std::to_string(text.size()),
            node + " close = 0"};
}

Lines VibratorTest::read(const std::string& leaf, const std::string& text, size_t size,
                         const std::string& mode) const {
    const std::string node = nodeName(leaf);
    return {node + " open " + mode + " = 0",
            node + " read " + std::to_string(size) + " = " + std::to_string(text.size()) + " " +
                    simulator::quote(text),
            node + " close = 0"};
}

Lines VibratorTest::probed(const std::string& leaf, const std::string& mode) const {
    return {nodeName(leaf) + " open " + mode + " = 0", nodeName(leaf) + " close = 0"};
}

Lines VibratorTest::missing(const std::string& leaf, const std::string& mode) const {
    return {nodeName(leaf) + " open " + mode + " = -1 ENOENT"};
}

Lines VibratorTest::switchedOn(const std::string& ms) const {
    if (mLayout == Layout::kTimedOutput) return written("enable", ms + "\n");
    return join(
            {written("state", "1\n"), written("duration", ms + "\n"), written("activate", "1\n")});
}

Lines VibratorTest::writeLog(const std::string& leaf, int value, bool succeeds) const {
    return {"D >> writeNode node:" + path(leaf) + " val:" + std::to_string(value),
            succeeds ? "D << writeNode node OK" : "D << writeNode node UNKNOWN_ERROR"};
}

Lines VibratorTest::probeLog(const std::string& leaf, bool exists) const {
    return {"D isNodeExist node:" + path(leaf) + " ", exists ? "D true" : "D false"};
}

Lines VibratorTest::readLog(const std::string& leaf) const {
    return {"D >> readNode node:" + path(leaf) + " ", "D << readNode done"};
}

Lines join(const std::vector<Lines>& parts) {
    Lines all;
    for (const Lines& part : parts)
        all.insert(all.end(), part.begin(), part.end());
    return all;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
