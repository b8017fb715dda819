// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "cli/CommandLine.h"

#include <cstdint>
#include <functional>
#include <nlohmann/json_fwd.hpp>
#include <optional>
#include <string>
#include <vector>

/** A command as a step of a score. */
struct StepKind {
    std::string name;
    cli::Command* command;
    /**
     * Judges the step that the command has read last.
     *
     * @return for how long the motor runs from it on, in ms; none where that stays as it was.
     * @throw cli::UsageError
     */
    std::function<std::optional<double>()> runs = [] { return std::nullopt; };
};

/** One line of a score: a command, or a pause between two. */
struct ScoreStep {
    std::string name;
    std::vector<std::string> words;
    /** Where it stands, counted from 1, the column in bytes. */
    size_t line;
    size_t column;
    /** nullptr for a pause. */
    cli::Command* command = nullptr;
    /** For how long it waits, in ms. */
    uint32_t pause = 0;
    /** For how long the motor runs from it on, in ms, if it says so. */
    std::optional<double> runs = {};

    /** @return the words, for people; not all of many. */
    std::string argument() const;
    /** @return the place, as members of the JSON. */
    nlohmann::ordered_json place() const;
};

constexpr size_t kMostScoreErrors = 20;

struct ScoreError {
    size_t line;
    size_t column;
    std::string what;
};

/** A score as it is played: the steps of its lines, in an order in which some come again. */
struct Score {
    std::vector<ScoreStep> lines;
    /** Indices of lines. */
    std::vector<uint32_t> order;

    /** @return how long it takes until the motor rests, in s, were the calls to take no time. */
    double seconds() const;
};

/**
 * Reads a score: a step a line, its words between blanks; # begins a comment; the lines between
 * "repeat N" and "end" are played N times.
 *
 * @param kinds all steps beside "wait", which takes a time in ms.
 * @return what is wrong with it, kMostScoreErrors mistakes at most; empty where it can be played.
 */
std::vector<ScoreError> parseScore(const std::string& text, const std::vector<StepKind>& kinds,
                                   Score* score);
