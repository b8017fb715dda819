// SPDX-License-Identifier: Apache-2.0
#include "HapticEngineText.h"

#include "Amplitude.h"

#include <charconv>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

bool HapticEngineText::build(const HapticEnginePackets& packets, uint32_t amplitude,
                             int32_t* abnormal) {
    append(static_cast<int32_t>(4 * packets.size()));
    for (const auto& packet : packets) {
        const uint32_t scaled = static_cast<uint32_t>(packet.intensity) * amplitude / kMaxAmplitude;
        const int32_t values[] = {packet.param0, static_cast<int32_t>(scaled), packet.param2,
                                  packet.param3};
        for (const int32_t value : values) {
            if (!isEngineValue(value)) {
                *abnormal = value;
                return false;
            }
            append(value);
        }
    }
    mText[mLength - 1] = '\n';
    return true;
}

void HapticEngineText::append(int32_t value) {
    char* end = std::to_chars(mText + mLength, mText + kSize - 1, value).ptr;
    *end++ = ' ';
    mLength = static_cast<size_t>(end - mText);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
