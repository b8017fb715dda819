// SPDX-License-Identifier: Apache-2.0
#include "traffic/AccessReader.h"

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

/** @return how many bytes an escaped text stands for. */
size_t sizeOf(std::string_view text) {
    size_t size = text.size();
    for (size_t i = 0; (i = text.find('\\', i)) < text.size(); i += 2)
        size -= text.substr(i, 2) == "\\x" ? 3 : 1;
    return size;
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
        const size_t start = line.find('"') + 1;
        access.text = line.substr(start, line.rfind('"') - start);
        const bool isShort = strtoul(result.c_str(), nullptr, 10) != sizeOf(access.text);
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
