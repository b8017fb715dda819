// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

using Packets = std::vector<DaxHapticEnginePacket>;

constexpr char kOk[] = "OK";
constexpr char kBad[] = "BAD_VALUE";
constexpr char kUnsupported[] = "UNSUPPORTED_OPERATION";
constexpr char kNone[] = "(UNSUPPORTED_OPERATION, 0)";

class ArgumentsTest : public BothLayoutsTest {};
INSTANTIATE_FOR_BOTH_LAYOUTS(ArgumentsTest);

TEST_P(ArgumentsTest, OfOn) {
    for (const uint32_t ms : {0U, 1U, 2147483647U})
        row(CALL(on)(ms), kOk, "on=" + std::to_string(ms));
    if (mLayout == Layout::kTimedOutput) {
        row(CALL(on)(4294967295U), kOk, "enable=-1");
        row(CALL(on)(2147483648U), kOk, "enable=-2147483648");
    } else {
        // The kernel's trigger takes unsigned numbers only.
        row(CALL(on)(4294967295U), "UNKNOWN_ERROR",
            "state=1; duration=-1!EINVAL; E THE_DEVICE_DURATION is impossible");
    }
}

TEST_P(ArgumentsTest, OfSetAmplitude) {
    for (int amplitude = 1; amplitude <= 255; ++amplitude) {
        // 1 + (amplitude - 1) * 9999 / 254, rounded half up, in whole numbers.
        const std::string intensity = std::to_string(1 + ((amplitude - 1) * 9999 * 2 + 254) / 508);
        row(CALL(setAmplitude)(amplitude), kOk,
            "intensity?; D Setting amplitude to: " + intensity + "; intensity=" + intensity);
    }
    row(CALL(setAmplitude)(0), kBad, "intensity?; E setAmplitude amplitude is BAD_VALUE 0");
    row(CALL(setAmplitude)(0), kUnsupported,
        "intensity?!EACCES; E setAmplitude is impossible because of intensity");
}

TEST_P(ArgumentsTest, OfEffects) {
    const auto clicks = [&](int strength, const std::string& intensity) {
        row(CALL(perform)(0, strength), "(OK, 20)",
            "D {name} start effect : 0, strength : " + std::to_string(strength) +
                    "; on=20; intensity?; D Setting amplitude to: " + intensity +
                    "; intensity=" + intensity + "; D {name} end effect");
    };
    clicks(0, "1379");
    clicks(2, "10000");
    row(CALL(perform)(0, 3), kNone, "D {name} start effect : 0, strength : 3");
    row(CALL(perform)(1, 3), kNone, "D {name} start effect : 1, strength : 3; D {name} end effect");
    row(CALL(perform)(4294967295U, 1), kNone,
        "D {name} start effect : -1, strength : 1; D {name} end effect");
    row(CALL(perform_1_3)(21, 9), kNone, "D {name} start effect : 21, strength : 9");
}

TEST_P(ArgumentsTest, OfExternalControl) {
    row(CALL(setExternalControl)(false), kOk, R"(
        running?
        D isVibrating : false
        D setExternalControl external control set as false
        ext_control=0)");
    if (mLayout == Layout::kTimedOutput) return;
    row(CALL(setExternalControl)(true), kUnsupported, R"(
        duration:7="1\n"
        D isVibrating : true
        D setExternalControl external control while vibrating. Not supported)");
    row(CALL(setExternalControl)(true), kOk, R"(
        duration:7="-1\n"
        D isVibrating : false
        D setExternalControl external control set as true
        ext_control=1)");
}

TEST_P(ArgumentsTest, OfSettings) {
    for (const uint32_t amplitude : {1U, 10000U}) {
        const std::string number = std::to_string(amplitude);
        row(CALL(daxSetAmplitude)(amplitude), kOk, "intensity=" + number);
        row(CALL(daxSetForceTouchAmplitude)(amplitude), kOk, "force_touch_intensity=" + number);
    }
    for (const uint32_t amplitude : {0U, 10001U, 4294967295U}) {
        const std::string line = "E {name} amplitude is abnormal " + std::to_string(amplitude);
        row(CALL(daxSetAmplitude)(amplitude), kBad, line);
        row(CALL(daxSetForceTouchAmplitude)(amplitude), kBad, line);
    }
    row(CALL(daxSetFrequencyType)(0), kOk, "multi_freq=0");
    row(CALL(daxSetFrequencyType)(4), kOk, "multi_freq=4");
    row(CALL(daxSetFrequencyType)(5), kBad, "E {name} is abnormal 5");
    row(CALL(daxSetFrequencyType)(4294967295U), kBad, "E {name} is abnormal -1");
    row(CALL(daxSetFolderStatus)(0), kOk, R"(
        D {name} starts
        D FOLDER_OPEN\n
        D length : 12
        event_cmd="FOLDER_OPEN\n"
        D ret : 12
        D {name} end)");
    for (const uint32_t status : {2U, 4294967295U})
        row(CALL(daxSetFolderStatus)(status), kBad, "D {name} starts; D {name} BAD_VALUE");
}

