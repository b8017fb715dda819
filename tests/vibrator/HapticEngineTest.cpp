// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include "HapticEngineText.h"

#include <cstdio>
#include <random>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

using Packets = std::vector<DaxHapticEnginePacket>;

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
