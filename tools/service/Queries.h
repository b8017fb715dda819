// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "service/Connection.h"
#include "service/LocalDriver.h"

#include <string>
#include <vector>

namespace vibratorctl {

/** A query that the service answers with yes or no. */
struct Query {
    const char* operation;
    ::android::hardware::Return<bool> (IDaxVibrator::*ask)();
    /** What a permitted caller is answered, by the driver. */
    bool (LocalDriver::*expect)() const;
    /** What it asks for, in words. */
    const char* words;
    /** The driver's feature that it asks for; nullptr for none. */
    const char* feature = nullptr;
    /** Whether everybody may ask. */
    bool isForAll = false;
};
extern const std::vector<Query> kQueries;

/** What the service answers to a question, and what the driver's nodes make of it. */
struct Comparison {
    std::string question;
    std::string wanted;
    std::string got;
};

/** Asks all that this process's user may ask; of a driver that is not usable only the queries.
 * @throw Unreachable */
std::vector<Comparison> compareAnswers(IDaxVibrator& vibrator, const LocalDriver& driver);

/** @return the driver, judged for the process that serves the calls; where that is not seen, for
 * this one. */
LocalDriver driverOf(IDaxVibrator& vibrator);

/** @return a ladder of intensities; empty where there is none. @throw Unreachable */
std::vector<uint32_t> askLadder(IDaxVibrator& vibrator, uint32_t type);

/** @return the steps between blanks, or "none". */
std::string ladderInWords(const std::vector<uint32_t>& ladder);

}  // namespace vibratorctl
