// SPDX-License-Identifier: Apache-2.0
#include "scores/Packets.h"

#include <cstdint>
#include <cstdlib>

/** The input is a packet file. It is refused with a reason, or its packets survive a round trip. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    vibratorctl::Packets packets;
    std::string error;
    if (!vibratorctl::parsePackets(text, &packets, &error)) {
        if (error.empty()) abort();
        return 0;
    }
    std::string again;
    for (const auto& packet : packets) {
        again += std::to_string(packet.param0) + "," + std::to_string(packet.intensity) + "," +
                 std::to_string(packet.param2) + "," + std::to_string(packet.param3) + "\n";
    }
    vibratorctl::Packets same;
    if (!vibratorctl::parsePackets(again, &same, &error) || same != packets) abort();
    return 0;
}
