// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Packets.h"

#include <cstdint>
#include <string>
#include <vector>

/** One line of a score: a call, or a pause between two. */
struct ScoreStep {
    enum Kind {
        kClick,
        kOn,
        kOff,
        kWait,
        kAmplitude,
        kIntensity,
        kPattern,
        kEngine,
        kExternal,
        kFrequency,
        kForceTouch,
        kFold,
    };
    Kind kind = kOff;
    /** Milliseconds, a strength, a number of a pattern or type, or the index of a word: of
     * "light medium strong", "off on" or "open close". */
    uint32_t number = 0;
    /** Amplitude of a pattern or of packets, 1 to 10000. */
    uint32_t amplitude = 10000;
    bool repeat = false;
    HapticEnginePackets packets;
    /** Where it stands, counted from 1, the column in bytes. */
    size_t line = 0;
    size_t column = 0;
    /** Its first word, and the others; not all of many. */
    std::string name;
    std::string argument;
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
 * @return what is wrong with it, kMostScoreErrors mistakes at most; empty where it can be played.
 */
std::vector<ScoreError> parseScore(const std::string& text, Score* score);
