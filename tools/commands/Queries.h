// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Service.h"

#include <vector>

/** A query that the service answers with yes or no. */
struct Query {
    const char* operation;
    /** What it asks for, in words. */
    const char* words;
    ::android::hardware::Return<bool> (service::IDaxVibrator::*ask)();
    /** The driver's feature that it asks for; nullptr for none. */
    const char* feature;
};
extern const std::vector<Query> kQueries;

/** @return a ladder of intensities; empty where there is none. @throw service::Unreachable */
std::vector<uint32_t> askLadder(service::IDaxVibrator& vibrator, uint32_t type);

/** @return the steps between blanks, or "none". */
std::string ladderInWords(const std::vector<uint32_t>& ladder);
