// SPDX-License-Identifier: Apache-2.0
#include "Log.h"
#include "NodeFile.h"
#include "Vibrator.h"

#include <cctype>
#include <charconv>
#include <system_error>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

/** @return the decimal number that a text begins with, as scanf's %d reads it, if there is one. */
std::optional<int32_t> parseNumber(const char* text, const char* end) {
    while (text != end && isspace(static_cast<unsigned char>(*text)) != 0)
        ++text;
    if (end - text > 1 && *text == '+' && text[1] != '-') ++text;
    int32_t number = 0;
    if (std::from_chars(text, end, number).ec != std::errc()) return std::nullopt;
    return number;
}

bool canOpen(const char* path, NodeMode mode) {
    const NodeFile file(path, mode);
    LOG_DEBUG(file.isOpen() ? "true" : "false");
    return file.isOpen();
}

}  // namespace

Return<Status> Vibrator::writeNode(std::string node, int value) {
    int error = 0;
    return writeNumber(node, value, &error);
}

Return<int32_t> Vibrator::readNode(std::string node) {
    return readNumber(node).value_or(kReadFailed);
}

Return<bool> Vibrator::isNodeExist(std::string node) {
    LOG_DEBUG("isNodeExist node:%s ", node.c_str());
    return canOpen(node.c_str(), NodeMode::kReadWrite);
}

Return<bool> Vibrator::isNodeExistForRead(std::string node) {
    LOG_DEBUG("isNodeExistForRead node:%s ", node.c_str());
    return canOpen(node.c_str(), NodeMode::kRead);
}

Status Vibrator::writeNumber(const std::string& node, int value, int* error) {
    LOG_DEBUG(">> writeNode node:%s val:%d", node.c_str(), value);
    NodeFile file(node.c_str(), NodeMode::kReadWrite);
    if (!file.isOpen()) {
        *error = errno;
        LOG_ERROR("node: %s open failed. errno: %d", node.c_str(), *error);
        return Status::UNKNOWN_ERROR;
    }

    char text[20];
    char* end = std::to_chars(text, text + sizeof(text) - 1, value).ptr;
    *end++ = '\n';
    const auto length = static_cast<int32_t>(end - text);
    const auto written = static_cast<int32_t>(file.send(text, static_cast<size_t>(length)));
    *error = errno;
    file.shut();
    if (written != length) {
        LOG_DEBUG("<< writeNode node UNKNOWN_ERROR");
        return Status::UNKNOWN_ERROR;
    }
    LOG_DEBUG("<< writeNode node OK");
    return Status::OK;
}

std::optional<int32_t> Vibrator::readNumber(const std::string& node) {
    LOG_DEBUG(">> readNode node:%s ", node.c_str());
    NodeFile file(node.c_str(), NodeMode::kRead);
    if (!file.isOpen()) {
        LOG_ERROR("node: %s open failed. errno: %d", node.c_str(), errno);
        return std::nullopt;
    }

    char text[8] = {};
    const ssize_t size = file.receive(text, sizeof(text) - 1);
    if (size < 0) {
        LOG_ERROR("node: %s read failed. errno: %d", node.c_str(), errno);
        return std::nullopt;
    }
    file.shut();
    LOG_DEBUG("<< readNode done");
    return parseNumber(text, text + size);
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
