// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"
#include "support/ServiceTest.h"

#include <sys/stat.h>

#include <algorithm>
#include <cmath>
#include <csignal>
#include <filesystem>
#include <fstream>
#include <map>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>
#include <set>
#include <sstream>
#include <tuple>

namespace {

using Words = std::vector<std::string>;

std::string repeated(const std::string& text, int times) {
    std::string all;
    for (int i = 0; i < times; ++i)
        all += text;
    return all;
}

class ToolsTest : public ServiceTest {
  protected:
    static Outcome run(Words words, const std::string& input = {}) {
        words.insert(words.begin(), VIBRATORCTL);
        return runProgram(words, geteuid(), input);
    }
    static Outcome runShell(const std::string& command) {
        return runProgram({"/bin/bash", "-c", command, VIBRATORCTL});
    }
    /** Runs the client on a terminal that does not know its width. @return what is shown there. */
    std::string onTerminal(const std::string& environment, const std::string& line) const {
        // script takes the end of its input for the end of all: open for both, this has none.
        const std::string input = mDirectory.path() + "/input";
        mkfifo(input.c_str(), 0600);
        return runShell("export V=\"$0\"; " + environment + " script -qec '\"$V\" " + line +
                        "' /dev/null <>" + input)
                .output;
    }
    std::string nodeFile(const std::string& leaf) const {
        return mDirectory.path() + "/sys/class/leds/vibrator/" + leaf;
    }
    std::string traceFile() const { return mDirectory.path() + "/trace"; }
    /** @return whether the last that the trigger was told is a number. */
    bool wasTold(const std::string& number) const {
        const std::string trace = readFile(traceFile());
        const std::string write = "leds/activate write \"";
        const size_t last = trace.rfind(write);
        return last != std::string::npos &&
               trace.compare(last + write.size(), number.size(), number) == 0;
    }
};

TEST_F(ToolsTest, InterruptedScoresStopTheMotor) {
    createDriver();
    start();
    const std::string file = mDirectory.path() + "/long";
    std::ofstream(file) << "on 60000\nwait 60000";
    for (const auto& [signal, isTwice] :
         {std::pair(SIGINT, false), std::pair(SIGTERM, false), std::pair(SIGINT, true)}) {
        const std::string errors = file + std::to_string(signal) + (isTwice ? "twice" : "");
        // A shell starts what runs in its background with some of these ignored.
        ::signal(signal, SIG_DFL);
        ChildProcess player;
        player.startProgram({"/bin/bash", "-c", "exec \"$0\" play \"$1\" --timeout 60 >\"$2\"",
                             VIBRATORCTL, file, errors + ".output"},
                            errors, {});
        ASSERT_TRUE(eventually([&] { return readFile(errors + ".output") == "on 60000: OK\n"; }));
        if (isTwice) ::kill(mService.pid(), SIGSTOP);
        ::kill(player.pid(), signal);
        ASSERT_TRUE(eventually([&, number = signal, again = isTwice] {
            if (again) ::kill(player.pid(), number);
            return !player.isAlive();
        }));
        if (isTwice) break;
        // In the first or the second line.
        const std::string said = readFile(errors);
        EXPECT_EQ(said.find("vibratorctl: play: interrupted at " + file + ":"), 0U) << said;
        EXPECT_NE(said.find(":1; the motor is stopped\n"), std::string::npos) << said;
        EXPECT_TRUE(wasTold("0"));
    }
}

TEST_F(ToolsTest, ExamplesCanBePlayed) {
    createDriver();
    start();
    size_t played = 0;
    for (const auto& file :
         std::filesystem::directory_iterator(SOURCE_DIRECTORY "/docs/examples")) {
        const Outcome outcome = run({"play", file.path()});
        EXPECT_EQ(outcome.exitCode, 0) << file.path() << outcome.errors;
        ++played;
    }
    EXPECT_GE(played, 3U);
}

TEST_F(ToolsTest, WatchShowsTheSameByTraceAndByLog) {
    createDriver({"--features", "intensity,haptic-engine,prebaked,fold,motor-name"});
    start();
    for (const char* call : {"on 500", "amplitude 128", "engine 1,2,3,4", "prebaked play 3",
                             "prebaked play 3 --repeat", "fold open", "frequency 1", "ladder"}) {
        runShell(std::string("\"$0\" ") + call);
    }
    // The log does not have the times, nor a final zero byte or newline of a text.
    const std::string same =
            " | sed -E 's/^ *[0-9]+\\.[0-9]+ +//; s/(\\\\0|\\\\n)\"/\"/' | grep ' write ' "
            "| sed 's/ENOENT/failed/'";
    const std::string byTrace = runShell("\"$0\" watch --all --once" + same).output;
    const std::string byLog =
            runShell("\"$0\" watch --log --all --once " + logFile() + same).output;
    EXPECT_EQ(byTrace.find("leds/state                      write    \"1\"  ok\n"), 0U) << byTrace;
    EXPECT_NE(byTrace.find("leds/cp_trigger_queue           write    \"3.100, 10, 0~\"  ok\n"),
              std::string::npos)
            << byTrace;
    // A text's write shows in the log only when the next begins.
    EXPECT_NE(byLog.find("leds/multi_freq                 write    \"1\"  failed\n"),
              std::string::npos)
            << byLog;
    EXPECT_EQ(byLog.substr(0, byLog.find("leds/multi_freq")), byTrace) << byLog;

    const std::string green = "\033[32m";
    const std::string watch = "watch --all --once";
    for (const char* unset : {"", "NO_COLOR="})
        EXPECT_NE(onTerminal(unset, watch).find(green), std::string::npos) << unset;
    EXPECT_EQ(onTerminal("NO_COLOR=1", watch).find(green), std::string::npos);
    EXPECT_EQ(run({"watch", "--all", "--once"}).output.find('\033'), std::string::npos);
}

TEST_F(ToolsTest, WatchFollowsAFileThatGrowsAndBeginsAnew) {
    const auto access = [](const std::string& time) {
        return time + " leds/state open O_RDWR = -1 ENOENT\n";
    };
    std::ofstream(traceFile()) << access("1.5") << "2.5 leds/state op";
    const std::string shown = mDirectory.path() + "/shown";
    ChildProcess watcher;
    watcher.startProgram({"/bin/bash", "-c", "exec \"$0\" watch --all >\"$1\"", VIBRATORCTL, shown},
                         mDirectory.path() + "/errors", {});
    const auto shows = [&](const std::string& text) {
        return eventually([&] { return readFile(shown).find(text) != std::string::npos; });
    };
    const std::string line = "  leds/state                      probe    ENOENT\n";
    EXPECT_TRUE(shows("         1.5" + line)) << readFile(shown);
    std::ofstream(traceFile(), std::ios::app) << "en O_RDWR = -1 ENOENT\n3.5 le";
    EXPECT_TRUE(shows("         2.5" + line)) << readFile(shown);
    std::ofstream(traceFile()) << access("0.5");
    EXPECT_TRUE(shows("         0.5" + line)) << readFile(shown);
    std::ofstream(traceFile() + "2") << access("7.5") << access("8.5") << access("9.5");
    std::filesystem::rename(traceFile() + "2", traceFile());
    EXPECT_TRUE(shows("         9.5" + line)) << readFile(shown);
    EXPECT_EQ(readFile(mDirectory.path() + "/errors"),
              "Waiting for accesses in " + traceFile() + "; Ctrl-C ends it.\n");

    const std::string strange = "1.5 le\x1b\xc2\x9b\xff open O_RDWR = -1 E\x07";
    EXPECT_EQ(run({"watch", "--once", "-"}, strange).output,
              "         1.5  le\\x1b\\xc2\\x9b\\xff              probe    E\\x07\n");
    const std::pair<Words, std::string> wrong[] = {
            {{"watch", "--once", "-"},
             "vibratorctl: watch: -: no trace of the driver; for a log give --log, too\n"},
            {{"watch", "--once", "--log", "-"}, "vibratorctl: watch: -: no log of the daemon\n"}};
    for (const auto& [words, complaint] : wrong)
        EXPECT_EQ(run(words, repeated("some text\n", 150)).errors, complaint);
}

TEST(AccessReaderTest, TellsTimesAndRefusals) {
    const std::string write = "QorVibrator-HAL2.1(  539): << writeNode node OK";
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
        AccessReader reader(true);
        reader.read(start +
                    "QorVibrator-HAL2.1(  539): >> writeNode node:/sys/class/leds/vibrator/state "
                    "val:1");
        const auto access = reader.read(start + write);
        ASSERT_TRUE(access) << start;
        EXPECT_EQ(access->clock, clock);
        EXPECT_DOUBLE_EQ(std::fmod(access->time, 86400), std::fmod(seconds, 86400)) << start;
    }
    const std::pair<std::string, std::string> refusals[] = {
            {"Pemission denied (2000)", ": not permitted to this uid"},
            {"daxGetAmplitudeList is abnormal 2", "daxGetAmplitudeList: out of range"},
            {"daxSetFolderStatus BAD_VALUE", "daxSetFolderStatus: out of range"},
            {"daxPerformHapticEngine packet size is exceed",
             "daxPerformHapticEngine: too many packets"},
            {"setExternalControl external control while vibrating. Not supported",
             "setExternalControl: the motor counts as running"},
            {"setAmplitude is impossible because of intensity",
             "setAmplitude: no control of the strength"},
            {"daxGetNumberOfPrebakedHapticPattern unsupports",
             "daxGetNumberOfPrebakedHapticPattern: the driver has none"},
            {"perform start effect : 12, strength : 1", "perform: no such effect"},
            {"perform_1_2 start effect : 0, strength : 1", "perform_1_2: no such effect"},
            {"perform start effect : 0, strength : 1", ""},
            {"daxSetFolderStatus starts", ""}};
    for (const auto& [message, refusal] : refusals) {
        for (const std::string start :
             {"E QorVibrator-HAL2.1: ", "E/QorVibrator-HAL2.1(  539): "}) {
            const auto access = AccessReader(true).read(start + message);
            ASSERT_EQ(access.has_value(), !refusal.empty()) << message;
            if (!access) continue;
            EXPECT_EQ(access->kind, NodeAccess::kRefusal);
            EXPECT_EQ(access->node + ": " + access->error, refusal);
            EXPECT_EQ(access->bytes, message);
        }
    }
}

