// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

const std::string kTimed = "/sys/class/timed_output/vibrator/";
const std::string kLed = "/sys/class/leds/vibrator/";

class DriverModeTest : public VibratorTest {
  protected:
    void create(Layout layout) {
        mLayout = layout;
        ASSERT_EQ(createDriver(mDirectory.path(), layout, {}), 0);
    }

    /** The log of a construction: the probes, the verdict, and the paths in a directory. */
    static Lines constructionLog(const Lines& probes, const std::string& verdict,
                                 const std::string& directory) {
        Lines lines = join({{"D !@QOR VIB HAL init"}, probes, {"D " + verdict}});
        const std::pair<std::string, std::string> nodes[] = {
                {"INTENSITY", "intensity"},
                {"FORCE_TOUCH_INTENSITY", "force_touch_intensity"},
                {"MULTI_FREQ", "multi_freq"},
                {"HAPTIC_ENGINE", "haptic_engine"},
                {"HAPTIC_ENGINE_INDEX", "cp_trigger_index"},
                {"HAPTIC_PLAYBACK_QUEUE", "cp_trigger_queue"},
                {"HAPTIC_ENGINE_NUM_WAVES", "num_waves"},
                {"MOTOR_TYPE", "motor_type"},
                {"EVENT_CMD", "event_cmd"},
                {"PATTERN_LENGTH", "pattern_length"},
                {"EXT_CONTROL", "ext_control"}};
        for (const auto& [name, leaf] : nodes) {
            lines.push_back("D Vibrator THE_DEVICE_" + name + " " +
                            (directory.empty() ? "" : directory + leaf));
        }
        return lines;
    }
    static Lines probe(const std::string& path, bool exists) {
        return {"D isNodeExist node:" + path + " ", exists ? "D true" : "D false"};
    }
};

constexpr char kNoDriver[] =
        "Vibrator driver does not exist. Remove VIB HAL or Setup Vibrator Driver";

TEST_F(DriverModeTest, TimedOutputWinsAfterASingleProbe) {
    create(Layout::kLedTrigger);
    create(Layout::kTimedOutput);
    construct();
    EXPECT_EQ(DriverMode, 0);
    EXPECT_EQ(trace(), probed("enable"));
    EXPECT_EQ(log(), constructionLog(probe(kTimed + "enable", true), "Vibrator using timed_output",
                                     kTimed));
}

TEST_F(DriverModeTest, LedTriggerNeedsItsThreeNodes) {
    create(Layout::kLedTrigger);
    construct();
    EXPECT_EQ(DriverMode, 1);
    EXPECT_EQ(trace(), join({{"timed_output/enable open O_RDWR = -1 ENOENT"},
                             probed("activate"),
                             probed("duration"),
                             probed("state")}));
    EXPECT_EQ(log(),
              constructionLog(join({probe(kTimed + "enable", false), probe(kLed + "activate", true),
                                    probe(kLed + "duration", true), probe(kLed + "state", true)}),
                              "Vibrator using LED trigger", kLed));
}

TEST_F(DriverModeTest, NodeThatOnlyReadsIsNoTimedOutputDriver) {
    create(Layout::kTimedOutput);
    setMode("enable", 0444);
    create(Layout::kLedTrigger);
    construct();
    EXPECT_EQ(DriverMode, 1);
    EXPECT_EQ(THE_DEVICE_INTENSITY, kLed + "intensity");
}

TEST_F(DriverModeTest, ProbingStopsAtTheFirstMissingNode) {
    const std::pair<std::string, size_t> cases[] = {{"state", 4}, {"duration", 3}, {"activate", 2}};
    for (const auto& [leaf, probes] : cases) {
        create(Layout::kLedTrigger);
        removeNode(leaf);
        trace();
        log();
        construct();
        EXPECT_EQ(DriverMode, 0) << leaf;
        Lines probed = probe(kTimed + "enable", false);
        const std::string order[] = {"activate", "duration", "state"};
        for (size_t i = 0; i + 1 < probes; ++i) {
            probed = join({probed, probe(kLed + order[i], order[i] != leaf)});
        }
        EXPECT_EQ(log(), constructionLog(probed, kNoDriver, ""));
    }
}

TEST_F(DriverModeTest, FixedPathsAreThereFromTheStart) {
    EXPECT_EQ(THE_DEVICE_ENABLE, "/sys/class/timed_output/vibrator/enable");
    EXPECT_EQ(THE_DEVICE_ACTIVATE, "/sys/class/leds/vibrator/activate");
    EXPECT_EQ(THE_DEVICE_DURATION, "/sys/class/leds/vibrator/duration");
    EXPECT_EQ(THE_DEVICE_STATE, "/sys/class/leds/vibrator/state");
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
