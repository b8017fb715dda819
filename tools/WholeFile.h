// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

/**
 * Checks that a file may be written in place of what it is now, and is not the input.
 *
 * @throw cli::UsageError
 */
void checkTarget(const std::string& file, const std::string& input);

/** Writes a file whole or not at all. @return what is wrong; empty where nothing is. */
std::string writeWhole(const std::string& file, const std::string& bytes);
