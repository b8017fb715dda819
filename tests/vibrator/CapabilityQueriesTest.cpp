// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

struct Capability {
    const char* leaf;
    Return<bool> (Vibrator::*query)();
};

const Capability kCapabilities[] = {
        {"intensity", &Vibrator::daxSupportsAmplitudeControl},
        {"force_touch_intensity", &Vibrator::daxSupportsForceTouchAmplitudeControl},
        {"multi_freq", &Vibrator::daxSupportsFrequencyControl},
        {"haptic_engine", &Vibrator::daxSupportsHapticEngine},
        {"cp_trigger_index", &Vibrator::daxSupportsPrebakedHapticPattern},
        {"ext_control", &Vibrator::supportsExternalControl},
};

class CapabilityQueriesTest : public BothLayoutsTest {
  protected:
    CapabilityQueriesTest() { start(GetParam()); }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(CapabilityQueriesTest);

TEST_P(CapabilityQueriesTest, AnswerFollowsTheNodeAtTheTimeOfTheCall) {
    for (const auto& [leaf, query] : kCapabilities) {
        SCOPED_TRACE(leaf);
        EXPECT_TRUE((*mVibrator.*query)());
        EXPECT_EQ(trace(), probed(leaf));
        EXPECT_EQ(log(), probeLog(leaf, true));
        setMode(leaf, 0444);
        EXPECT_FALSE((*mVibrator.*query)());
        removeNode(leaf);
        EXPECT_FALSE((*mVibrator.*query)());
        EXPECT_EQ(log(), join({probeLog(leaf, false), probeLog(leaf, false)}));
        trace();
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
