// SPDX-License-Identifier: Apache-2.0
#include "EffectPlayback.h"

#include "Log.h"
#include "Vibrator.h"

#include <cstddef>
#include <iterator>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<void> Vibrator::perform(::android::hardware::vibrator::V1_0::Effect effect,
                               EffectStrength strength, perform_cb _hidl_cb) {
    LOG_DEBUG("perform start effect : %d, strength : %d", static_cast<int>(effect),
              static_cast<int>(strength));
    if (effect != ::android::hardware::vibrator::V1_0::Effect::CLICK) {
        _hidl_cb(Status::UNSUPPORTED_OPERATION, 0);
        LOG_DEBUG("perform end effect");
        return Void();
    }
    const auto index = static_cast<size_t>(strength);
    if (index >= std::size(kClickAmplitudes)) {
        _hidl_cb(Status::UNSUPPORTED_OPERATION, 0);
        return Void();
    }

    // A click is reported as played even when the driver did not take all of it.
    on(kClickMs);
    setAmplitude(kClickAmplitudes[index]);
    _hidl_cb(Status::OK, kClickMs);
    LOG_DEBUG("perform end effect");
    return Void();
}

Return<void> Vibrator::perform_1_1(Effect_1_1 effect, EffectStrength strength,
                                   perform_1_1_cb _hidl_cb) {
    LOG_DEBUG("perform_1_1 start effect : %d, strength : %d", static_cast<int>(effect),
              static_cast<int>(strength));
    _hidl_cb(Status::UNSUPPORTED_OPERATION, 0);
    return Void();
}

Return<void> Vibrator::perform_1_2(::android::hardware::vibrator::V1_2::Effect effect,
                                   EffectStrength strength, perform_1_2_cb _hidl_cb) {
    LOG_DEBUG("perform_1_2 start effect : %d, strength : %d", static_cast<int>(effect),
              static_cast<int>(strength));
    _hidl_cb(Status::UNSUPPORTED_OPERATION, 0);
    return Void();
}

Return<void> Vibrator::perform_1_3(::android::hardware::vibrator::V1_3::Effect effect,
                                   EffectStrength strength, perform_1_3_cb _hidl_cb) {
    LOG_DEBUG("perform_1_3 start effect : %d, strength : %d", static_cast<int>(effect),
              static_cast<int>(strength));
    _hidl_cb(Status::UNSUPPORTED_OPERATION, 0);
    return Void();
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
