// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlSupport.h>
#include <vendor/velmora/hardware/vibrator/2.0/types.h>

#include <cstddef>
#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

using HapticEnginePackets = ::android::hardware::hidl_vec<
        ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket>;

/** The packets carry their own durations; this run, in ms, only sets the engine off. */
constexpr uint32_t kEngineMs = 1;

/** @return whether a value and its blank take no more than the 9 characters that each may have. */
constexpr bool isEngineValue(int32_t value) {
    return value >= -9999999 && value <= 99999999;
}

/**
 * The line that the driver's haptic engine takes: the number of values, then the four values of
 * each packet, with single blanks between them and a newline at the end.
 */
class HapticEngineText {
    static constexpr size_t kSize = 13600;
    static constexpr size_t kPacketSize = 40;

  public:
    /** The most packets that fit, at 40 characters each: 339. */
    static constexpr size_t kMaxPackets = kSize / kPacketSize - 1;

    /**
     * Builds the line.
     *
     * @param packets at most kMaxPackets.
     * @param amplitude 1 to 10000; scales the intensities, modulo 2^32 before the division.
     * @param abnormal set, on failure, to the first value that is no isEngineValue().
     * @return whether all values are in the line.
     */
    bool build(const HapticEnginePackets& packets, uint32_t amplitude, int32_t* abnormal);

    const char* c_str() const { return mText; }
    /** @return number of bytes, the newline included. */
    size_t length() const { return mLength; }

  private:
    void append(int32_t value);

    char mText[kSize] = {};
    size_t mLength = 0;
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
