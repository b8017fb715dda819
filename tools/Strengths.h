// SPDX-License-Identifier: Apache-2.0
#pragma once

namespace vibratorctl {

/** Names of the click's strengths, indexed by the platform's EffectStrength. */
inline constexpr const char* kStrengths[] = {"light", "medium", "strong"};

}  // namespace vibratorctl
