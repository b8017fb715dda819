// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

/** Texts that people type and read. */
namespace cli {

/**
 * @param hasLines whether the ends of lines stay.
 * @return the text without anything that a terminal would obey: control characters, C1 ones too,
 *     and bytes that are no UTF-8 stand as \xNN.
 */
std::string printable(std::string_view text, bool hasLines = false);

/** @return the text between quotation marks, printable. */
std::string inQuotes(std::string_view text);

/** @return `; did you mean "WORD"?` for the known word nearest to a mistyped one, or nothing. */
std::string suggestion(std::string_view typed, const std::vector<std::string>& known);

/** @return words with a separator between them, and another one before the last. */
std::string join(const std::vector<std::string>& words, const std::string& separator,
                 const std::string& last);

/** Columns that helps and tables keep to. */
constexpr size_t kColumns = 80;

/** @return the text in lines of at most kColumns, all but the first of them indented. */
std::string wrap(const std::string& text, size_t indent);

/** @return seconds for people: "20 ms", "3.4 s", "2:05 min", "1:02:03 h". */
std::string durationInWords(double seconds);

}  // namespace cli
