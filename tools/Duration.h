// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <optional>
#include <string>

/** @return seconds for people: "20 ms", "3.4 s", "2:05 min", "1:02:03 h". */
std::string durationInWords(double seconds);

/** @return the seconds that a text like "500ms", "1.5s", "2m" or "1h" stands for. */
std::optional<double> parseDuration(const std::string& text);
