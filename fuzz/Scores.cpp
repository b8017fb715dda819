// SPDX-License-Identifier: Apache-2.0
#include "Score.h"

#include <cstdlib>

/** Any bytes as a score: every mistake lies in a line of it, and a score without one can be played.
 */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    const std::string text(reinterpret_cast<const char*>(data), size);
    std::vector<ScoreStep> steps;
    const std::vector<ScoreError> errors = parseScore(text, &steps);
    for (const ScoreError& error : errors) {
        if (error.line == 0 || error.column == 0 || error.column > size + 1) abort();
    }
    if (!errors.empty()) return 0;
    for (const ScoreStep& step : steps) {
        if (step.amplitude < 1 || step.amplitude > 10000 || step.packets.size() > 339) abort();
    }
    return 0;
}
