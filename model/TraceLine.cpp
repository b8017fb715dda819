// SPDX-License-Identifier: Apache-2.0
#include "TraceLine.h"

#include <fcntl.h>

#include <cstdio>
#include <cstring>
#include <ctime>

namespace model {

std::string quote(std::string_view bytes) {
    std::string quoted = "\"";
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        if (c == '\n') {
            quoted += "\\n";
        } else if (c == '\0') {
            quoted += "\\0";
        } else if (c == '"' || c == '\\') {
            quoted += '\\';
            quoted += c;
        } else if (byte < 0x20 || byte >= 0x7f) {
            char hex[8];
            snprintf(hex, sizeof(hex), "\\x%02x", byte);
            quoted += hex;
        } else {
            quoted += c;
        }
    }
    return quoted + '"';
}

std::string accessMode(int flags) {
    constexpr const char* kNames[] = {"O_RDONLY", "O_WRONLY", "O_RDWR", "O_ACCMODE"};
    return kNames[flags & O_ACCMODE];
}

std::string traceLine(const std::string& path, const std::string& access, long result,
                      const std::string& shown) {
    constexpr size_t kStart = std::string_view("/sys/class/").size();
    timespec time{};
    clock_gettime(CLOCK_MONOTONIC, &time);
    char clock[32];
    snprintf(clock, sizeof(clock), "%lld.%06ld ", static_cast<long long>(time.tv_sec),
             time.tv_nsec / 1000);
    std::string line = clock + path.substr(kStart, path.find('/', kStart) - kStart) +
                       path.substr(path.rfind('/')) + ' ' + access + " = ";
    line += result < 0 ? std::string("-1 ") + strerrorname_np(static_cast<int>(-result))
                       : std::to_string(result);
    if (!shown.empty()) line += " " + shown;
    return line + '\n';
}

}  // namespace model
