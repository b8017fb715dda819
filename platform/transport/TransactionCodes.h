// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>

namespace android::hardware::details {

/** Number of each operation in a request: its place in the interface, counted from 1. */
enum TransactionCode : uint32_t {
    // android.hardware.vibrator@1.0
    kOn = 1,
    kOff,
    kSupportsAmplitudeControl,
    kSetAmplitude,
    kPerform,
    // android.hardware.vibrator@1.1
    kPerform_1_1,
    // android.hardware.vibrator@1.2
    kPerform_1_2,
    // android.hardware.vibrator@1.3
    kSupportsExternalControl,
    kSetExternalControl,
    kPerform_1_3,
    // vendor.velmora.hardware.vibrator@2.0
    kDaxSupportsAmplitudeControl,
    kDaxSupportsForceTouchAmplitudeControl,
    kDaxSupportsFrequencyControl,
    kDaxSupportsHapticEngine,
    kDaxSupportsPrebakedHapticPattern,
    kDaxSupportsFolderStatusSetting,
    kDaxSupportsEnhancedVelmoraHapticPattern,
    kDaxSetAmplitude,
    kDaxSetForceTouchAmplitude,
    kDaxSetFrequencyType,
    kDaxSetFolderStatus,
    kDaxGetNumberOfPrebakedHapticPattern,
    kDaxPerformHapticEngine,
    kDaxPerformPrebakedHapticPattern,
    // vendor.velmora.hardware.vibrator@2.1
    kDaxGetAmplitudeList,

    // The base interface of all has a range of its own.
    kInterfaceChain = 0x0f000001,
    kDebug,
    kInterfaceDescriptor,
    kGetHashChain,
    kSetHALInstrumentation,
    kPing,
    kGetDebugInfo,
    kNotifySyspropsChanged,
};

}  // namespace android::hardware::details
