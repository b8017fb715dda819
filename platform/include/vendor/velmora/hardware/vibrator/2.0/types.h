// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace vendor::velmora::hardware::vibrator::V2_0 {

/** Fold state of a foldable device. */
enum class DaxFolderStatus : uint32_t {
    FOLDER_OPEN = 0,
    FOLDER_CLOSE = 1,
};

/** Frequency type of the motor; the driver alone gives the number a meaning. */
enum class DaxFrequencyType : int32_t {
    TYPE_0 = 0,
    TYPE_1 = 1,
    TYPE_2 = 2,
    TYPE_3 = 3,
    TYPE_4 = 4,
};

/** One packet of a waveform for the driver's haptic engine. */
struct DaxHapticEnginePacket final {
    int32_t param0;
    int32_t intensity;
    int32_t param2;
    int32_t param3;
};

}  // namespace vendor::velmora::hardware::vibrator::V2_0
