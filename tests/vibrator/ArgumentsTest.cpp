// SPDX-License-Identifier: Apache-2.0
#include "support/Answer.h"
#include "support/VibratorTest.h"

#include <functional>
#include <regex>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

namespace platform = ::android::hardware::vibrator;

/** A call with certain arguments, and what comes of it. */
struct Case {
    std::function<Answer(Vibrator&)> call;
    std::string answer;
    /** What is written, like "intensity=7\n"; what on(MS) writes is "on=MS". */
    Lines writes;
    /** The lines of the operation itself. */
    Lines log;
};

/** A function, whose arguments are laid out as those of one. */
Case row(const std::function<Answer(Vibrator&)>& call, const std::string& answer,
         const Lines& writes, const Lines& log) {
    return {call, answer, writes, log};
}

class ArgumentsTest : public BothLayoutsTest {
  protected:
    ArgumentsTest() { start(GetParam()); }

    Lines takeWrites() {
        std::string all;
        std::smatch parts;
        const std::regex write("\\w+/(\\w+) write \"(.*)\" = .*");
        for (const std::string& line : trace()) {
            if (std::regex_match(line, parts, write))
                all += parts[1].str() + "=" + parts[2].str() + ";";
        }
        // Both layouts alike, and without the newline after a number.
        all = std::regex_replace(all, std::regex("(=-?\\d+)\\\\n;"), "$1;");
        all = std::regex_replace(all, std::regex("state=1;duration=(-?\\d+);activate=1;"),
                                 "on=$1;");
        all = std::regex_replace(all, std::regex("enable="), "on=");
        Lines writes;
        for (size_t start = 0; start < all.size(); start = all.find(';', start) + 1)
            writes.push_back(all.substr(start, all.find(';', start) - start));
        return writes;
    }
    /** @return the log without the lines of the node primitives. */
    Lines takeOwnLog() {
        Lines lines = log();
        const std::regex primitive("D (>>|<<|isNodeExist|true$|false$|isVibrating).*");
        lines.erase(std::remove_if(lines.begin(), lines.end(),
                                   [&](const std::string& line) {
                                       return std::regex_match(line, primitive);
                                   }),
                    lines.end());
        return lines;
    }
    void expect(const std::vector<Case>& cases) {
        for (size_t i = 0; i < cases.size(); ++i) {
            SCOPED_TRACE("case " + std::to_string(i));
            EXPECT_EQ(cases[i].call(*mVibrator).inWords(), cases[i].answer);
            EXPECT_EQ(takeWrites(), cases[i].writes);
            EXPECT_EQ(takeOwnLog(), cases[i].log);
        }
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(ArgumentsTest);

TEST_P(ArgumentsTest, OfSettings) {
    const auto amplitude = [](uint32_t number) {
        return [=](Vibrator& v) { return answerOf(v.daxSetAmplitude(number)); };
    };
    const auto force = [](uint32_t number) {
        return [=](Vibrator& v) { return answerOf(v.daxSetForceTouchAmplitude(number)); };
    };
    const auto frequency = [](uint32_t number) {
        return [=](Vibrator& v) {
            return answerOf(v.daxSetFrequencyType(static_cast<DaxFrequencyType>(number)));
        };
    };
    const auto fold = [](uint32_t number) {
        return [=](Vibrator& v) {
            return answerOf(v.daxSetFolderStatus(static_cast<DaxFolderStatus>(number)));
        };
    };
    const std::string bad = "BAD_VALUE";
    const std::string abnormal = "E daxSetAmplitude amplitude is abnormal ";
    const std::string forceAbnormal = "E daxSetForceTouchAmplitude amplitude is abnormal ";
    const Lines badFold = {"D daxSetFolderStatus starts", "D daxSetFolderStatus BAD_VALUE"};
    expect({row(amplitude(1), "OK", {"intensity=1"}, {}),
            row(amplitude(10000), "OK", {"intensity=10000"}, {}),
            row(amplitude(0), bad, {}, {abnormal + "0"}),
            row(amplitude(10001), bad, {}, {abnormal + "10001"}),
            row(amplitude(4294967295U), bad, {}, {abnormal + "4294967295"}),
            row(force(1), "OK", {"force_touch_intensity=1"}, {}),
            row(force(10000), "OK", {"force_touch_intensity=10000"}, {}),
            row(force(0), bad, {}, {forceAbnormal + "0"}),
            row(force(10001), bad, {}, {forceAbnormal + "10001"}),
            row(frequency(0), "OK", {"multi_freq=0"}, {}),
            row(frequency(4), "OK", {"multi_freq=4"}, {}),
            row(frequency(5), bad, {}, {"E daxSetFrequencyType is abnormal 5"}),
            row(frequency(4294967295U), bad, {}, {"E daxSetFrequencyType is abnormal -1"}),
            row(fold(0), "OK", {"event_cmd=FOLDER_OPEN\\n"},
                {"D daxSetFolderStatus starts", "D FOLDER_OPEN\\n", "D length : 12", "D ret : 12",
                 "D daxSetFolderStatus end"}),
            row(fold(2), bad, {}, badFold), row(fold(4294967295U), bad, {}, badFold)});
}

TEST_P(ArgumentsTest, OfEffects) {
    const auto perform = [](uint32_t effect, uint8_t strength) {
        return [=](Vibrator& v) {
            return answerTo<StatusAndNumber>([&](const auto& callback) {
                return v.perform(static_cast<platform::V1_0::Effect>(effect),
                                 static_cast<EffectStrength>(strength), callback);
            });
        };
    };
    const std::string none = "(UNSUPPORTED_OPERATION, 0)";
    const auto start = [](int effect, int strength) {
        return "D perform start effect : " + std::to_string(effect) +
               ", strength : " + std::to_string(strength);
    };
    const std::string end = "D perform end effect";
    expect({row(perform(0, 0), "(OK, 20)", {"on=20", "intensity=1379"},
                {start(0, 0), "D Setting amplitude to: 1379", end}),
            row(perform(0, 2), "(OK, 20)", {"on=20", "intensity=10000"},
                {start(0, 2), "D Setting amplitude to: 10000", end}),
            row(perform(0, 3), none, {}, {start(0, 3)}),
            row(perform(0, 255), none, {}, {start(0, 255)}),
            row(perform(1, 0), none, {}, {start(1, 0), end}),
            row(perform(1, 3), none, {}, {start(1, 3), end}),
            row(perform(4294967295U, 1), none, {}, {start(-1, 1), end}),
            row(
                    [](Vibrator& v) {
                        return answerTo<StatusAndNumber>([&](const auto& callback) {
                            return v.perform_1_3(platform::V1_3::Effect::TEXTURE_TICK,
                                                 static_cast<EffectStrength>(9), callback);
                        });
                    },
                    none, {}, {"D perform_1_3 start effect : 21, strength : 9"})});
}

TEST_P(ArgumentsTest, OfExternalControl) {
    const auto external = [](bool enabled) {
        return [=](Vibrator& v) { return answerOf(v.setExternalControl(enabled)); };
    };
    expect({row(external(false), "OK", {"ext_control=0"},
                {"D setExternalControl external control set as false"}),
            row([](Vibrator& v) { return answerOf(v.on(60000)); }, "OK", {"on=60000"}, {}),
            row(external(true), "UNSUPPORTED_OPERATION", {},
                {"D setExternalControl external control while vibrating. Not supported"})});
}

TEST_P(ArgumentsTest, OfStoredPatterns) {
    const auto play = [](uint32_t pattern, uint32_t amplitude, bool repeat) {
        return [=](Vibrator& v) {
            return answerOf(v.daxPerformPrebakedHapticPattern(pattern, amplitude, repeat));
        };
    };
    const std::string prefix = "D daxPerformPrebakedHapticPattern ";
    const auto entry = [&](int pattern, int amplitude) {
        return prefix + "pattern : " + std::to_string(pattern) +
               ", amplitude : " + std::to_string(amplitude);
    };
    std::vector<Case> cases = {
            row(play(0, 1, false), "OK", {"intensity=1", "cp_trigger_index=0"},
                {entry(0, 1), prefix + "one shoot starts"}),
            row(play(5, 10000, false), "OK", {"intensity=10000", "cp_trigger_index=5", "on=1000"},
                {entry(5, 10000), prefix + "one shoot starts", prefix + "one shoot end"})};
    for (const uint32_t amplitude : {0U, 10001U, 4294967295U}) {
        for (const bool repeat : {false, true}) {
            cases.push_back({play(1, amplitude, repeat),
                             "BAD_VALUE",
                             {},
                             {entry(1, static_cast<int>(amplitude)),
                              "E daxPerformPrebakedHapticPattern amplitude is abnormal " +
                                      std::to_string(amplitude)}});
        }
    }
    // The percent is not padded with zeros, and the number is shown as a signed one.
    const std::tuple<uint32_t, uint32_t, std::string> queued[] = {
            {3, 505, "3.5"},
            {3, 10000, "3.100"},
            {7, 99, "7.0"},
            {2147483647, 9999, "2147483647.99"},
            {0, 100, "0.1"},
            {4294967295U, 1, "-1.0"},
            {2147483648U, 10000, "-2147483648.100"}};
    for (const auto& [pattern, amplitude, text] : queued) {
        cases.push_back(
                {play(pattern, amplitude, true),
                 "OK",
                 {"cp_trigger_index=65534", "cp_trigger_queue=" + text + ", 10, 0~\\0", "on=1000"},
                 {entry(static_cast<int>(pattern), static_cast<int>(amplitude)),
                  prefix + "repeat starts",
                  prefix + ": " + text + ", 10, 0~ , " + std::to_string(text.size() + 8),
                  "D ret : " + std::to_string(text.size() + 9), prefix + "end"}});
    }
    expect(cases);
}

TEST_P(ArgumentsTest, OfHapticEnginePackets) {
    using Packets = std::vector<DaxHapticEnginePacket>;
    const auto engine = [](const Packets& packets, uint32_t amplitude) {
        return [=](Vibrator& v) { return answerOf(v.daxPerformHapticEngine(packets, amplitude)); };
    };
    const auto plays = [&](const Packets& packets, uint32_t amplitude, const std::string& text) {
        return Case{engine(packets, amplitude),
                    "OK",
                    {"haptic_engine=" + text + "\\n", "on=1"},
                    {"D daxPerformHapticEngine : " + text + "\\n", "D daxPerformHapticEngine OK"}};
    };
    const auto refuses = [&](const Packets& packets, uint32_t amplitude, const std::string& line) {
        return Case{
                engine(packets, amplitude), "BAD_VALUE", {}, {"E daxPerformHapticEngine " + line}};
    };
    const Packets tooMany(340, {100000000, 0, 0, 0});
    std::vector<Case> cases = {
            plays({{10, 5000, 150, 0}, {20, 10000, 200, 1}}, 5000, "8 10 2500 150 0 20 5000 200 1"),
            row(engine({}, 10000), "OK", {"haptic_engine=0", "on=1"},
                {"D daxPerformHapticEngine : 0\\n", "D daxPerformHapticEngine OK"}),
            plays({{1, 429496, 2, 3}}, 10000, "4 1 429496 2 3"),
            plays({{0, 9999, 0, 0}}, 1, "4 0 0 0 0"),
            plays({{-5, 1, -9999999, 99999999}}, 10000, "4 -5 1 -9999999 99999999"),
            // The product is taken modulo 2^32: 429497 x 10000 = 4294970000.
            plays({{0, 429497, 0, 0}}, 10000, "4 0 0 0 0"),
            plays({{0, -1, 0, 0}}, 10000, "4 0 429495 0 0"),
            refuses(tooMany, 10000, "packet size is exceed"),
            refuses(tooMany, 0, "packet size is exceed"),
            refuses(Packets(339, {100000000, 0, 0, 0}), 0, "amplitude is abnormal 0"),
            refuses({{1, 1, 1, 1}}, 10001, "amplitude is abnormal 10001"),
            refuses({}, 4294967295U, "amplitude is abnormal 4294967295"),
    };
    // A value of more than 9 characters with its blank, wherever it stands.
    for (const int32_t value : {100000000, -10000000, INT32_MAX, INT32_MIN}) {
        for (const Packets& packets :
             {Packets{{1, 1, 1, 1}, {value, 0, 0, 0}}, {{0, 0, value, 1}}, {{0, 0, 0, value}}}) {
            cases.push_back(refuses(packets, 10000, "value is abnormal " + std::to_string(value)));
        }
    }
    expect(cases);
    EXPECT_EQ(Status(mVibrator->daxPerformHapticEngine(Packets(339, {1, 2, 3, 4}), 10000)),
              Status::OK);
}

TEST_P(ArgumentsTest, AreNotLookedAtBeforeTheCaller) {
    const CallerIdentity caller(2000);
    const Lines denied = {"E Pemission denied (2000)"};
    expect({row([](Vibrator& v) { return answerOf(v.daxSetAmplitude(0)); }, "UNKNOWN_ERROR", {},
                denied),
            row(
                    [](Vibrator& v) {
                        return answerOf(v.daxPerformHapticEngine(
                                std::vector<DaxHapticEnginePacket>(340), 0));
                    },
                    "UNKNOWN_ERROR", {}, denied),
            row(
                    [](Vibrator& v) {
                        return answerOf(v.daxPerformPrebakedHapticPattern(4294967295U, 0, true));
                    },
                    "UNKNOWN_ERROR", {},
                    {"D daxPerformPrebakedHapticPattern pattern : -1, amplitude : 0", denied[0]}),
            // The standard operations meet the gate inside; the click does not tell of it.
            row([](Vibrator& v) { return answerOf(v.supportsAmplitudeControl()); }, "false", {},
                {denied[0], "E supportsAmplitudeControl is impossible"}),
            row([](Vibrator& v) { return answerOf(v.setAmplitude(100)); }, "UNSUPPORTED_OPERATION",
                {}, {denied[0], "E setAmplitude is impossible because of intensity"}),
            row(
                    [](Vibrator& v) {
                        return answerTo<StatusAndNumber>([&](const auto& callback) {
                            return v.perform(platform::V1_0::Effect::CLICK, EffectStrength::LIGHT,
                                             callback);
                        });
                    },
                    "(OK, 20)", {"on=20"},
                    {"D perform start effect : 0, strength : 0", denied[0],
                     "E setAmplitude is impossible because of intensity",
                     "D perform end effect"})});
}

TEST_P(ArgumentsTest, OfTheCountAreTheNodesText) {
    const std::tuple<std::string, std::string, std::string> cases[] = {
            {"12\n", "(OK, 12)", "12"},
            {"0", "(OK, 0)", "0"},
            {"none\n", "(UNKNOWN_ERROR, 0)", "4294967295"},
            {"", "(UNKNOWN_ERROR, 0)", "4294967295"}};
    for (const auto& [text, answer, shown] : cases) {
        setMode("num_waves", 0644);
        setNode("num_waves", text);
        expect({row(
                [](Vibrator& v) {
                    return answerTo<StatusAndNumber>([&](const auto& callback) {
                        return v.daxGetNumberOfPrebakedHapticPattern(callback);
                    });
                },
                answer, {}, {"D daxGetNumberOfPrebakedHapticPattern value : " + shown})});
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
