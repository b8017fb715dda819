// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"
#include "NodePaths.h"
#include "Vibrator.h"
#include "support/LogCapture.h"
#include "support/TemporaryDirectory.h"
#include "support/VibratorPeer.h"

#include <gtest/gtest.h>

#include <optional>
#include <ostream>
#include <set>
#include <string>
#include <vector>

namespace android::hardware::vibrator::V1_0 {
inline void PrintTo(Status status, std::ostream* out) {
    const char* const names[] = {"OK", "UNKNOWN_ERROR", "BAD_VALUE", "UNSUPPORTED_OPERATION"};
    *out << names[static_cast<size_t>(status)];
}
}  // namespace android::hardware::vibrator::V1_0

namespace simulator {
inline void PrintTo(Layout layout, std::ostream* out) {
    *out << (layout == Layout::kTimedOutput ? "TimedOutput" : "LedTrigger");
}
}  // namespace simulator

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

using simulator::Layout;

/** Makes this thread's calls look like another uid's. */
class CallerIdentity {
  public:
    explicit CallerIdentity(uid_t uid);
    CallerIdentity(const CallerIdentity&) = delete;
    CallerIdentity& operator=(const CallerIdentity&) = delete;
    ~CallerIdentity();

  private:
    int64_t mOwn;
};

/** A service object on a simulated driver, with the driver's trace and the log to look at. */
class VibratorTest : public ::testing::Test {
  protected:
    VibratorTest();
    ~VibratorTest() override;

    /** Makes a driver with all features but the given ones, and the service object on it. */
    void start(Layout layout, const std::set<std::string>& without = {});
    /** Makes the service object on what there is. */
    void construct();

    /** Puts text into a node, or takes the node away. */
    void setNode(const std::string& leaf, const std::string& text) const;
    void removeNode(const std::string& leaf) const;
    void setMode(const std::string& leaf, unsigned mode) const;
    /** Makes accesses of a node fail, some time after now; times 0 is for ever. */
    void fail(const std::string& leaf, const std::string& operation, const std::string& fault,
              unsigned times = 0, unsigned after = 0) const;

    /** @return where the node is on a device. */
    std::string path(const std::string& leaf) const { return sysfsDirectory(mLayout) + leaf; }
    /** @return the accesses of nodes since the last call, without their times. */
    Lines trace();
    Lines log() { return mLog.takeLines(); }

    // What the trace shows of an undisturbed access.
    Lines written(const std::string& leaf, const std::string& text) const;
    Lines read(const std::string& leaf, const std::string& text, size_t size,
               const std::string& mode = "O_RDONLY") const;
    Lines probed(const std::string& leaf, const std::string& mode = "O_RDWR") const;
    Lines missing(const std::string& leaf, const std::string& mode = "O_RDWR") const;
    /** What on(ms) does in the layout at hand. */
    Lines switchedOn(const std::string& ms) const;

    // What the log shows of the node primitives.
    Lines writeLog(const std::string& leaf, int value, bool succeeds = true) const;
    Lines probeLog(const std::string& leaf, bool exists) const;
    Lines readLog(const std::string& leaf) const;

    /** The system user calls, whoever runs the tests. */
    CallerIdentity mCaller{1000};
    TemporaryDirectory mDirectory;
    LogCapture mLog;
    Layout mLayout = Layout::kLedTrigger;
    android::sp<Vibrator> mVibrator;

  private:
    std::string nodeName(const std::string& leaf) const;
    size_t mTraceRead = 0;
};

/** The same in both layouts. */
class BothLayoutsTest : public VibratorTest, public ::testing::WithParamInterface<Layout> {};

inline std::string layoutName(const ::testing::TestParamInfo<Layout>& info) {
    return ::testing::PrintToString(info.param);
}

#define INSTANTIATE_FOR_BOTH_LAYOUTS(Suite)                                                \
    INSTANTIATE_TEST_SUITE_P(Layouts, Suite,                                               \
                             ::testing::Values(Layout::kTimedOutput, Layout::kLedTrigger), \
                             layoutName)

/** @return several lists of lines as one. */
Lines join(const std::vector<Lines>& parts);

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
