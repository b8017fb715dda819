// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"
#include "support/ServiceTest.h"

#include <sys/stat.h>

#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>
#include <sstream>

namespace {

using Words = std::vector<std::string>;

class ToolsTest : public ServiceTest {
  protected:
    static Outcome run(Words words, const std::string& input = {}) {
        words.insert(words.begin(), VIBRATORCTL);
        return runProgram(words, geteuid(), input);
    }
    static Outcome runShell(const std::string& command) {
        return runProgram({"/bin/bash", "-c", command, VIBRATORCTL});
    }
    std::string nodeFile(const std::string& leaf) const {
        return mDirectory.path() + "/sys/class/leds/vibrator/" + leaf;
    }
    std::string traceFile() const { return mDirectory.path() + "/trace"; }
};

TEST_F(ToolsTest, MistakesInAScoreAreNamedBeforeTheFirstCall) {
    const std::pair<std::string, std::string> cases[] = {
            {"clik",
             "-:1:1: \"clik\" is none of click, on, off, wait, amplitude, intensity, "
             "pattern, engine\n"},
            {"off\n\n  on", "-:3:5: a time in ms from 1 to 2147483647 is missing\n"},
            {"on 0", "-:1:4: \"0\" is not a time in ms from 1 to 2147483647\n"},
            {"wait -1", "-:1:6: \"-1\" is not a time in ms from 0 to 3600000\n"},
            {"amplitude 256 # too much", "-:1:11: \"256\" is not an amplitude from 1 to 255\n"},
            {"click\tloud", "-:1:7: \"loud\" is none of light, medium, strong\n"},
            {"off now", "-:1:5: \"now\" is one word too many\n"},
            {"pattern 1 repeat 5", "-:1:18: \"5\" is one word too many\n"},
            {"engine 5", "-:1:9: packets are missing\n"},
            {"engine 5 1,2,3", "-:1:10: \"1,2,3\" is not PARAM0,INTENSITY,PARAM2,PARAM3\n"},
            {"engine 5 1,2,3,100000000",
             "-:1:10: \"1,2,3,100000000\" has a value of more than 8 characters\n"},
            {"on x\noff\nintensity 10001",
             "-:1:4: \"x\" is not a time in ms from 1 to 2147483647\n"
             "-:3:11: \"10001\" is not an intensity from 1 to 10000\n"},
            {"# nothing\r\n\r\nclick strong\r\npattern 0 1 repeat\nwait 0\nengine 1 1,2,3,4 "
             "-1,0,0,0",
             ""}};
    for (const auto& [score, errors] : cases) {
        const Outcome outcome = run({"play", "--check", "-"}, score);
        EXPECT_EQ(outcome.errors, errors);
        EXPECT_EQ(outcome.exitCode, errors.empty() ? 0 : 2) << score;
    }
    createDriver();
    start();
    EXPECT_EQ(run({"play", "-"}, "on 5\non x").exitCode, 2);
    EXPECT_EQ(node("duration"), "0\n");
    // A refused call ends the play.
    runProgram({VIBRATOR_SIM, "fault", "intensity", "write", "EIO"});
    EXPECT_EQ(run({"play", "-"}, "on 5\nintensity 7\non 9").exitCode, 1);
    EXPECT_EQ(node("duration"), "5\n");
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

TEST_F(ToolsTest, DoctorFindsWhatIsWrong) {
    const struct {
        Words features;
        std::string harm;
        std::string layout;
        std::string problem;
    } cases[] = {
            {{}, "true", "LED trigger", ""},
            {{}, "rm activate", "none", "offers no vibrator driver"},
            {{}, "rm activate; touch trigger", "none", "has no transient trigger"},
            {{}, "chmod 0444 state", "none", "state cannot be opened for reading and writing"},
            {{}, "chmod 0444 intensity", "LED trigger", "cannot write it"},
            {{}, "echo FOO > motor_type", "LED trigger", "\"FOO\", is of no use"},
            {{}, "echo 1 > ext_control", "LED trigger", "external control is on"},
            {{}, "echo 500 > duration", "LED trigger", "external control is refused"},
            {{"--layout", "timed"}, "true", "timed output", "has both layouts"},
    };
    start();
    for (const auto& [features, harm, layout, problem] : cases) {
        SCOPED_TRACE(harm);
        std::filesystem::remove_all(mDirectory.path() + "/sys");
        createDriver();
        if (!features.empty()) createDriver(features);
        ASSERT_EQ(runShell("cd " + nodeFile("") + " && " + harm).exitCode, 0);
        const Outcome outcome = run({"doctor"});
        EXPECT_EQ(outcome.exitCode, problem.empty() ? 0 : 1) << outcome.output;
        EXPECT_EQ(outcome.output.find("layout:   " + layout + "\n"), 0U) << outcome.output;
        EXPECT_NE(outcome.output.find(problem.empty() ? "nothing is wrong" : problem),
                  std::string::npos)
                << outcome.output;
    }
}

TEST_F(ToolsTest, DoctorAgreesWithTheService) {
    const Words motors = {"LINEAR_1040", "COINDC_PMIC", "LINEAR_1030", "COINDC", "unknown"};
    const Words features = {"intensity,motor-name",
                            "haptic-engine,motor-name",
                            "prebaked",
                            "prebaked,haptic-engine",
                            "haptic-engine",
                            "intensity",
                            "none"};
    for (const std::string& motor : motors) {
        for (const std::string& some : features) {
            SCOPED_TRACE(motor + " " + some);
            createDriver({"--motor", motor, "--features", some});
            start();
            const auto found = nlohmann::json::parse(run({"doctor", "--json"}).output);
            EXPECT_EQ(found["service"], "answers");
            const auto known = nlohmann::json::parse(run({"motor", "--json"}).output);
            EXPECT_EQ(found["ladders"]["0"], known["ladder0"]);
            EXPECT_EQ(found["ladders"]["1"], known["ladder1"]);
            EXPECT_NE(log().find("daxGetAmplitudeList type: 0 : " +
                                 found["motor"]["number"].dump() + "\n"),
                      std::string::npos);
            std::filesystem::remove(logFile());
            mService.kill();
        }
    }
    createDriver();
    const auto alone = nlohmann::json::parse(run({"doctor", "--json"}).output);
    EXPECT_EQ(alone["motor"]["number"], 7);
    EXPECT_EQ(alone["findings"].size(), 1U) << "only that there is no service";
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
    EXPECT_EQ(byTrace.find("leds/state                      write  \"1\"  ok\n"), 0U) << byTrace;
    EXPECT_NE(byTrace.find("leds/cp_trigger_queue           write  \"3.100, 10, 0~\"  ok\n"),
              std::string::npos)
            << byTrace;
    // A text's write shows in the log only when the next begins.
    EXPECT_NE(byLog.find("leds/multi_freq                 write  \"1\"  failed\n"),
              std::string::npos)
            << byLog;
    EXPECT_EQ(byLog.substr(0, byLog.find("leds/multi_freq")), byTrace) << byLog;

    const std::string onTerminal = "script -qec '\"$0\" watch --all --once' /dev/null";
    const auto colours = [&](const std::string& setting) {
        return runShell("export W=\"$0\"; " + setting +
                        " script -qec '\"$W\" watch --all --once' /dev/null")
                       .output.find("\033[32m") != std::string::npos;
    };
    EXPECT_TRUE(colours(""));
    EXPECT_FALSE(colours("NO_COLOR=1"));
    EXPECT_EQ(run({"watch", "--all", "--once"}).output.find('\033'), std::string::npos);
}

/** @return the segments of a timeline, in ms and %, like "0-20 100 run". */
Words inWords(const Timeline& timeline) {
    Words words;
    for (const Timeline::Segment& segment : timeline.segments) {
        std::ostringstream text;
        const char* const kinds[] = {"run", "packet", "pattern"};
        text << segment.start * 1000 << '-' << segment.end * 1000 << ' ' << segment.strength * 100
             << ' ' << kinds[segment.kind] << segment.label;
        words.push_back(text.str());
    }
    return words;
}

TEST(TimelineTest, ShowsWhatTheDriverDoes) {
    using Writes = std::vector<std::pair<double, std::string>>;
    const struct {
        Writes writes;
        Words segments;
    } cases[] = {
            {{{1, "enable 500"}}, {"0-500 100 run"}},
            {{{1, "enable 500"}, {1.25, "enable 500"}, {1.5, "enable 0"}},
             {"0-250 100 run", "250-500 100 run"}},
            {{{0, "duration 500"}, {0, "activate 1"}, {0.25, "duration 900"}, {0.25, "activate 1"}},
             {"0-500 100 run"}},
            {{{0, "intensity 5000"}, {0, "enable 500"}, {0.25, "intensity 2500"}},
             {"0-250 50 run", "250-500 25 run"}},
            {{{0, "haptic_engine 8 125 5000 0 0 250 10000 0 0"}, {0, "enable 1"}},
             {"0-125 50 packet", "125-375 100 packet"}},
            {{{0, "intensity 5000"}, {0, "cp_trigger_index 7"}, {0, "enable 1000"}},
             {"0-1000 50 patternpattern 7"}},
            {{{0, "cp_trigger_index 65534"},
              {0, "cp_trigger_queue 3.25, 10, 0~"},
              {0, "enable 1000"},
              {0.5, "enable 0"}},
             {"0-500 25 patternpattern 3"}},
            {{{0, "enable 2000000000"}}, {"0-1000 100 run"}},
    };
    for (const auto& [writes, segments] : cases) {
        std::vector<NodeAccess> accesses;
        for (const auto& [time, write] : writes) {
            const size_t blank = write.find(' ');
            accesses.push_back({time, "leds/" + write.substr(0, blank), NodeAccess::kWrite,
                                write.substr(blank + 1) + "\n", ""});
        }
        // What the driver has not taken counts for nothing.
        accesses.push_back({2, "leds/enable", NodeAccess::kWrite, "700\n", "EINVAL"});
        EXPECT_EQ(inWords(makeTimeline(accesses)), segments) << writes[0].second;
    }
}

TEST_F(ToolsTest, LabelsOfAPlotDoNotOverlap) {
    Timeline timeline;
    for (int i = 0; i < 60; ++i) {
        timeline.marks.push_back({i * i * 0.001, "intensity " + std::to_string(i * i)});
        timeline.length = timeline.marks.back().time;
    }
    pugi::xml_document svg;
    ASSERT_TRUE(svg.load_string(plotSvg(timeline).c_str()));
    EXPECT_STREQ(svg.child("svg").attribute("width").value(), "1200");
    std::map<std::string, double> laneEnds;
    size_t labels = 0;
    for (const pugi::xml_node& text : svg.child("svg").children("text")) {
        if (std::string(text.attribute("class").value()) != "call") continue;
        const double start = text.attribute("x").as_double();
        double& end = laneEnds[text.attribute("y").value()];
        EXPECT_GE(start, end) << text.child_value();
        end = start + 7.8 * static_cast<double>(strlen(text.child_value()));
        EXPECT_LE(end, 1200) << text.child_value();
        ++labels;
    }
    EXPECT_GT(labels, 20U);
}

TEST_F(ToolsTest, PlotsGoToFilesAndToTheTerminal) {
    createDriver();
    start();
    run({"play", "-"}, "on 100\nwait 50\nengine 10000 10,5000,0,0\npattern 3");
    for (const std::string ending : {"svg", "png"}) {
        const std::string file = mDirectory.path() + "/plot." + ending;
        const Outcome outcome = run({"plot", traceFile(), "-o", file});
        const std::string drawing = readFile(file);
        if (ending == "png" && outcome.errors.find("built without") != std::string::npos) continue;
        EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
        EXPECT_NE(drawing.find(ending == "svg" ? "strength in %" : "PNG"), std::string::npos);
    }
    const std::string text = run({"plot", traceFile()}).output;
    EXPECT_NE(text.find(" s  on 100\n"), std::string::npos) << text;
    EXPECT_NE(text.find(" s  pattern 3\n"), std::string::npos) << text;
    EXPECT_EQ(run({"plot", "-"}, readFile(traceFile())).output, text);
    const std::pair<Words, std::string> bad[] = {
            {{"plot", traceFile(), "-o", "/tmp/x.gif"}, "neither .svg nor .png"},
            {{"plot", traceFile(), "-o", "/no/such/x.svg"}, "cannot be written"},
            {{"plot", "/no/such"}, "cannot be read"},
            {{"plot", "/proc/version"}, "no write that a driver has taken"},
            {{"watch", "/no/such"}, "cannot be read"},
            {{"watch", "--log"}, "no FILE"},
            {{"play", "/no/such"}, "cannot be read"},
            {{"completion", "fish"}, "fish not in"}};
    for (const auto& [words, complaint] : bad) {
        const Outcome outcome = run(words);
        EXPECT_EQ(outcome.exitCode, 2) << complaint;
        EXPECT_NE(outcome.errors.find(complaint), std::string::npos) << outcome.errors;
    }
}

TEST_F(ToolsTest, ShellsCompleteCommandsAndOptions) {
    const std::pair<std::string, std::string> cases[] = {
            {"pl", "plot play"},
            {"prebaked ", "count play --help --instance --json"},
            {"prebaked play --r", "--repeat"},
            {"--json fold --h", "--help"},
            {"on 500 --j", "--json"}};
    for (const auto& [typed, completed] : cases) {
        const Outcome outcome = runShell(
                "source <(\"$0\" completion bash); read -ra words <<<'vibratorctl " + typed +
                "|'; COMP_WORDS=(\"${words[@]/|/}\"); COMP_CWORD=$((${#words[@]} - 1)); "
                "_vibratorctl; echo ${COMPREPLY[@]}");
        EXPECT_EQ(outcome.output, completed + "\n") << outcome.errors;
    }
    EXPECT_EQ(runShell("\"$0\" completion zsh | { ! command -v zsh || zsh -n; }").exitCode, 0);
}

}  // namespace
