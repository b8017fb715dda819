// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"

#include <cstdlib>
#include <sstream>

/** Any bytes as a trace and as a log, drawn both ways. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    std::istringstream lines(std::string(reinterpret_cast<const char*>(data), size));
    TraceReader trace;
    LogReader log;
    std::vector<NodeAccess> accesses;
    for (std::string line; std::getline(lines, line);) {
        if (auto access = trace.read(line)) accesses.push_back(std::move(*access));
        if (auto access = log.read(line)) accesses.push_back(std::move(*access));
    }
    const Timeline timeline = makeTimeline(accesses);
    if (plotSvg(timeline).empty() || plotText(timeline, 80).empty()) abort();
    return 0;
}
