// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Attributes.h"

#include <string>
#include <vector>

namespace driver {

/** The packets of each stored pattern, the one with number 1 first. */
using Patterns = std::vector<std::vector<model::Packet>>;

/**
 * Reads stored patterns. A line [NAME] begins each; packets follow, each
 * PARAM0,INTENSITY,PARAM2,PARAM3, with blanks between them. # begins a comment.
 *
 * @param file what the text is from, for the error.
 * @throw cli::UsageError with the first mistake and its line.
 */
Patterns parsePatterns(const std::string& text, const std::string& file);

}  // namespace driver
