// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include <functional>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** An operation that is called with arguments out of range: the gate comes before them. */
struct GatedCall {
    const char* name;
    /** Makes the call and checks that its answer is the one to a refused caller. */
    std::function<void(Vibrator&)> callRefused;
    /** The line that the operation logs before the gate. */
    std::string entryLine;
};

void PrintTo(const GatedCall& call, std::ostream* out) {
    *out << call.name;
}

std::function<void(Vibrator&)> answersFalse(Return<bool> (Vibrator::*query)()) {
    return [query](Vibrator& vibrator) {
        const Return<bool> answer = (vibrator.*query)();
        EXPECT_TRUE(answer.isOk());
        EXPECT_FALSE(answer);
    };
}

template <typename Call>
std::function<void(Vibrator&)> answersUnknownError(Call call) {
    return [call](Vibrator& vibrator) {
        const Return<Status> answer = call(vibrator);
        EXPECT_TRUE(answer.isOk());
        EXPECT_EQ(Status(answer), Status::UNKNOWN_ERROR);
    };
}

std::vector<GatedCall> gatedCalls() {
    return {
            {"AmplitudeControl", answersFalse(&Vibrator::daxSupportsAmplitudeControl), ""},
            {"ForceTouch", answersFalse(&Vibrator::daxSupportsForceTouchAmplitudeControl), ""},
            {"FrequencyControl", answersFalse(&Vibrator::daxSupportsFrequencyControl), ""},
            {"HapticEngine", answersFalse(&Vibrator::daxSupportsHapticEngine), ""},
            {"Prebaked", answersFalse(&Vibrator::daxSupportsPrebakedHapticPattern), ""},
            {"FolderStatus", answersFalse(&Vibrator::daxSupportsFolderStatusSetting),
             "D daxSupportsFolderStatusSetting starts"},
            {"Enhanced", answersFalse(&Vibrator::daxSupportsEnhancedVelmoraHapticPattern), ""},
            {"SetAmplitude", answersUnknownError([](Vibrator& v) { return v.daxSetAmplitude(0); }),
             ""},
            {"SetForceTouch",
             answersUnknownError([](Vibrator& v) { return v.daxSetForceTouchAmplitude(0); }), ""},
            {"SetFrequency", answersUnknownError([](Vibrator& v) {
                 return v.daxSetFrequencyType(static_cast<DaxFrequencyType>(5));
             }),
             ""},
            {"SetFolderStatus", answersUnknownError([](Vibrator& v) {
                 return v.daxSetFolderStatus(static_cast<DaxFolderStatus>(2));
             }),
             "D daxSetFolderStatus starts"},
            {"CountPrebaked",
             [](Vibrator& vibrator) {
                 int calls = 0;
                 vibrator.daxGetNumberOfPrebakedHapticPattern([&](Status status, uint32_t count) {
                     EXPECT_EQ(status, Status::UNKNOWN_ERROR);
                     EXPECT_EQ(count, 0U);
                     ++calls;
                 });
                 EXPECT_EQ(calls, 1);
             },
             ""},
            {"PerformEngine", answersUnknownError([](Vibrator& v) {
                 return v.daxPerformHapticEngine(std::vector<DaxHapticEnginePacket>(340), 0);
             }),
             ""},
            {"PerformPrebaked", answersUnknownError([](Vibrator& v) {
                 return v.daxPerformPrebakedHapticPattern(4294967295U, 0, true);
             }),
             "D daxPerformPrebakedHapticPattern pattern : -1, amplitude : 0"},
            {"AmplitudeList",
             [](Vibrator& vibrator) {
                 int calls = 0;
                 vibrator.daxGetAmplitudeList(static_cast<DaxAmplitudeType>(2),
                                              [&](bool supported, const hidl_vec<uint32_t>& list) {
                                                  EXPECT_FALSE(supported);
                                                  EXPECT_EQ(list.size(), 0U);
                                                  ++calls;
                                              });
                 EXPECT_EQ(calls, 1);
             },
             ""},
    };
}

class GateTest : public VibratorTest, public ::testing::WithParamInterface<GatedCall> {
  protected:
    GateTest() { start(Layout::kLedTrigger); }
};
INSTANTIATE_TEST_SUITE_P(Operations, GateTest, ::testing::ValuesIn(gatedCalls()),
                         [](const auto& each) { return each.param.name; });

TEST_P(GateTest, RefusedCallerReachesNothing) {
    const std::pair<uid_t, std::string> callers[] = {
            {2000, "2000"}, {1001, "1001"}, {999, "999"}, {10123, "10123"}, {4294967295U, "-1"}};
    for (const auto& [uid, shown] : callers) {
        const CallerIdentity caller(uid);
        GetParam().callRefused(*mVibrator);
        Lines expected = {"E Pemission denied (" + shown + ")"};
        if (!GetParam().entryLine.empty()) expected.insert(expected.begin(), GetParam().entryLine);
        EXPECT_EQ(log(), expected);
        EXPECT_EQ(trace(), Lines());
    }
}

class CallerPermissionTest : public VibratorTest {
  protected:
    CallerPermissionTest() { start(Layout::kTimedOutput); }
};

TEST_F(CallerPermissionTest, SystemAndRootPass) {
    for (const uid_t uid : {0U, 1000U}) {
        const CallerIdentity caller(uid);
        EXPECT_TRUE(mVibrator->daxSupportsAmplitudeControl()) << uid;
        EXPECT_EQ(log(), probeLog("intensity", true));
        EXPECT_EQ(Status(mVibrator->daxSetAmplitude(0)), Status::BAD_VALUE);
        EXPECT_EQ(log(), Lines{"E daxSetAmplitude amplitude is abnormal 0"});
    }
}

TEST_F(CallerPermissionTest, StandardAmplitudeOperationsMeetTheGateInside) {
    const CallerIdentity caller(2000);
    EXPECT_FALSE(mVibrator->supportsAmplitudeControl());
    EXPECT_EQ(log(),
              (Lines{"E Pemission denied (2000)", "E supportsAmplitudeControl is impossible"}));
    EXPECT_EQ(Status(mVibrator->setAmplitude(100)), Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(log(), (Lines{"E Pemission denied (2000)",
                            "E setAmplitude is impossible because of intensity"}));
    EXPECT_EQ(trace(), Lines());
}

TEST_F(CallerPermissionTest, OtherStandardOperationsServeEverybody) {
    const CallerIdentity caller(2000);
    EXPECT_EQ(Status(mVibrator->on(10)), Status::OK);
    EXPECT_EQ(Status(mVibrator->off()), Status::OK);
    EXPECT_TRUE(mVibrator->supportsExternalControl());
    EXPECT_EQ(Status(mVibrator->setExternalControl(true)), Status::OK);
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
