// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "NodeFile.h"

#include <sys/types.h>

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>

/** The one way in which operations exchange text, rather than a number, with a node. */
namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** @return the text in what was read of a node: up to a zero byte, less one newline at the end. */
constexpr std::string_view textOf(std::string_view bytes) {
    if (!bytes.empty() && bytes.back() == '\n') bytes.remove_suffix(1);
    return bytes.substr(0, bytes.find('\0'));
}

/**
 * Reads a node's text, less one final newline.
 *
 * @param operation name that the log lines begin with.
 * @param text buffer for at most size - 1 bytes of text; always terminated.
 * @return whether at least one byte could be read; if not, the reason has been logged.
 */
bool readTextNode(const char* operation, const std::string& node, NodeMode mode, char* text,
                  size_t size);

/**
 * Writes a text to a node in one go.
 *
 * @return what write returned; nothing, and errno, when the node could not be opened.
 */
std::optional<ssize_t> writeTextNode(const std::string& node, const char* text, size_t length);

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
