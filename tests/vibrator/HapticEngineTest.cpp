// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include "HapticEngineText.h"

#include <cstdio>
#include <random>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

using Packets = std::vector<DaxHapticEnginePacket>;

class HapticEngineTest : public BothLayoutsTest {
  protected:
    HapticEngineTest() { start(GetParam()); }
    Status perform(const Packets& packets, uint32_t amplitude) {
        return mVibrator->daxPerformHapticEngine(packets, amplitude);
    }
    std::string firstOnNode() const {
        return GetParam() == Layout::kTimedOutput ? "enable" : "state";
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(HapticEngineTest);

TEST_P(HapticEngineTest, PacketsReachTheDriverAsOneLine) {
    const struct {
        Packets packets;
        uint32_t amplitude;
        std::string text;
    } cases[] = {
            {{{10, 5000, 150, 0}, {20, 10000, 200, 1}}, 5000, "8 10 2500 150 0 20 5000 200 1"},
            {{}, 10000, "0"},
            {{{1, 429496, 2, 3}}, 10000, "4 1 429496 2 3"},
            {{{0, 9999, 0, 0}}, 1, "4 0 0 0 0"},
            {{{-5, 1, -9999999, 99999999}}, 10000, "4 -5 1 -9999999 99999999"},
            // The product is taken modulo 2^32: 429497 x 10000 = 4294970000.
            {{{0, 429497, 0, 0}}, 10000, "4 0 0 0 0"},
            {{{0, -1, 0, 0}}, 10000, "4 0 429495 0 0"},
    };
    for (const auto& [packets, amplitude, text] : cases) {
        EXPECT_EQ(perform(packets, amplitude), Status::OK) << text;
        EXPECT_EQ(trace(), join({written("haptic_engine", text + "\n"), switchedOn("1")}));
        EXPECT_EQ(log(), join({{"D daxPerformHapticEngine : " + text + "\\n"},
                               onLog(1),
                               {"D daxPerformHapticEngine OK"}}));
    }
}

TEST_P(HapticEngineTest, LimitsAreTestedInTheirOrder) {
    const struct {
        size_t packets;
        uint32_t amplitude;
        std::string line;
    } cases[] = {{340, 10000, "E daxPerformHapticEngine packet size is exceed"},
                 {340, 0, "E daxPerformHapticEngine packet size is exceed"},
                 {3000, 1, "E daxPerformHapticEngine packet size is exceed"},
                 {339, 0, "E daxPerformHapticEngine amplitude is abnormal 0"},
                 {1, 10001, "E daxPerformHapticEngine amplitude is abnormal 10001"},
                 {0, 4294967295U, "E daxPerformHapticEngine amplitude is abnormal 4294967295"}};
    for (const auto& [packets, amplitude, line] : cases) {
        EXPECT_EQ(perform(Packets(packets, {100000000, 0, 0, 0}), amplitude), Status::BAD_VALUE);
        EXPECT_EQ(log(), Lines{line});
    }
    EXPECT_EQ(trace(), Lines());
    // A page is all that a node takes at once; shorter packets fit in it.
    EXPECT_EQ(perform(Packets(339, {1, 2, 3, 4}), 10000), Status::OK);
}

TEST_P(HapticEngineTest, ValueOfMoreThanNineCharactersIsRefused) {
    for (const int32_t value : {100000000, -10000000, INT32_MAX, INT32_MIN}) {
        for (const Packets& packets : {Packets{{1, 1, 1, 1}, {value, 0, 0, 0}},
                                       Packets{{0, 0, value, 1}}, Packets{{0, 0, 0, value}}}) {
            EXPECT_EQ(perform(packets, 10000), Status::BAD_VALUE);
            EXPECT_EQ(log(),
                      Lines{"E daxPerformHapticEngine value is abnormal " + std::to_string(value)});
        }
    }
    EXPECT_EQ(trace(), Lines());
}

TEST_P(HapticEngineTest, FailuresBeforeTheMotorEndTheCall) {
    const Packets packets = {{1, 2, 3, 4}};
    const struct {
        std::string operation;
        std::string fault;
        std::string line;
    } cases[] = {{"open", "EACCES", "E daxPerformHapticEngine is fail: 13"},
                 {"write", "EINVAL", "D daxPerformHapticEngine UNKNOWN_ERROR"},
                 {"write", "short=9", "D daxPerformHapticEngine UNKNOWN_ERROR"}};
    for (const auto& [operation, fault, line] : cases) {
        fail("haptic_engine", operation, fault, 1);
        EXPECT_EQ(perform(packets, 10000), Status::UNKNOWN_ERROR);
        EXPECT_EQ(log(), (Lines{"D daxPerformHapticEngine : 4 1 2 3 4\\n", line}));
        EXPECT_EQ(trace().size(), operation == "open" ? 1U : 3U);
    }
    // The motor's own failure is not the waveform's.
    fail(firstOnNode(), "write", "EIO", 1);
    EXPECT_EQ(perform(packets, 10000), Status::OK);
    EXPECT_EQ(log().back(), "D daxPerformHapticEngine OK");
}

/** The line as the plainest code would make it. */
std::string plainText(const Packets& packets, uint32_t amplitude) {
    std::string text = std::to_string(4 * packets.size());
    for (const DaxHapticEnginePacket& packet : packets) {
        const uint32_t scaled = static_cast<uint32_t>(packet.intensity) * amplitude / 10000;
        for (const int64_t value : {int64_t{packet.param0}, int64_t{scaled}, int64_t{packet.param2},
                                    int64_t{packet.param3}}) {
            text += ' ' + std::to_string(value);
        }
    }
    return text + '\n';
}

TEST(HapticEngineTextTest, IsWhatThePlainestCodeMakes) {
    std::mt19937 random(20);
    std::uniform_int_distribution<int32_t> values(-9999999, 99999999);
    for (size_t count : {size_t{0}, size_t{1}, size_t{2}, size_t{100}, size_t{339}}) {
        Packets packets(count);
        for (DaxHapticEnginePacket& packet : packets) {
            packet = {values(random), static_cast<int32_t>(random()), values(random),
                      values(random)};
        }
        // The longest line there is.
        if (count == 339) packets.assign(count, {-9999999, 429496, 99999999, -9999999});
        for (const uint32_t amplitude : {1U, 5000U, 10000U}) {
            HapticEngineText text;
            int32_t abnormal = 0;
            ASSERT_TRUE(text.build(packets, amplitude, &abnormal));
            EXPECT_EQ(text.c_str(), plainText(packets, amplitude));
            EXPECT_EQ(text.length(), strlen(text.c_str()));
        }
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
