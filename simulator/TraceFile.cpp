// SPDX-License-Identifier: Apache-2.0
#include "TraceFile.h"

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

void trace(const Folder& directory, const std::string& path, const std::string& access, long result,
           const std::string& shown) {
    const std::string line = model::traceLine(path, access, result, shown);
    const UniqueFd file = directory.open(kTraceName, O_WRONLY | O_APPEND | O_CREAT, 0644);
    struct stat info;
    // One write a line, so that the lines of several processes do not mix. A failure cannot be
    // reported to anybody.
    if (fstat(file.get(), &info) != 0 || info.st_size >= model::kTraceLimit) return;
    [[maybe_unused]] const ssize_t written = write(file.get(), line.data(), line.size());
}

}  // namespace simulator
