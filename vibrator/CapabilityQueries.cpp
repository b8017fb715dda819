// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"
#include "Vibrator.h"

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<bool> Vibrator::daxSupportsAmplitudeControl() {
    if (checkCallerPermission() != kCallerPermitted) return false;
    return isNodeExist(THE_DEVICE_INTENSITY);
}

Return<bool> Vibrator::daxSupportsForceTouchAmplitudeControl() {
    if (checkCallerPermission() != kCallerPermitted) return false;
    return isNodeExist(THE_DEVICE_FORCE_TOUCH_INTENSITY);
}

Return<bool> Vibrator::daxSupportsFrequencyControl() {
    if (checkCallerPermission() != kCallerPermitted) return false;
    return isNodeExist(THE_DEVICE_MULTI_FREQ);
}

Return<bool> Vibrator::daxSupportsHapticEngine() {
    if (checkCallerPermission() != kCallerPermitted) return false;
    return isNodeExist(THE_DEVICE_HAPTIC_ENGINE);
}

Return<bool> Vibrator::daxSupportsPrebakedHapticPattern() {
    if (checkCallerPermission() != kCallerPermitted) return false;
    return isNodeExist(THE_DEVICE_HAPTIC_ENGINE_INDEX);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
