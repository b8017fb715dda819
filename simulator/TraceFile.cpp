// SPDX-License-Identifier: Apache-2.0
#include "TraceFile.h"

#include "SimulatedDriver.h"
#include "TraceLine.h"

#include <fcntl.h>
#include <unistd.h>

namespace simulator {

namespace {

constexpr char kTraceName[] = "trace";

}  // namespace

std::string traceFile(const std::string& directory) {
    return directory + "/" + kTraceName;
}

void trace(const Folder& directory, const std::string& access, long result,
           const std::string& shown) {
    if (!isMarked(directory)) return;
    const std::string line = model::traceLine(access, result, shown);
    const int file = directory.open(kTraceName, O_WRONLY | O_APPEND | O_CREAT, 0644);
    struct stat info;
    if (file < 0 || fstat(file, &info) != 0) return;
    // One write a line, so that the lines of several processes do not mix. A failure cannot be
    // reported to anybody.
    if (info.st_size < model::kTraceLimit) {
        [[maybe_unused]] const ssize_t written = write(file, line.data(), line.size());
    }
    close(file);
}

}  // namespace simulator
