// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "cli/CommandLine.h"

#include <nlohmann/json_fwd.hpp>

namespace vibratorctl {

/** A command as a step of a score. */
struct StepKind {
    std::string name;
    cli::Command* command;
    /**
     * Checks the step that the command has read last.
     *
     * @return the ms that the motor runs from this step on; none if the step does not change it.
     * @throw cli::UsageError
     */
    std::function<std::optional<double>()> runs = [] { return std::nullopt; };
    /** @return for how many ms the step that the command has read last waits. */
    std::function<uint32_t()> waits = [] { return 0; };
};

/** One line of a score: a command, or a pause between two. */
struct ScoreStep {
    std::string name;
    std::vector<std::string> words;
    /** Its place, counted from 1; the column in bytes. */
    size_t line;
    size_t column;
    /** nullptr for a pause. */
    cli::Command* command = nullptr;
    /** For how long it waits, in ms. */
    uint32_t pause = 0;
    /** How long the motor runs from this step on, in ms; none if the step does not change it. */
    std::optional<double> runs = {};

    /** @return the words, for people; cut if they are too long. */
    std::string argument() const;
    /** @return the place, as members of the JSON. */
    nlohmann::ordered_json place() const;
};

constexpr size_t kMaxScoreErrors = 20;

struct ScoreError {
    size_t line;
    size_t column;
    std::string what;
};

/** A score: its steps, and the order in which they are played, repeated ones several times. */
struct Score {
    std::vector<ScoreStep> lines;
    /** Indices of lines. */
    std::vector<uint32_t> order;

    /** @return the time until the motor stops, in s, not counting the time of the calls. */
    double seconds() const;
};

/**
 * Reads a score: one step in each line, with blanks between words; # begins a comment; the lines
 * between "repeat N" and "end" are played N times.
 *
 * @param kinds all steps besides "wait", which takes a time in ms.
 * @return the mistakes, at most kMaxScoreErrors; empty if the score can be played.
 */
std::vector<ScoreError> parseScore(const std::string& text, const std::vector<StepKind>& kinds,
                                   Score* score);

}  // namespace vibratorctl
