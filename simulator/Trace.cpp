// SPDX-License-Identifier: Apache-2.0
#include "Trace.h"

#include "Driver.h"

#include <fcntl.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>
#include <ctime>

namespace simulator {

namespace {

constexpr char kTraceName[] = "trace";

bool sOnlyLooks = false;

}  // namespace

std::string traceFile(const std::string& directory) {
    return directory + "/" + kTraceName;
}

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

void trace(const Folder& directory, const std::string& access, long result,
           const std::string& shown) {
    if (sOnlyLooks || !isMarked(directory)) return;
    timespec time{};
    clock_gettime(CLOCK_MONOTONIC, &time);
    char clock[32];
    snprintf(clock, sizeof(clock), "%lld.%06ld ", static_cast<long long>(time.tv_sec),
             time.tv_nsec / 1000);
    std::string line = clock + access + " = ";
    line += result < 0 ? std::string("-1 ") + strerrorname_np(static_cast<int>(-result))
                       : std::to_string(result);
    if (!shown.empty()) line += " " + shown;
    line += '\n';

    const int file = directory.open(kTraceName, O_WRONLY | O_APPEND | O_CREAT, 0644);
    struct stat info;
    if (file < 0 || fstat(file, &info) != 0) return;
    // One write a line, so that the lines of several processes do not mix. A failure cannot be
    // reported to anybody.
    if (info.st_size < kTraceLimit) {
        [[maybe_unused]] const ssize_t written = write(file, line.data(), line.size());
    }
    close(file);
}

void onlyLook() {
    sOnlyLooks = true;
}

bool onlyLooks() {
    return sOnlyLooks;
}

}  // namespace simulator
