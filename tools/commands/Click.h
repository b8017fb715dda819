// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Client.h"

/**
 * Asks for a predefined effect, and reports the answer.
 *
 * @param command what the user asked for, for the report.
 * @param version which minor version of the platform's interface has the effect, 0 to 3.
 * @return the exit code.
 */
int performEffect(const Client& client, const std::string& command, uint32_t effect, size_t version,
                  ::android::hardware::vibrator::V1_0::EffectStrength strength);
