// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "service/Connection.h"

#include <vector>

namespace vibratorctl {

/** A query that the service answers with yes or no. */
struct Query {
    const char* operation;
    /** What it asks for, in words. */
    const char* words;
    ::android::hardware::Return<bool> (IDaxVibrator::*ask)();
    /** The driver's feature that it asks for; nullptr for none. */
    const char* feature;
};
extern const std::vector<Query> kQueries;

/** @return a ladder of intensities; empty where there is none. @throw Unreachable */
std::vector<uint32_t> askLadder(IDaxVibrator& vibrator, uint32_t type);

/** @return the steps between blanks, or "none". */
std::string ladderInWords(const std::vector<uint32_t>& ladder);

}  // namespace vibratorctl
