// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

constexpr char kPlay[] = "D daxPerformPrebakedHapticPattern";

class PrebakedPatternsTest : public BothLayoutsTest {
  protected:
    PrebakedPatternsTest() { start(GetParam()); }

    Status play(uint32_t pattern, uint32_t amplitude, bool repeat) {
        return mVibrator->daxPerformPrebakedHapticPattern(pattern, amplitude, repeat);
    }
    /** A play operation's log line. */
    static Lines line(const std::string& text) { return {kPlay + (" " + text)}; }
    static Lines entry(int pattern, int amplitude) {
        return line("pattern : " + std::to_string(pattern) +
                    ", amplitude : " + std::to_string(amplitude));
    }
    static std::string queueText(const std::string& start) { return start + ", 10, 0~" + '\0'; }
    std::string firstOnNode() const {
        return GetParam() == Layout::kTimedOutput ? "enable" : "state";
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(PrebakedPatternsTest);

TEST_P(PrebakedPatternsTest, OneShotSetsStrengthAndPatternAndStartsTheMotor) {
    EXPECT_EQ(play(5, 10000, false), Status::OK);
    EXPECT_EQ(trace(), join({written("intensity", "10000\n"), written("cp_trigger_index", "5\n"),
                             switchedOn("1000")}));
    EXPECT_EQ(log(), join({entry(5, 10000), line("one shoot starts"), writeLog("intensity", 10000),
                           writeLog("cp_trigger_index", 5), onLog(1000), line("one shoot end")}));
}

TEST_P(PrebakedPatternsTest, PatternZeroPlayedOnceOnlySelects) {
    EXPECT_EQ(play(0, 1, false), Status::OK);
    EXPECT_EQ(trace(), join({written("intensity", "1\n"), written("cp_trigger_index", "0\n")}));
    EXPECT_EQ(log(), join({entry(0, 1), line("one shoot starts"), writeLog("intensity", 1),
                           writeLog("cp_trigger_index", 0)}));
}

TEST_P(PrebakedPatternsTest, RepeatGoesThroughTheQueue) {
    const struct {
        uint32_t pattern;
        uint32_t amplitude;
        std::string text;
    } cases[] = {{3, 5050, "3.50"},        {3, 505, "3.5"},
                 {3, 10000, "3.100"},      {7, 99, "7.0"},
                 {0, 100, "0.1"},          {2147483647, 9999, "2147483647.99"},
                 {4294967295U, 1, "-1.0"}, {2147483648U, 10000, "-2147483648.100"}};
    for (const auto& [pattern, amplitude, text] : cases) {
        EXPECT_EQ(play(pattern, amplitude, true), Status::OK) << text;
        EXPECT_EQ(trace(),
                  join({written("cp_trigger_index", "65534\n"),
                        written("cp_trigger_queue", queueText(text)), switchedOn("1000")}));
        const std::string length = std::to_string(text.size() + 8);
        EXPECT_EQ(log(), join({entry(static_cast<int>(pattern), static_cast<int>(amplitude)),
                               line("repeat starts"),
                               line(": " + text + ", 10, 0~ , " + length),
                               writeLog("cp_trigger_index", 65534),
                               {"D ret : " + std::to_string(text.size() + 9)},
                               onLog(1000),
                               line("end")}));
    }
}

TEST_P(PrebakedPatternsTest, AmplitudeOutOfRangeTouchesNothing) {
    for (const uint32_t amplitude : {0U, 10001U, 4294967295U}) {
        for (const bool repeat : {false, true}) {
            EXPECT_EQ(play(1, amplitude, repeat), Status::BAD_VALUE);
            EXPECT_EQ(log(), join({entry(1, static_cast<int>(amplitude)),
                                   {"E daxPerformPrebakedHapticPattern amplitude is abnormal " +
                                    std::to_string(amplitude)}}));
        }
    }
    EXPECT_EQ(trace(), Lines());
}

TEST_P(PrebakedPatternsTest, EachStepThatFailsEndsTheCall) {
    const std::string on = firstOnNode();
    const struct {
        bool repeat;
        std::string leaf;
        std::string operation;
        std::string fault;
        std::string lastLine;
        std::string lastNode;
    } cases[] = {
            {false, "intensity", "write", "EIO", std::string(kPlay) + " intensity write fail", ""},
            {false, "cp_trigger_index", "open", "EACCES",
             std::string(kPlay) + " pattern write fail", ""},
            {false, on, "write", "EIO", std::string(kPlay) + " on fail", ""},
            {true, "cp_trigger_index", "write", "short=3",
             std::string(kPlay) + " write 0xFFFE fail", ""},
            {true, "cp_trigger_queue", "open", "ENOENT",
             "E daxPerformPrebakedHapticPattern is fail: 2", ""},
            {true, "cp_trigger_queue", "write", "EINVAL", std::string(kPlay) + " repeat error", ""},
            {true, "cp_trigger_queue", "write", "short=12", std::string(kPlay) + " repeat error",
             ""},
            {true, on, "open", "EBUSY", std::string(kPlay) + " on Trigger fail", ""},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.lastLine);
        fail(each.leaf, each.operation, each.fault, 1);
        EXPECT_EQ(play(3, 5000, each.repeat), Status::UNKNOWN_ERROR);
        EXPECT_EQ(log().back(), each.lastLine);
        // Nothing comes after the access that failed but the close of its node.
        const Lines accesses = trace();
        const std::string last = accesses[accesses.size() - (each.operation == "open" ? 1 : 2)];
        EXPECT_NE(last.find("/" + each.leaf + " " + each.operation), std::string::npos) << last;
    }
}

struct Count {
    Status status;
    uint32_t patterns;
};

TEST_P(PrebakedPatternsTest, CountIsWhatTheDriverSays) {
    const auto count = [this] {
        int answers = 0;
        Count answer{};
        mVibrator->daxGetNumberOfPrebakedHapticPattern([&](Status status, uint32_t patterns) {
            answer = {status, patterns};
            ++answers;
        });
        EXPECT_EQ(answers, 1);
        return answer;
    };
    const struct {
        std::string text;
        Status status;
        uint32_t patterns;
        std::string shown;
    } cases[] = {{"12\n", Status::OK, 12, "12"},
                 {"0", Status::OK, 0, "0"},
                 {"none\n", Status::UNKNOWN_ERROR, 0, "4294967295"},
                 {"", Status::UNKNOWN_ERROR, 0, "4294967295"}};
    const Lines probe = {"D isNodeExistForRead node:" + path("num_waves") + " ", "D true"};
    for (const auto& [text, status, patterns, shown] : cases) {
        setMode("num_waves", 0644);
        setNode("num_waves", text);
        setMode("num_waves", 0444);
        const Count answer = count();
        EXPECT_EQ(answer.status, status);
        EXPECT_EQ(answer.patterns, patterns);
        EXPECT_EQ(trace(), join({probed("num_waves", "O_RDONLY"), read("num_waves", text, 7)}));
        EXPECT_EQ(log(), join({probe,
                               readLog("num_waves"),
                               {"D daxGetNumberOfPrebakedHapticPattern value : " + shown}}));
    }
    fail("num_waves", "read", "EIO", 1);
    EXPECT_EQ(count().status, Status::UNKNOWN_ERROR);
    removeNode("num_waves");
    log();
    EXPECT_EQ(count().status, Status::UNSUPPORTED_OPERATION);
    EXPECT_EQ(log().back(), "D daxGetNumberOfPrebakedHapticPattern unsupports");
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
