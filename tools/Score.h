// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Packets.h"

#include <android/hardware/vibrator/1.0/types.h>

#include <cstdint>
#include <string>
#include <vector>

/** One line of a score: a call, or a pause between two. */
struct ScoreStep {
    enum Kind { kClick, kOn, kOff, kWait, kAmplitude, kIntensity, kPattern, kEngine };
    Kind kind = kOff;
    /** Milliseconds, an amplitude, or a pattern's number. */
    uint32_t number = 0;
    /** Amplitude of a pattern or of packets, 1 to 10000. */
    uint32_t amplitude = 10000;
    bool repeat = false;
    ::android::hardware::vibrator::V1_0::EffectStrength strength =
            ::android::hardware::vibrator::V1_0::EffectStrength::MEDIUM;
    HapticEnginePackets packets;
};

struct ScoreError {
    size_t line;
    /** Counted from 1, in bytes. */
    size_t column;
    std::string what;
};

/**
 * Reads a score: a step a line, its words between blanks; # begins a comment.
 *
 * @return all that is wrong with it; empty where it can be played.
 */
std::vector<ScoreError> parseScore(const std::string& text, std::vector<ScoreStep>* steps);