TEST_P(ArgumentsTest, OfStoredPatterns) {
    const auto play = CALL(daxPerformPrebakedHapticPattern);
    const auto entry = [&](uint32_t pattern, uint32_t amplitude) {
        return "D {name} pattern : " + std::to_string(static_cast<int>(pattern)) +
               ", amplitude : " + std::to_string(static_cast<int>(amplitude)) + "; ";
    };
    row(play(0, 1, false), kOk,
        entry(0, 1) + "D {name} one shoot starts; intensity=1; cp_trigger_index=0");
    row(play(1, 10000, false), kOk,
        entry(1, 10000) +
                "D {name} one shoot starts; intensity=10000; cp_trigger_index=1; "
                "on=1000; D {name} one shoot end");
    for (const uint32_t amplitude : {0U, 10001U, 4294967295U}) {
        for (const bool repeat : {false, true})
            row(play(1, amplitude, repeat), kBad,
                entry(1, amplitude) + "E {name} amplitude is abnormal " +
                        std::to_string(amplitude));
    }
    // The percent is not padded with zeros, and the number is shown as a signed one.
    const std::tuple<uint32_t, uint32_t, std::string> queued[] = {
            {3, 505, "3.5"},         {3, 10000, "3.100"}, {7, 99, "7.0"},
            {0, 100, "0.1"},         {3, 199, "3.1"},     {2147483647, 9999, "2147483647.99"},
            {4294967295U, 1, "-1.0"}};
    for (const auto& [pattern, amplitude, start] : queued) {
        const std::string text = start + ", 10, 0~";
        row(play(pattern, amplitude, true), kOk,
            entry(pattern, amplitude) + "D {name} repeat starts; D {name} : " + text + " , " +
                    std::to_string(text.size()) + "; cp_trigger_index=65534; cp_trigger_queue=\"" +
                    text + "\\0\"; D ret : " + std::to_string(text.size() + 1) +
                    "; on=1000; D {name} end");
    }
}

TEST_P(ArgumentsTest, OfHapticEnginePackets) {
    const auto engine = CALL(daxPerformHapticEngine);
    const auto plays = [&](const Packets& packets, uint32_t amplitude, const std::string& text) {
        row(engine(packets, amplitude), kOk,
            "D {name} : " + text + "\\n; haptic_engine=\"" + text + "\\n\"; on=1; D {name} OK");
    };
    const auto refuses = [&](const Packets& packets, uint32_t amplitude, const std::string& why) {
        row(engine(packets, amplitude), kBad, "E {name} " + why);
    };
    plays({}, 10000, "0");
    plays({{1, 429496, 2, 3}}, 10000, "4 1 429496 2 3");
    plays({{0, 9999, 0, 0}}, 1, "4 0 0 0 0");
    plays({{-5, 1, -9999999, 99999999}}, 10000, "4 -5 1 -9999999 99999999");
    // The product is taken modulo 2^32: 429497 x 10000 = 4294970000.
    plays({{0, 429497, 0, 0}}, 10000, "4 0 0 0 0");
    plays({{0, -1, 0, 0}}, 10000, "4 0 429495 0 0");
    const Packets tooMany(340, {100000000, 0, 0, 0});
    refuses(tooMany, 10000, "packet size is exceed");
    refuses(tooMany, 0, "packet size is exceed");
    refuses(Packets(339, tooMany[0]), 0, "amplitude is abnormal 0");
    refuses({{1, 1, 1, 1}}, 10001, "amplitude is abnormal 10001");
    refuses({}, 4294967295U, "amplitude is abnormal 4294967295");
    // A value of more than 9 characters with its blank, wherever it stands.
    for (const int32_t value : {100000000, -10000000, INT32_MAX, INT32_MIN}) {
        const std::string why = "value is abnormal " + std::to_string(value);
        refuses({{1, 1, 1, 1}, {value, 0, 0, 0}}, 10000, why);
        refuses({{0, 0, value, 1}}, 10000, why);
        refuses({{0, 0, 0, value}}, 10000, why);
    }
    // The longest line that there is; sysfs takes a page of it, and the log even less.
    std::string longest = "1356";
    for (int i = 0; i < 339; ++i)
        longest += " -9999999 429496 99999999 -9999999";
    const std::string shown =
            ("D daxPerformHapticEngine : " + longest).substr(0, strlen("D ") + 1023);
    row(engine(Packets(339, {-9999999, 429496, 99999999, -9999999}), 10000), "UNKNOWN_ERROR",
        shown + "; haptic_engine=\"" + longest + "\\n\"!4096; D {name} UNKNOWN_ERROR");
}

TEST_P(ArgumentsTest, AreNotLookedAtBeforeTheCaller) {
    for (const Operation& operation : {
                 Operation{CALL(daxSetAmplitude)(0), "", "@", "UNKNOWN_ERROR"},
                 Operation{CALL(daxPerformHapticEngine)(Packets(340), 0), "", "@", "UNKNOWN_ERROR"},
                 Operation{CALL(daxPerformPrebakedHapticPattern)(-1, 0, true), "",
                           "D daxPerformPrebakedHapticPattern pattern : -1, amplitude : 0; @",
                           "UNKNOWN_ERROR"},
                 Operation{CALL(daxGetAmplitudeList)(2), "", "@", "false [ ]"},
         }) {
        expect(operation, 2000);
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
