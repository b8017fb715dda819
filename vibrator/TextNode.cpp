// SPDX-License-Identifier: Apache-2.0
#include "TextNode.h"

#include "Log.h"
#include "NodeFile.h"

#include <cstring>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

bool readTextNode(const char* operation, const std::string& node, NodeMode mode, char* text,
                  size_t size) {
    memset(text, 0, size);
    NodeFile file(node.c_str(), mode);
    if (!file.isOpen()) {
        LOG_ERROR("%s node: %s open failed. errno: %d", operation, node.c_str(), errno);
        return false;
    }
    const ssize_t count = file.receive(text, size - 1);
    if (count <= 0) {
        LOG_ERROR("%s node: %s read failed. errno: %d", operation, node.c_str(), errno);
        return false;
    }
    file.shut();

    if (text[count - 1] == '\n') LOG_DEBUG("%s str has new-line char at the last", operation);
    text[textOf({text, static_cast<size_t>(count)}).size()] = '\0';
    return true;
}

std::optional<ssize_t> writeTextNode(const std::string& node, const char* text, size_t length) {
    const NodeFile file(node.c_str(), NodeMode::kReadWrite);
    if (!file.isOpen()) return std::nullopt;
    return file.send(text, length);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
