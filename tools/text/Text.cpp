// SPDX-License-Identifier: Apache-2.0
#include "Text.h"

#include <algorithm>
#include <clocale>
#include <cmath>
#include <cstdio>
#include <cwchar>
#include <cwctype>
#include <numeric>
#include <sstream>

namespace cli {
namespace {

/** @return how many letters must be changed, added or left out. */
size_t distance(std::string_view a, std::string_view b) {
    std::vector<size_t> steps(b.size() + 1);
    std::iota(steps.begin(), steps.end(), 0);
    for (const char letter : a) {
        size_t diagonal = steps[0]++;
        for (size_t i = 0; i < b.size(); ++i) {
            const size_t changed = diagonal + (letter == b[i] ? 0 : 1);
            diagonal = steps[i + 1];
            steps[i + 1] = std::min({changed, steps[i] + 1, diagonal + 1});
        }
    }
    return steps.back();
}

}  // namespace

std::string printable(std::string_view text, bool hasLines) {
    // Which characters are controls is known of any language; without the locale, of ASCII.
    static const char* const locale = setlocale(LC_CTYPE, "C.UTF-8");
    static_cast<void>(locale);
    std::string safe;
    while (!text.empty()) {
        mbstate_t state{};
        wchar_t character = 0;
        const size_t size = mbrtowc(&character, text.data(), text.size(), &state);
        const bool isCharacter = size >= 1 && size <= text.size();
        const bool isSafe = isCharacter && (iswprint(static_cast<wint_t>(character)) != 0 ||
                                            (hasLines && character == L'\n'));
        const std::string_view bytes = text.substr(0, isCharacter ? size : 1);
        for (const char byte : bytes) {
            char hex[8];
            snprintf(hex, sizeof(hex), "\\x%02x", static_cast<unsigned char>(byte));
            safe += isSafe ? std::string(1, byte) : hex;
        }
        text.remove_prefix(bytes.size());
    }
    return safe;
}

std::string inQuotes(std::string_view text) {
    return '"' + printable(text) + '"';
}

std::string suggestion(std::string_view typed, const std::vector<std::string>& known) {
    constexpr size_t kMaxTyped = 64;
    const std::string* nearest = nullptr;
    // A word of which more than a third is wrong is another word.
    size_t best = std::min<size_t>(2, (typed.size() + 1) / 3) + 1;
    for (const std::string& word : known) {
        const size_t steps = typed.size() > kMaxTyped ? best : distance(typed, word);
        if (steps >= best) continue;
        best = steps;
        nearest = &word;
    }
    return nearest == nullptr ? "" : "; did you mean " + inQuotes(*nearest) + "?";
}

std::string join(const std::vector<std::string>& words, const std::string& separator,
                 const std::string& last) {
    std::string joined;
    for (size_t i = 0; i < words.size(); ++i) {
        joined += (i == 0 ? "" : i + 1 == words.size() ? last : separator) + words[i];
    }
    return joined;
}

std::string wrap(const std::string& text, size_t indent) {
    std::istringstream words(text);
    std::string lines;
    size_t column = indent;
    for (std::string word; words >> word;) {
        if (column > indent && column + 1 + word.size() > kColumns) {
            lines += '\n' + std::string(indent, ' ');
            column = indent;
        } else if (column > indent) {
            lines += ' ';
            ++column;
        }
        lines += word;
        column += word.size();
    }
    return lines + '\n';
}

std::string durationInWords(double seconds) {
    char text[48];
    const long long whole = std::llround(seconds);
    if (std::llround(seconds * 1000) < 1000) {
        snprintf(text, sizeof(text), "%.4g ms", std::round(seconds * 1e4) / 10);
    } else if (whole < 60) {
        snprintf(text, sizeof(text), "%.4g s", std::round(seconds * 1000) / 1000);
    } else if (whole < 3600) {
        snprintf(text, sizeof(text), "%lld:%02lld min", whole / 60, whole % 60);
    } else {
        snprintf(text, sizeof(text), "%lld:%02lld:%02lld h", whole / 3600, whole / 60 % 60,
                 whole % 60);
    }
    return text;
}

}  // namespace cli
