// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Attributes.h"
#include "Player.h"

#include <string>
#include <vector>

namespace driver {

/** @return the time, the strength and the frequency that a packet of the haptic engine stands for.
 */
Segment segmentOf(const model::Packet& packet);

/**
 * Reads stored patterns. A line [NAME] begins each, the first with number 1; packets follow, each
 * PARAM0,INTENSITY,PARAM2,PARAM3, with blanks between them. # begins a comment.
 *
 * @throw cli::UsageError with the first mistake and its line.
 */
std::vector<std::vector<Segment>> parsePatterns(const std::string& text);

}  // namespace driver
