// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.0/types.h>

#include <string>
#include <vector>

namespace vibratorctl {

using Packet = ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;
using Packets = std::vector<Packet>;

/**
 * Reads haptic engine packets from a text: CSV, one packet of four numbers a line, blank lines and
 * lines that begin with # passed over; or JSON, a list of lists of four numbers, or of objects with
 * the members param0, intensity, param2 and param3.
 *
 * @throw cli::UsageError says what is wrong and where.
 */
Packets parsePackets(const std::string& text);

/** Reads one packet, "PARAM0,INTENSITY,PARAM2,PARAM3". @throw cli::UsageError */
Packet parsePacket(const std::string& text);

}  // namespace vibratorctl