/**
 * @return a timeline of accesses, like "250 activate 1; 260 ?intensity": a write at 250 ms, then a
 *     probe; -1 for those without a time.
 */
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
        text << mark.label << " at " << std::round(mark.time * 1000) << "; ";
    for (const Timeline::Segment& segment : timeline.segments) {
        const char* const kinds[] = {" run; ", " packet; ", " pattern; "};
        text << std::round(segment.start * 1000) << '-' << std::round(segment.end * 1000) << ' '
             << segment.strength * 100 << kinds[segment.kind];
    }
    return text.str() + (timeline.goesOn ? "goes on" : "");
}

TEST(TimelineTest, ShowsWhatTheDriverWasTold) {
    const std::pair<std::string, std::string> cases[] = {
            {"1000 enable 500", "on 500 at 0; 0-500 100 run"},
            {"1000 enable 500; 1250 enable 500; 1500 enable 0",
             "on 500 at 0; on 500 at 250; off at 500; 0-250 100 run; 250-500 100 run"},
            {"0 duration 500; 0 activate 1; 250 duration 900; 250 activate 1; 600 activate 0; 700 "
             "duration 0; 700 activate 1",
             "on 500 at 0; on 900 (running) at 250; off at 600; on 0 at 700; 0-500 100 run"},
            // A clock that is set back.
            {"500 enable 100; 900 enable 100; 0 multi_freq 1; 50 multi_freq 2",
             "on 100 at 0; on 100 at 400; frequency 1 at 400; frequency 2 at 450; 0-100 100 run; "
             "400-500 100 run"},
            {"0 enable 20; 1 ?intensity; 2 intensity 1379", "click light at 0; 0-20 13.79 run"},
            {"0 enable 20; 1 ?intensity; 2 intensity 5001; 2 intensity 10000",
             "click medium at 0; intensity 10000 at 2; 0-2 50.01 run; 2-20 100 run"},
            // Not a click: without the probe, another strength, another time, too late.
            {"0 enable 20; 2 intensity 10000; 100 enable 20; 101 ?intensity; 102 intensity 5040; "
             "200 enable 30; 201 ?intensity; 202 intensity 10000; 300 enable 20; 351 ?intensity; "
             "351 intensity 10000",
             "on 20 at 0; intensity 10000 at 2; on 20 at 100; amplitude 129 at 102; on 30 at 200; "
             "amplitude 255 at 202; on 20 at 300; amplitude 255 at 351; 0-2 100 run; 2-20 100 run; "
             "100-102 100 run; 102-120 50.4 run; 200-202 50.4 run; 202-230 100 run; 300-320 100 "
             "run"},
            {"0 intensity 5000; 0 enable 500; 250 ?intensity; 250 intensity 2500",
             "intensity 5000 at 0; on 500 at 0; intensity 2500 at 250; 0-250 50 run; 250-500 25 "
             "run"},
            {"0 haptic_engine 8 125 5000 0 0 250 20000 0 0; 9 enable 1; 100 enable 0",
             "engine, 2 packets at 0; off at 100; 9-100 50 packet"},
            {"0 haptic_engine 4 -1 -5 0 0; 0 enable 7",
             "engine, 1 packet at 0; on 7 at 0; 0-0 0 packet"},
            {"0 duration 900; 0 activate 1; 9 haptic_engine 4 30 20000 0 0; 9 duration 1; 9 "
             "activate 1",
             "on 900 at 0; engine, 1 packet at 9; 0-9 100 run; 9-39 200 packet"},
            {"0 intensity 5000; 1 cp_trigger_index 7; 2 enable 1000",
             "pattern 7 at 0; 2-1002 50 pattern"},
            {"0 cp_trigger_index 7; 2 enable 900; 2000 cp_trigger_index 0; 2000 enable 1000",
             "pattern 7 at 0; on 900 at 2; pattern 0 at 2000; on 1000 at 2000; 2-902 100 pattern; "
             "2000-3000 100 run"},
            {"0 intensity 5000; 60 cp_trigger_index 65534; 60 cp_trigger_queue 3.25, 10, 0~; 61 "
             "enable 1000; 500 enable 0; 500 enable 20",
             "intensity 5000 at 0; pattern 3 repeat at 60; off at 500; on 20 at 500; 61-500 25 "
             "pattern; 500-520 50 run"},
            {"0 cp_trigger_queue 3.25, 10, 0~; 0 cp_trigger_index 7; 0 enable 1000",
             "pattern 3 repeat at 0; pattern 7 at 0; 0-1000 100 pattern"},
            {"0 ext_control 1; 0 ext_control 0; 0 force_touch_intensity 9; 0 event_cmd "
             "FOLDER_OPEN; 0 event_cmd FOLDER_CLOSE",
             "external on at 0; external off at 0; force-touch 9 at 0; fold open at 0; fold close "
             "at 0"},
            {"0 enable 61100", "on 61100 at 0; 0-1000 100 run; goes on"},
            {"0 enable 59000", "on 59000 at 0; 0-59000 100 run"},
            {"0 enable 9; 100000 enable 99000; 100000 intensity 1",
             "on 9 at 0; on 99000 at 100000; intensity 1 at 100000; 0-9 100 run; 100000-199000 "
             "0.01 run"},
            // Without times, each call follows the one before.
            {"-1 enable 20; -1 ?intensity; -1 intensity 1379; -1 enable 500; -1 intensity 5000; -1 "
             "enable 5000; -1 enable 0",
             "click light at 0; on 500 at 40; intensity 5000 at 60; on 5000 at 560; off at 1560; "
             "0-20 13.79 run; 40-60 13.79 run; 60-540 50 run; 560-1560 50 run"},
    };
    for (const auto& [accesses, words] : cases) {
        const std::string shown = inWords(timelineOf(accesses));
        EXPECT_EQ(shown.substr(0, shown.find_last_not_of("; ") + 1), words) << accesses;
    }
    Timeline part = timelineOf("0 enable 100; 200 enable 100; 400 enable 100");
    cut(&part, 0.25, 0.45);
    EXPECT_EQ(inWords(part), "on 100 at 400; 250-300 100 run; 400-450 100 run; goes on");
    EXPECT_DOUBLE_EQ(part.start + part.end, 0.7);
    part = timelineOf("0 enable 100; 200 enable 100000");
    cut(&part, 0, 10);
    EXPECT_TRUE(part.goesOn) << "as before";
    cut(&part, 0, 0.15);
    EXPECT_EQ(inWords(part), "on 100 at 0; 0-100 100 run; ");
}

