// SPDX-License-Identifier: Apache-2.0
#include "traffic/TraceReader.h"

#include <charconv>
#include <cstdlib>

namespace vibratorctl {

namespace {

/** Takes the next word, up to a blank, off the front of a text. */
std::string_view takeWord(std::string_view* text) {
    const size_t end = text->find(' ');
    const std::string_view word = text->substr(0, end);
    text->remove_prefix(end == std::string_view::npos ? text->size() : end + 1);
    return word;
}

/** @return the bytes between quotation marks, which are escaped as in C. */
std::string unquote(std::string_view text) {
    const size_t first = text.find('"');
    const size_t last = text.rfind('"');
    std::string bytes;
    for (size_t i = first + 1; first != last && i < last; ++i) {
        if (text[i] != '\\' || i + 1 == last) {
            bytes += text[i];
            continue;
        }
        const char escaped = text[++i];
        if (escaped == 'x' && i + 2 < last) {
            unsigned byte = 0;
            std::from_chars(text.data() + i + 1, text.data() + i + 3, byte, 16);
            bytes += static_cast<char>(byte);
            i += 2;
        } else {
            bytes += escaped == 'n' ? '\n' : escaped == '0' ? '\0' : escaped;
        }
    }
    return bytes;
}

}  // namespace

std::optional<NodeAccess> TraceReader::read(std::string_view line) {
    constexpr double kLatest = 1e12;
    const std::string clock(takeWord(&line));
    const double time = strtod(clock.c_str(), nullptr);
    const std::string node(takeWord(&line));
    const std::string_view call = takeWord(&line);
    const bool isTransfer = call == "read" || call == "write";
    const size_t equals = line.rfind("= ");
    if (!(time >= 0 && time < kLatest) || equals == std::string_view::npos) return std::nullopt;
    if (!isTransfer && call != "open" && call != "close") return std::nullopt;

    std::string_view error = line.substr(equals + 2);
    const std::string result(takeWord(&error));
    if (result != "-1") error = {};
    // An interrupted access is repeated.
    if (error == "EINTR" && call != "close") return std::nullopt;
    NodeAccess& access = mOpen[node];
    if (call == "open") access = {node, NodeAccess::kProbe};
    if (call != "close") access.error = error;
    if (isTransfer) {
        access.kind = call == "read" ? NodeAccess::kRead : NodeAccess::kWrite;
        access.bytes = unquote(line);
        const bool isShort = strtoul(result.c_str(), nullptr, 10) != access.bytes.size();
        if (call == "write" && error.empty() && isShort) access.error = "cut short";
        return std::nullopt;
    }
    if (call == "open" && error.empty()) return std::nullopt;
    access.node = node;
    access.time = time;
    access.clock = clock;
    return mOpen.extract(node).mapped();
}

}  // namespace vibratorctl
