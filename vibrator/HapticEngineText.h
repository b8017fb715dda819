// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlSupport.h>
#include <vendor/velmora/hardware/vibrator/2.0/types.h>

#include <cstddef>
#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

using HapticEnginePackets = ::android::hardware::hidl_vec<
        ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket>;

/**
 * The line that the driver's haptic engine takes: the number of values, then the four values of
 * each packet, with single blanks between them and a newline at the end.
 */
class HapticEngineText {
  public:
    /** @return whether the packets fit the text, at 40 characters each; 339 do. */
    static bool hasRoomFor(const HapticEnginePackets& packets) {
        return packets.size() < kSize / kPacketSize;
    }

    /**
     * Builds the line.
     *
     * @param packets as many as there is room for.
     * @param amplitude 1 to 10000; scales the intensities, modulo 2^32 before the division.
     * @param abnormal set, on failure, to the first value that with its blank needs more than the 9
     *     characters that the line has for a value.
     * @return whether all values are in the line.
     */
    bool build(const HapticEnginePackets& packets, uint32_t amplitude, int32_t* abnormal);

    const char* c_str() const { return mText; }
    /** @return number of bytes, the newline included. */
    size_t length() const { return mLength; }

  private:
    static constexpr size_t kSize = 13600;
    static constexpr size_t kPacketSize = 40;

    void append(int32_t value);

    char mText[kSize] = {};
    size_t mLength = 0;
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
