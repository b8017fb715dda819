// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.0/types.h>

#include <string>
#include <vector>

namespace vibratorctl {

using Packets = std::vector<::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket>;

/**
 * Reads haptic engine packets from a text: CSV, one packet of four numbers a line, blank lines and
 * lines that begin with # passed over; or JSON, a list of lists of four numbers, or of objects with
 * the members param0, intensity, param2 and param3.
 *
 * @param error set, on failure, to what is wrong and where.
 * @return whether the whole text made sense.
 */
bool parsePackets(const std::string& text, Packets* packets, std::string* error);

/** Reads one packet, "PARAM0,INTENSITY,PARAM2,PARAM3". @return whether it is one. */
bool parsePacket(const std::string& text, Packets* packets, std::string* error);

}  // namespace vibratorctl
