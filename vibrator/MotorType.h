// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** Motor type numbers; each is the index of the driver's name for it in MotorTypeNames. */
enum MotorType : int32_t {
    kMotorNone = 0,
    kMotorCoinDc,
    kMotorLinear,
    kMotorCoinDcPmic,
    kMotorCoinDcIndex,
    kMotorLinearIndex,
    kMotorLinear0832Rc,
    kMotorLinear1040,
    kMotorLinearRcvMot,
    kMotorLinear1030,
    kMotorTypeCount,
};

/** The driver's names of the motor types, indexed by motor type number. */
extern const std::string MotorTypeNames[kMotorTypeCount];

/** The most bytes of the driver's text for the motor that are looked at. */
constexpr size_t kMotorNameSize = 31;

/**
 * @param name as the driver's node shows it, less one final newline; compared byte for byte.
 * @return the motor of that name; kMotorNone if there is none.
 */
MotorType motorOfName(std::string_view name);

/**
 * Infers the motor from what the driver offers.
 *
 * @param features answers the queries below, which have the names that they have in IDaxVibrator.
 *     They are asked in this order, and only as long as the answer is open.
 */
template <typename Features>
MotorType motorOfFeatures(Features& features) {
    if (features.daxSupportsPrebakedHapticPattern()) {
        return features.daxSupportsHapticEngine() ? kMotorLinearIndex : kMotorLinear1030;
    }
    if (features.daxSupportsHapticEngine()) {
        return features.daxSupportsEnhancedVelmoraHapticPattern() ? kMotorLinear1040
                                                                  : kMotorLinear0832Rc;
    }
    return features.daxSupportsAmplitudeControl() ? kMotorLinear : kMotorCoinDc;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
