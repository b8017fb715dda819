// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Packets.h"

#include <cstdint>
#include <string>

/**
 * The service scales an intensity by amplitude / 10000 in 32 bits, where greater numbers wrap
 * around and come out as something else.
 *
 * @return the first intensity that would wrap, in words; empty where none does.
 */
inline std::string scalingProblem(const HapticEnginePackets& packets, uint32_t amplitude) {
    for (const auto& packet : packets) {
        const bool isNegative = packet.intensity < 0;
        if (!isNegative &&
            uint64_t{amplitude} * static_cast<uint32_t>(packet.intensity) <= UINT32_MAX)
            continue;
        return "intensity " + std::to_string(packet.intensity) + " cannot be scaled by amplitude " +
               std::to_string(amplitude) + "; it is 0 to " + std::to_string(UINT32_MAX / amplitude);
    }
    return {};
}