/** @return what a script or a picture has between two texts, the first ones. */
std::string between(const std::string& text, const std::string& start, const std::string& end) {
    const size_t found = text.find(start);
    if (found == std::string::npos) return "no " + start;
    const size_t first = found + start.size();
    return text.substr(first, text.find(end, first) - first);
}

/** @return a block of the data that gnuplot gets. */
std::string dataOf(const Timeline& timeline, const std::string& name) {
    return between(plotScript(timeline, PictureFormat::kSvg), "$" + name + " << END\n", "END\n");
}

/** @return the texts in a picture. */
std::multiset<std::string> textsOf(const pugi::xml_node& picture) {
    std::multiset<std::string> texts;
    for (const auto& each : picture.select_nodes("//text"))
        texts.insert(each.node().first_child().value() +
                     std::string(each.node().child_value("tspan")));
    return texts;
}

TEST(PlotTest, ScriptHasEverythingInItsPlace) {
    const Timeline timeline = timelineOf(
            "-1 enable 100; -1 haptic_engine 8 3 20000 0 0 100 5000 0 0; -1 enable 1; "
            "-1 cp_trigger_index 4; -1 enable 300; -1 enable 20; -1 intensity 20000; "
            "-1 enable 90000");
    EXPECT_EQ(between(plotScript(timeline, PictureFormat::kSvg), "", "# "), R"(terminal = 'svg'
title = 'What the driver was told: 7 calls in 1.623 s'
note = 'The log has no times: each call is drawn after the one before.'
start = 0
length = 1.63923
columns = 796
going_on = 100
$calls << END
0
0.12
0.243
0.263
0.583
0.603
0.623
END
$labels << END
0 on 100
0.12 engine, 2 packets
0.243 pattern 4, on 300
0.583 on 20, intensity 20000 +1
END
$run << END
0 0.0989703329 0 100
0.583 0.601970333 0 100
0.623 1.62197033 0 100
END
$packet << END
0.12 0.123 0 100
0.123 0.221970333 0 50
END
$pattern << END
0.263 0.561970333 0 100
END
$beyond << END
0.12 0.123 96 100
0.623 1.62197033 96 100
END
)");
    EXPECT_EQ(plotScript(timeline, PictureFormat::kPng).find("terminal = 'pngcairo "), 0U);
}

