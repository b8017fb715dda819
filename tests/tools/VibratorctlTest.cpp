// SPDX-License-Identifier: Apache-2.0
#include "support/ServiceTest.h"

#include <fstream>
#include <nlohmann/json.hpp>
#include <sstream>

namespace {

class VibratorctlTest : public ServiceTest {
  protected:
    /** Runs the client with the words of a command line. */
    static Outcome run(const std::string& line, uid_t uid = geteuid(),
                       const std::string& input = {}) {
        std::istringstream words(line);
        std::vector<std::string> command = {VIBRATORCTL};
        for (std::string word; words >> word;)
            command.push_back(word);
        return runProgram(command, uid, input);
    }
};

constexpr char kByTheDriver[] =
        ": UNKNOWN_ERROR: the driver has not taken it; the service's log "
        "says why\n";

TEST_F(VibratorctlTest, EveryOperationCanBeCalled) {
    createDriver();
    start();
    const std::string prebaked = "daxPerformPrebakedHapticPattern: OK\n";
    const std::string ladder = "daxGetAmplitudeList: OK\nladder: 0 ";
    const struct {
        const char* line;
        std::string output;
        const char* leaf;
        std::string value;
    } cases[] = {
            {"on 500", "on: OK\n", "duration", "500\n"},
            {"off", "off: OK\n", "activate", "0\n"},
            {"amplitude 128", "setAmplitude: OK\n", "intensity", "5001\n"},
            {"click --strength strong", "perform: OK\nlengthMs: 20\n", "intensity", "10000\n"},
            {"effect 0 --strength light", "perform: OK\nlengthMs: 20\n", "intensity", "1379\n"},
            {"intensity 7", "daxSetAmplitude: OK\n", "intensity", "7\n"},
            {"force-touch 8", "daxSetForceTouchAmplitude: OK\n", "force_touch_intensity", "8\n"},
            {"frequency 4", "daxSetFrequencyType: OK\n", "multi_freq", "4\n"},
            {"prebaked play 5 --amplitude 99", prebaked, "cp_trigger_index", "5\n"},
            {"prebaked play 3 --repeat", prebaked, "cp_trigger_queue", {"3.100, 10, 0~\0", 14}},
            {"engine 10,5000,150,0 --amplitude 5000", "daxPerformHapticEngine: OK\n",
             "haptic_engine", "4 10 2500 150 0\n"},
            {"engine -- -5,1,2,3", "daxPerformHapticEngine: OK\n", "haptic_engine", "4 -5 1 2 3\n"},
            {"fold close", "daxSetFolderStatus: OK\n", "event_cmd", "FOLDER_CLOSE\n"},
            {"fold open", "daxSetFolderStatus: OK\n", "event_cmd", "FOLDER_OPEN\n"},
            {"on 0", "on: OK\n", "duration", "0\n"},
            {"external on", "setExternalControl: OK\n", "ext_control", "1\n"},
            {"external off", "setExternalControl: OK\n", "ext_control", "0\n"},
            {"prebaked count", "daxGetNumberOfPrebakedHapticPattern: OK\ncount: 12\n", "num_waves",
             "12\n"},
            {"ladder", ladder + "3000 4000 6000 8000 10000\n", "motor_type", "LINEAR_1040\n"},
            {"ladder --type 1", ladder + "2000 4000 6000 8000 10000\n", "motor_type",
             "LINEAR_1040\n"},
            {"motor",
             "ladder0: 0 3000 4000 6000 8000 10000\nladder1: 0 2000 4000 6000 8000 10000\n"
             "enhancedPatterns: yes\n",
             "motor_type", "LINEAR_1040\n"},
    };
    for (const auto& each : cases) {
        const Outcome outcome = run(each.line);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
        EXPECT_EQ(outcome.output, each.output);
        EXPECT_EQ(outcome.errors, "");
        EXPECT_EQ(node(each.leaf), each.value) << each.line;
    }
}

TEST_F(VibratorctlTest, RefusalsAreExplained) {
    createDriver({"--motor", "COINDC"});
    start();
    const std::string denied =
            ": the caller is not permitted: uid 2000 is neither 0 (root) nor 1000 (system)\n";
    const std::string unsupported = ": UNSUPPORTED_OPERATION: not supported here and now\n";
    const std::string range = ": BAD_VALUE: out of range: ";
    const struct {
        const char* line;
        uid_t uid;
        std::string errors;
    } cases[] = {
            {"on 4294967295", 0, std::string("on") + kByTheDriver},
            {"amplitude 0", 0, "setAmplitude" + range + "1 to 255\n"},
            {"intensity 10001", 0, "daxSetAmplitude" + range + "1 to 10000\n"},
            {"frequency 5", 0, "daxSetFrequencyType" + range + "0 to 4\n"},
            {"effect 3 --version 1.2", 0, "perform" + unsupported},
            {"ladder", 0, "daxGetAmplitudeList" + unsupported},
            {"ladder --type 2", 0, "daxGetAmplitudeList" + range + "the type is 0 or 1\n"},
            {"engine 100000000,1,1,1", 0,
             "daxPerformHapticEngine" + range +
                     "at most 339 packets, an amplitude of 1 to 10000, values of at most 8 "
                     "characters\n"},
            {"click --strength 1", 2000, ""},
            {"amplitude 5", 2000, "setAmplitude: UNSUPPORTED_OPERATION" + denied},
            {"fold open", 2000, "daxSetFolderStatus: UNKNOWN_ERROR" + denied},
            {"prebaked count", 2000, "daxGetNumberOfPrebakedHapticPattern: UNKNOWN_ERROR" + denied},
    };
    for (const auto& each : cases) {
        if (each.uid != 0 && geteuid() != 0) continue;
        const Outcome outcome = run(each.line, each.uid != 0 ? each.uid : geteuid());
        EXPECT_EQ(outcome.exitCode, each.errors.empty() ? 0 : 1) << each.line;
        EXPECT_EQ(outcome.errors, each.errors);
    }
}

TEST_F(VibratorctlTest, CommandLinesThatMakeNoSenseAreUsageErrors) {
    const std::pair<const char*, const char*> cases[] = {
            {"", "A subcommand is required"},
            {"dance", "A subcommand is required"},
            {"on", "MS is required"},
            {"on -5", "MS = -5"},
            {"on 4294967296", "MS = 4294967296"},
            {"on soon", "MS = soon"},
            {"on 1.5", "MS = 1.5"},
            {"amplitude 256", "Value 256 not in range"},
            {"external maybe", "maybe not in {on,off}"},
            {"fold half", "half not in {open,close}"},
            {"prebaked", "A subcommand is required"},
            {"engine", "no packets"},
            {"engine 1,2,3", "\"1,2,3\" is not PARAM0,INTENSITY,PARAM2,PARAM3"},
            {"engine 1,2,3,4,5", "is not PARAM0"},
            {"engine 1,2,x,4", "\"x\" is no whole number of 32 bits"},
            {"engine 1,2,3,2147483648", "\"2147483648\" is no whole number of 32 bits"},
            {"engine --file /no/such/file", "/no/such/file: cannot be read"},
            {"engine --file /tmp", "/tmp: cannot be read"},
    };
    for (const auto& [line, complaint] : cases) {
        const Outcome outcome = run(line);
        EXPECT_EQ(outcome.exitCode, 2) << complaint;
        EXPECT_NE(outcome.errors.find(complaint), std::string::npos) << outcome.errors;
    }
}

TEST_F(VibratorctlTest, PacketsComeFromFilesOfEitherKind) {
    createDriver();
    start();
    const struct {
        std::string text;
        std::string line;
    } good[] = {
            {"10,5000,150,0\n20,10000,200,1\n", "8 10 5000 150 0 20 10000 200 1\n"},
            {"# a comment\r\n\r\n 1 , 2 , 3 , -4 \r\n", "4 1 2 3 -4\n"},
            {"", "0\n"},
            {"[[1,2,3,4],[5,6,7,8]]", "8 1 2 3 4 5 6 7 8\n"},
            {" [{\"param0\":1,\"intensity\":2,\"param2\":3,\"param3\":-4}] ", "4 1 2 3 -4\n"},
            {"[]", "0\n"},
    };
    for (const auto& [text, line] : good) {
        const Outcome outcome = run("engine --file -", geteuid(), text);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
        EXPECT_EQ(node("haptic_engine"), line);
    }
    const std::string file = mDirectory.path() + "/packets.csv";
    std::ofstream(file) << "9,9,9,9\n";
    EXPECT_EQ(run("engine 1,1,1,1 --file " + file).exitCode, 0);
    EXPECT_EQ(node("haptic_engine"), "8 1 1 1 1 9 9 9 9\n");

    const std::pair<std::string, std::string> bad[] = {
            {"1,2,3,4\n1,2,3\n", "line 2: "},
            {"1,2,3,4\n\n1,2,3,four\n", "line 3: \"four\""},
            {"[[1,2,3]]", "packet 1: "},
            {"[[1,2,3,4],[1,2,3,4.5]]", "packet 2: "},
            {"[[1,2,3,2147483648]]", "packet 1: "},
            {"[{\"param0\":1}]", "packet 1: "},
            {"[1,2,3,4]", "packet 1: "},
            {"[[1,2,3,4]", "no JSON list"},
            {"{\"param0\":1}", "no JSON list"},
            {std::string(5000, '['), "no JSON list"},
    };
    for (const auto& [text, complaint] : bad) {
        const Outcome outcome = run("engine --file -", geteuid(), text);
        EXPECT_EQ(outcome.exitCode, 2);
        EXPECT_NE(outcome.errors.find("-: " + complaint), std::string::npos) << outcome.errors;
    }
    EXPECT_EQ(node("haptic_engine"), "8 1 1 1 1 9 9 9 9\n");
}

TEST_F(VibratorctlTest, ScriptsGetJson) {
    createDriver();
    start();
    const std::pair<const char*, nlohmann::json> cases[] = {
            {"on 5", {{"operation", "on"}, {"status", "OK"}}},
            {"click", {{"operation", "perform"}, {"status", "OK"}, {"lengthMs", 20}}},
            {"intensity 0",
             {{"operation", "daxSetAmplitude"},
              {"status", "BAD_VALUE"},
              {"reason", "out of range: 1 to 10000"}}},
    };
    for (const auto& [line, expected] : cases)
        EXPECT_EQ(nlohmann::json::parse(run(line + std::string(" --json")).output), expected);
    const auto status = nlohmann::json::parse(run("--json status").output);
    EXPECT_EQ(status["answers"], true);
    EXPECT_EQ(status["interfaces"].size(), 7U);
    createDriver({"--features", "intensity,fold"});
    const auto supports = nlohmann::json::parse(run("supports --json").output);
    EXPECT_EQ(supports.size(), 9U);
    for (const auto& [query, yes] : supports.items()) {
        EXPECT_EQ(yes, query.find("AmplitudeControl") == query.find("upportsA") + 7 ||
                               query == "daxSupportsFolderStatusSetting")
                << query;
    }
}

TEST_F(VibratorctlTest, MissingServiceIsSaid) {
    for (const char* command : {"off", "supports", "status", "motor", "ladder", "click"}) {
        const Outcome outcome = run(std::string(command) + " --instance other");
        EXPECT_EQ(outcome.exitCode, 3) << command;
        EXPECT_NE(outcome.errors.find("the service cannot be reached: " + socketDirectory()),
                  std::string::npos)
                << outcome.errors;
    }
    EXPECT_EQ(run("--instance \xff --json off").exitCode, 2);
}

}  // namespace
