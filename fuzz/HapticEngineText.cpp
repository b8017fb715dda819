// SPDX-License-Identifier: Apache-2.0
#include "HapticEngineText.h"

#include <cstdlib>
#include <cstring>
#include <string>

using ::vendor::velmora::hardware::vibrator::V2_1::implementation::HapticEnginePackets;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::HapticEngineText;

namespace {

/** The line as the simplest code makes it; empty if a value is too long. */
std::string plainText(const HapticEnginePackets& packets, uint32_t amplitude) {
    std::string text = std::to_string(4 * packets.size());
    for (const auto& packet : packets) {
        const uint32_t scaled = static_cast<uint32_t>(packet.intensity) * amplitude / 10000;
        for (const std::string& value :
             {std::to_string(packet.param0), std::to_string(scaled), std::to_string(packet.param2),
              std::to_string(packet.param3)}) {
            if (value.size() > 8) return {};
            text += " " + value;
        }
    }
    return text + "\n";
}

}  // namespace

/** The input is an amplitude and packets, as in memory. Compares with the simplest code. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    uint16_t number = 0;
    if (size < sizeof(number)) return 0;
    memcpy(&number, data, sizeof(number));
    const uint32_t amplitude = 1 + number % 10000U;
    HapticEnginePackets packets;
    packets.resize((size - sizeof(number)) / sizeof(packets[0]));
    if (packets.size() > 0) {
        memcpy(packets.data(), data + sizeof(number), packets.size() * sizeof(packets[0]));
    }
    if (!HapticEngineText::hasRoomFor(packets)) {
        if (packets.size() < 340) abort();
        return 0;
    }

    HapticEngineText text;
    int32_t abnormal = 0;
    const bool built = text.build(packets, amplitude, &abnormal);
    const std::string expected = plainText(packets, amplitude);
    if (built != !expected.empty()) abort();
    if (built && (text.c_str() != expected || text.length() != expected.size())) abort();
    if (!built && std::to_string(abnormal).size() <= 8) abort();
    return 0;
}
