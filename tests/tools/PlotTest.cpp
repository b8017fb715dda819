// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"
#include "traffic/AccessReader.h"
#include "traffic/Picture.h"
#include "traffic/TextPlot.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cmath>
#include <cstring>
#include <map>
#include <pugixml.hpp>
#include <sstream>

namespace {

using namespace vibratorctl;

TEST(AccessReaderTest, TellsTimes) {
    const std::string tag = "QorVibrator-HAL2.1(  539): ";
    const struct {
        std::string start;
        std::string clock;
        double seconds;
    } forms[] = {
            {"D/", "", 0},
            {"11-24 22:18:03.250 D/", "11-24 22:18:03.250", 80283.25},
            {"2026-11-24 22:18:03.250   539   541 D ", "2026-11-24 22:18:03.250", 80283.25},
            {"2026-11-24T22:18:03+0000 host vibrator[539]: D/", "2026-11-24T22:18:03", 80283},
            {"Nov 24 22:18:03 host vibrator[539]: D/", "Nov 24 22:18:03", 80283},
            {"[   77.500000] host vibrator[539]: D/", "77.500000", 77.5},
            {"1732486683.125   539   541 D ", "1732486683.125", 1732486683.125 - 20051 * 86400.0}};
    for (const auto& [start, clock, seconds] : forms) {
        LogReader reader;
        reader.read(start + tag + ">> writeNode node:/sys/class/leds/vibrator/state val:1");
        const auto access = reader.read(start + tag + "<< writeNode node OK");
        ASSERT_TRUE(access) << start;
        EXPECT_EQ(access->clock, clock);
        EXPECT_DOUBLE_EQ(std::fmod(access->time, 86400), std::fmod(seconds, 86400)) << start;
    }
}

/** @return a timeline of accesses, which are written as in timelines.txt. */
Timeline timelineOf(const std::string& text) {
    std::vector<NodeAccess> accesses;
    std::istringstream all(text);
    for (std::string each; std::getline(all >> std::ws, each, ';');) {
        std::istringstream words(each);
        double ms = 0;
        NodeAccess access;
        words >> ms >> access.node >> std::ws;
        std::getline(words, access.bytes);
        access.bytes += '\n';
        access.time = 100 + ms / 1000;
        access.clock = ms < 0 ? "" : "time";
        access.kind = access.node[0] == '?' ? NodeAccess::kProbe : NodeAccess::kWrite;
        access.node.erase(0, access.node.find_first_not_of('?')).insert(0, "leds/");
        accesses.push_back(access);
        if (access.kind == NodeAccess::kProbe) continue;
        // What the driver has not taken counts for nothing.
        access.bytes = "700\n";
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
    Timeline part = timelineOf("0 enable 100; 200 enable 100; 400 enable 100");
    cut(&part, 0.25, 0.45);
    EXPECT_EQ(inWords(part), "on 100 at 400; 250-300 100 run; 400-450 100 run; goes on");
    EXPECT_DOUBLE_EQ(part.start + part.end, 0.7);
    part = timelineOf("0 enable 100; 200 enable 100000");
    cut(&part, 0, 10);
    EXPECT_TRUE(part.goesOn) << "as before";
    cut(&part, 0, 0.15);
    EXPECT_EQ(inWords(part), "on 100 at 0; 0-100 100 run");
}

/** @return a block of the data that gnuplot gets. */
std::string dataOf(const Timeline& timeline, const std::string& name) {
    const std::string script = plotScript(timeline, PictureFormat::kSvg);
    const std::string start = "$" + name + " << END\n";
    const size_t first = script.find(start) + start.size();
    return script.substr(first, script.find("END\n", first) - first);
}

TEST(PlotTest, CrowdsAreThinnedAndNothingLeavesItsQuotes) {
    Timeline timeline;
    timeline.end = 100;
    for (int i = 0; i < 10000; ++i) {
        timeline.marks.push_back({i * 0.01, "off"});
        timeline.segments.push_back(
                {i * 0.01, i * 0.01 + 0.001, i % 7 == 0 ? 0.5 : 0.25, Timeline::Segment::kRun});
    }
    const auto linesOf = [&](const std::string& block) {
        const std::string data = dataOf(timeline, block);
        return std::count(data.begin(), data.end(), '\n');
    };
    EXPECT_NEAR(static_cast<double>(linesOf("labels")), 37, 1);
    EXPECT_NEAR(static_cast<double>(linesOf("calls")), 256, 10);
    EXPECT_EQ(dataOf(timeline, "labels").find("0 off, off, off, off +263\n2.67 off, off, "), 0U)
            << dataOf(timeline, "labels");
    // A bar holds what is in its pixel.
    EXPECT_NEAR(static_cast<double>(linesOf("run")), 750, 50);
    const std::string bars = dataOf(timeline, "run");
    EXPECT_GE(bars.find(" 25\n"), bars.size() - 4) << "only the last bar may have no other";

    timeline = {};
    timeline.end = 1;
    timeline.marks.push_back({0, "it's `d`\n\"\\ <&> @x \xff"});
    EXPECT_EQ(dataOf(timeline, "labels"),
              "0 it?s ?d???? ??"
              "? ?x ?\n");
}

TEST(PlotTest, GnuplotIsGivenEverythingInItsPlace) {
    std::string script =
            plotScript(timelineOf("0 enable 100; 120 haptic_engine 8 3 20000 0 0 100 5000 0 0; "
                                  "120 enable 1; 243 cp_trigger_index 4; 263 enable 300; "
                                  "583 enable 20; 605 intensity 20000; 623 enable 90000"),
                       PictureFormat::kSvg);
    script.erase(script.find("# "));
    std::replace(script.begin(), script.end(), '\n', ';');
    EXPECT_EQ(script,
              "terminal = 'svg';title = 'What the driver was told: 7 calls in 1.623 s';note = '';"
              "start = 0;length = 1.63923;columns = 796;going_on = 100;"
              "$calls << END;0;0.12;0.243;0.263;0.583;0.605;0.623;END;"
              "$labels << END;0 on 100;0.12 engine, 2 packets;0.243 pattern 4, on 300;"
              "0.583 on 20, intensity 20000 +1;END;"
              "$run << END;0 0.0989703329 0 100;0.583 0.601970333 0 100;0.623 1.62197033 0 100;END;"
              "$packet << END;0.12 0.123 0 100;0.123 0.221970333 0 50;END;"
              "$pattern << END;0.263 0.561970333 0 100;END;"
              "$beyond << END;0.12 0.123 96 100;0.623 1.62197033 96 100;END;");
    const std::string other = plotScript(timelineOf("-1 enable 100"), PictureFormat::kPng);
    EXPECT_EQ(other.find("terminal = 'pngcairo f"), 0U) << other;
    EXPECT_NE(other.find("\nnote = 'The log has no times: "), std::string::npos) << other;
}

TEST(PlotTest, BarsStandInTheirPlaces) {
    const Timeline timeline = timelineOf(
            "0 enable 200; 305 haptic_engine 4 100 20000 0 0; 305 enable 1; 505 intensity 10000; "
            "505 cp_trigger_index 3; 505 enable 1000");
    pugi::xml_document svg;
    ASSERT_TRUE(svg.load_string(drawPicture(timeline, PictureFormat::kSvg).c_str()));
    EXPECT_EQ(svg.child("svg").child_value("title"), plotTitle(timeline));
    std::map<std::string, std::pair<double, double>> bars;
    for (const auto& each : svg.select_nodes("//polygon")) {
        double left = 0;
        double bottom = 0;
        double right = 0;
        std::istringstream points(each.node().attribute("points").value());
        char comma = 0;
        points >> left >> comma >> bottom >> right;
        // The legend's is at the bottom, and comes first.
        bars[each.node().attribute("fill").value()] = {left, right};
    }
    ASSERT_EQ(bars.size(), 4U);
    const auto [packetLeft, packetRight] = bars["rgb(230, 159,   0)"];
    const auto [patternLeft, patternRight] = bars["rgb(  0, 158, 115)"];
    // The pattern lasts a second, the packet a tenth, and the whole ends with the pattern.
    EXPECT_NEAR((patternRight - patternLeft) / (packetRight - packetLeft), 10, 0.3);
    EXPECT_NEAR(patternRight, 84 + (1000 - 84 - 120) / 1.01, 2);
    EXPECT_GT(packetLeft, 84 + 796 * 0.1);
    EXPECT_GT(patternLeft, packetRight + 796 * 0.05);
}

}  // namespace