TEST(PlotTest, AxesSuitTheLength) {
    const std::tuple<double, std::string, std::string> cases[] = {
            {0.019, "14", "ms"},     {1.9, "1800", "ms"},       {1.99, "1.5", "s"},
            {118, "80", "s"},        {119, "01:45", "min:s"},   {7000, "110:00", "min:s"},
            {7200, "1:45", "h:min"}, {200000, "48:00", "h:min"}};
    for (const auto& [length, tic, title] : cases) {
        Timeline timeline;
        timeline.marks.push_back({0, "off"});
        timeline.end = length;
        pugi::xml_document svg;
        ASSERT_TRUE(svg.load_string(drawPicture(timeline, PictureFormat::kSvg).c_str()));
        const auto texts = textsOf(svg);
        EXPECT_EQ(texts.count("time in " + title), 1U) << length;
        EXPECT_EQ(texts.count(tic), 1U) << length << testing::PrintToString(texts);
    }
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

TEST(PlotTest, TextFitsTheColumns) {
    const Timeline timeline = timelineOf(
            "0 enable 100; 200 haptic_engine 4 100 20000 0 0; 200 enable 1; 300 intensity 1250; "
            "300 enable 100000");
    const std::string wanted =
            "What the driver was told: 4 calls in 1.3 s\n"
            "100 % ██  !!                    \n"
            " 80 % ██  ██                    \n"
            " 60 % ██  ██                    \n"
            " 40 % ██  ██                    \n"
            " 20 % ██  ██▅▅▅▅▅▅▅▅▅▅▅▅▅▅▅▅▅▅▅▅\n"
            "      |---|-|------------------>\n"
            "      0 ms                 1.3 s\n"
            "      > goes on\n"
            "      ! beyond full strength\n"
            "\n"
            "        0 ms  on 100\n"
            "      200 ms  engine, 1 packet\n"
            "      300 ms  intensity 1250\n"
            "      300 ms  on 100000\n";
    EXPECT_EQ(plotText(timeline, 32), wanted);
    Timeline part = timelineOf("0 enable 100; 200 enable 100");
    cut(&part, 0.15, 0.25);
    EXPECT_NE(plotText(part, 26).find("\n 20 %           ██████████\n      ----------|-------->\n"),
              std::string::npos)
            << plotText(part, 26);
    std::string many;
    for (int i = 0; i < 42; ++i)
        many += std::to_string(i * 60000) + " enable 0; ";
    const std::string text = plotText(timelineOf(many), 0);
    EXPECT_NE(text.find("\n   38:00 min  off\n   39:00 min  off\n  and 2 more calls;"),
              std::string::npos)
            << text;
    EXPECT_NE(text.find("|\n      0 ms       41:00 min\n\n"), std::string::npos) << text;
    EXPECT_NE(plotText(timelineOf("-1 enable 5"), 80).find("The log has no times"),
              std::string::npos);
}

TEST_F(ToolsTest, PicturesShowTheCallsInTheirPlaces) {
    // Times, nodes and what they are told; a question mark is a probe.
    std::istringstream accesses(
            "8 duration 200,8 activate 1,"
            "8.3 duration 20,8.3 activate 1,8.3 intensity ?,8.3 intensity 1379,"
            "8.305 haptic_engine 4 100 20000 0 0,8.305 duration 1,8.305 activate 1,"
            "8.505 intensity 10000,8.505 cp_trigger_index 3,8.505 duration 1000,8.505 activate 1");
    std::string trace;
    for (std::string time, node, text; accesses >> time >> node >> std::ws;) {
        std::getline(accesses, text, ',');
        const std::string begin = time + " leds/" + node;
        trace += begin + " open O_RDWR = 0\n";
        if (text != "?")
            trace += begin + " write \"" + text + "\\n\" = " + std::to_string(text.size() + 1) +
                     '\n';
        trace += begin + " close = 0\n";
    }
    pugi::xml_document svg;
    ASSERT_TRUE(svg.load_string(run({"plot", "-", "-o", "-"}, trace).output.c_str()));
    const pugi::xml_node root = svg.child("svg");
    EXPECT_EQ(root.child_value("title"),
              std::string("What the driver was told: 4 calls in 1.505 s"));
    EXPECT_EQ(root.child_value("desc"),
              std::string("Strength over time: on 200 at 0 ms; click light at 300 ms; engine, 1 "
                          "packet at 305 ms; pattern 3 at 505 ms."));
    EXPECT_NE(std::string(root.child_value("style")).find("dark"), std::string::npos);
    const auto texts = textsOf(svg);
    for (const char* text :
         {"on 200", "click light +1", "pattern 3", "motor on", "haptic engine packets",
          "stored pattern", "beyond full strength", "strength in %", "time in ms"}) {
        EXPECT_EQ(texts.count(text), 1U) << text;
    }
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

TEST_F(ToolsTest, PlotsGoToFilesAndToTheTerminal) {
    createDriver();
    start();
    run({"play", "-"}, "on 100\nwait 50\noff");
    const std::string plot = mDirectory.path() + "/plot";
    std::filesystem::create_symlink(plot + ".svg", plot + "2.svg");
    std::ofstream(plot + ".svg") << "older and other";
    chmod((plot + ".svg").c_str(), 0600);
    const struct {
        Words options;
        std::string file;
        std::string start;
    } good[] = {{{"-o", plot + "2.svg"}, plot + ".svg", "<?xml"},
                {{"-o", plot + ".png"}, plot + ".png", "\x89PNG"},
                {{"-o", plot, "--format", "png"}, plot, "\x89PNG"}};
    for (const auto& [options, file, beginning] : good) {
        Words words = {"plot"};
        words.insert(words.end(), options.begin(), options.end());
        const Outcome outcome = run(words);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
        EXPECT_EQ(readFile(file).find(beginning), 0U) << file;
    }
    struct stat info = {};
    EXPECT_EQ(stat((plot + ".svg").c_str(), &info), 0);
    EXPECT_EQ(info.st_mode & 0777U, 0600U);

    const std::string text = run({"plot", traceFile()}).output;
    EXPECT_NE(text.find("  off\n"), std::string::npos) << text;
    EXPECT_EQ(run({"plot", "-"}, readFile(traceFile())).output, text);
    std::string shown = onTerminal("", "plot");
    shown.erase(std::remove(shown.begin(), shown.end(), '\r'), shown.end());
    EXPECT_EQ(shown, text) << "80 columns there, too";
    EXPECT_NE(run({"plot", "--log", logFile()}).output.find("The log has no times"),
              std::string::npos);
    EXPECT_EQ(run({"plot", "--from", "1ms"}).output.find("What the driver was told: 1 call in "),
              0U);
    EXPECT_EQ(
            run({"plot", "--to", "0.001s"}).output.find("What the driver was told: 1 call in 1 ms"),
            0U);
    EXPECT_EQ(
            run({"plot", "--last", "1ms"}).output.find("What the driver was told: 1 call in 1 ms"),
            0U);

    mkfifo((plot + ".fifo.svg").c_str(), 0600);
    std::filesystem::create_symlink(traceFile(), plot + "3.svg");
    const std::string noTime = " is not a time like 10s, 500ms, 2m or 1h";
    const std::pair<Words, std::string> bad[] = {
            {{"plot", "-o", "/tmp/x.gif"}, "plot: /tmp/x.gif: neither .svg nor .png"},
            {{"plot", "-o", "/no/such/x.svg"},
             "plot: /no/such/x.svg: cannot be written: No such file"},
            {{"plot", "-o", plot + ".fifo.svg"},
             "is no regular file; -o - writes to standard output"},
            {{"plot", "-o", "/dev/full", "--format", "svg"}, "is no regular file"},
            {{"plot", "-o", plot + "3.svg"}, "3.svg: is the input, too"},
            {{"plot", "--from", "10"}, "--from: \"10\"" + noTime},
            {{"plot", "--to", "1.5.5s"}, "--to: \"1.5.5s\"" + noTime},
            {{"plot", "--to", "ms"}, "--to: \"ms\"" + noTime},
            {{"plot", "--last", "1s", "--to", "1s"}, "--last goes with neither --from nor --to"},
            {{"plot", "--from", "1h"}, "nothing in that time"},
            {{"plot", "--log"}, "no FILE"},
            {{"plot", "/no/such"}, "cannot be read"},
            {{"plot", "/proc/version"}, "/proc/version: no write to the driver in it"},
            {{"watch", "/no/such"}, "cannot be read"},
            {{"watch", "/tmp"}, "cannot be read"},
            {{"watch", "--all", "/dev/zero"}, "a line of more than 1 MiB"},
            {{"watch", "--log"}, "no FILE"},
            {{"play", "/no/such"}, "cannot be read"}};
    for (const auto& [words, complaint] : bad) {
        const Outcome outcome = run(words);
        EXPECT_EQ(outcome.exitCode, words.size() > 2 && words[2] == "/no/such/x.svg" ? 1 : 2)
                << complaint;
        EXPECT_NE(outcome.errors.find(complaint), std::string::npos) << outcome.errors;
    }
    const Outcome full = runShell("\"$0\" plot -o - >/dev/full");
    EXPECT_EQ(full.exitCode, 1);
    EXPECT_NE(full.errors.find("standard output cannot be written"), std::string::npos);
    const Outcome missing = runShell("PATH= \"$0\" plot -o /tmp/x.svg");
    EXPECT_EQ(missing.exitCode, 1);
    EXPECT_NE(missing.errors.find("install the package gnuplot-nox"), std::string::npos);
}

}  // namespace
