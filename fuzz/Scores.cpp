// SPDX-License-Identifier: Apache-2.0
#include "commands/Commands.h"
#include "scores/Packets.h"

#include <cstdint>
#include <cstdlib>

using namespace vibratorctl;

/**
 * The input is what a person plays. As packets it is taken or refused. As a score its mistakes are
 * in its lines, and without mistakes it can be played.
 */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    static Client client;
    if (client.steps.empty()) addCommands(client);
    const std::string text(reinterpret_cast<const char*>(data), size);
    try {
        parsePackets(text);
    } catch (const cli::UsageError& error) {
        if (*error.what() == '\0') abort();
    }
    Score score;
    const std::vector<ScoreError> errors = parseScore(text, client.steps, &score);
    for (const ScoreError& error : errors) {
        if (error.line == 0 || error.column == 0 || error.column > size + 1) abort();
    }
    if (!errors.empty()) return 0;
    if (score.order.empty() || !(score.seconds() >= 0)) abort();
    for (const uint32_t index : score.order) {
        const ScoreStep& step = score.lines.at(index);
        // What was read once can be read again.
        if (step.command != nullptr) step.command->readStep(step.words);
    }
    return 0;
}
