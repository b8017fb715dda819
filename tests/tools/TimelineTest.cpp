// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"
#include "traffic/Timeline.h"

#include <gtest/gtest.h>

#include <cmath>
#include <cstring>
#include <sstream>

namespace {

using namespace vibratorctl;

/** @return a timeline of accesses, which are written as in timelines.txt. */
Timeline timelineOf(const std::string& text) {
    std::vector<NodeAccess> accesses;
    std::istringstream all(text);
    for (std::string each; std::getline(all >> std::ws, each, ';');) {
        std::istringstream words(each);
        double ms = 0;
        NodeAccess access;
        words >> ms >> access.node >> std::ws;
        std::getline(words, access.text);
        access.text += "\\n";
        access.time = 100 + ms / 1000;
        access.clock = ms < 0 ? "" : "time";
        access.kind = access.node[0] == '?' ? NodeAccess::kProbe : NodeAccess::kWrite;
        access.node.erase(0, access.node.find_first_not_of('?')).insert(0, "leds/");
        accesses.push_back(access);
        if (access.kind == NodeAccess::kProbe) continue;
        // What the driver has not taken counts for nothing.
        access.text = "700\\n";
        access.error = "EINVAL";
        accesses.push_back(access);
    }
    return makeTimeline(accesses);
}

/** @return a timeline's calls, and its segments in ms and %: "on 20 at 0; 0-20 100 run". */
std::string inWords(const Timeline& timeline) {
    std::ostringstream text;
    for (const Timeline::Mark& mark : timeline.marks)
        text << "; " << mark.label << " at " << std::round(mark.time * 1000);
    for (const Timeline::Segment& segment : timeline.segments) {
        const char* const kinds[] = {" run", " packet", " pattern"};
        text << "; " << std::round(segment.start * 1000) << '-' << std::round(segment.end * 1000)
             << ' ' << segment.strength * 100 << kinds[segment.kind];
    }
    text << (timeline.goesOn ? "; goes on" : "");
    return text.str().substr(strlen("; "));
}

TEST(TimelineTest, ShowsWhatTheDriverWasTold) {
    size_t cases = 0;
    std::istringstream lines(readFile(SOURCE_DIRECTORY "/tests/tools/timelines.txt"));
    for (std::string accesses, words; std::getline(lines, accesses);) {
        if (accesses.empty() || accesses[0] == '#') continue;
        std::getline(lines >> std::ws, words);
        EXPECT_EQ(inWords(timelineOf(accesses)), words) << accesses;
        ++cases;
    }
    EXPECT_GT(cases, 0U);
}

}  // namespace
