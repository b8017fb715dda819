// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace cli {

/** The numbers that a text may stand for. */
struct Numbers {
    /** In words, with the article: "an amplitude". */
    const char* what;
    uint32_t least;
    uint32_t most;
    /**
     * What a number alone is given in: "" for pieces; "ms" or "s" for times, which may be given in
     * ms, s, m or h, too; "%" for strengths, which may also be given in per cent of the most.
     */
    const char* unit = "";

    /** @return the range in words: "1 to 255", "0 to 3600 s". */
    std::string range() const;
    /** @return the number that a whole text stands for, a time always in ms; or nothing. */
    std::optional<uint32_t> parse(const std::string& text) const;
};

}  // namespace cli
