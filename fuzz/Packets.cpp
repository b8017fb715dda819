// SPDX-License-Identifier: Apache-2.0
#include "scores/Packets.h"
#include "cli/CommandLine.h"

#include <cstdint>
#include <cstdlib>

/** The input is a packet file. It is refused with a reason, or its packets survive a round trip. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    vibratorctl::Packets packets;
    try {
        packets = vibratorctl::parsePackets({reinterpret_cast<const char*>(data), size});
    } catch (const cli::UsageError& error) {
        if (*error.what() == '\0') abort();
        return 0;
    }
    std::string again;
    for (const auto& packet : packets) {
        again += std::to_string(packet.param0) + "," + std::to_string(packet.intensity) + "," +
                 std::to_string(packet.param2) + "," + std::to_string(packet.param3) + "\n";
    }
    if (vibratorctl::parsePackets(again) != packets) abort();
    return 0;
}
