// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Service.h"

#include <cstdint>
#include <string>
#include <vector>

/** @return a ladder of intensities; empty where the service has none. @throw Unreachable */
std::vector<uint32_t> askLadder(const ::android::sp<service::IDaxVibrator>& vibrator,
                                uint32_t type);

/** @return the steps between blanks, or "none". */
std::string ladderInWords(const std::vector<uint32_t>& ladder);
