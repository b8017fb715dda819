// SPDX-License-Identifier: Apache-2.0
#include "traffic/AccessReader.h"
#include "traffic/Picture.h"
#include "traffic/TextPlot.h"

#include <cstdint>
#include <cstdlib>
#include <sstream>

using namespace vibratorctl;

/** The input is a trace and a log, drawn in all ways, whole and in part. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    AccessReader reader;
    std::vector<NodeAccess> accesses;
    std::istringstream lines(std::string(reinterpret_cast<const char*>(data), size));
    for (std::string line; std::getline(lines, line);) {
        if (const auto access = reader.read(line)) accesses.push_back(*access);
    }
    Timeline timeline = makeTimeline(accesses);
    for (const Timeline::Segment& segment : timeline.segments) {
        if (!(segment.start <= segment.end && segment.end <= timeline.end)) abort();
    }
    if (plotText(timeline, 80, size % 2 == 0).empty()) abort();
    cut(&timeline, timeline.end / 4, timeline.end / 2);
    if (plotScript(timeline, PictureFormat::kSvg).empty()) abort();
    return 0;
}
