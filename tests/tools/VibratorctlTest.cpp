// SPDX-License-Identifier: Apache-2.0
#include "support/ServiceTest.h"

#include <chrono>
#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <sstream>
#include <thread>

namespace {

using nlohmann::json;

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
    /** Runs a line of the shell, in which v is the client. @return all that it prints. */
    static std::string shell(const std::string& line, const std::string& program = "bash") {
        const std::string path = std::filesystem::path(VIBRATORCTL).parent_path();
        const Outcome outcome =
                runProgram({"/usr/bin/env", "PATH=/usr/bin:/bin:" + path, program, "-c", line});
        return outcome.output + outcome.errors;
    }
    void harm(const std::string& command) const {
        shell("cd " + mDirectory.path() + "/sys/class/leds/vibrator && " + command);
    }
};

constexpr char kByTheDriver[] = "the driver has refused it; the service's log has the error\n";
constexpr char kNotPermitted[] =
        "not permitted: only root and uid 1000 (system) may do this, not uid 2000\n";

TEST_F(VibratorctlTest, EveryOperationCanBeCalled) {
    createDriver();
    start();
    const struct {
        const char* line;
        std::string output;
        const char* leaf;
        std::string value;
    } cases[] = {
            {"on 500", "on 500: OK\n", "duration", "500\n"},
            {"on 010 -v", "on 10: OK [on: OK]\n", "duration", "10\n"},
            {"on 2147483647", "on 2147483647: OK\n", "duration", "2147483647\n"},
            {"off", "off: OK\n", "activate", "0\n"},
            {"amplitude 128", "amplitude 128: OK\n", "intensity", "5001\n"},
            {"amplitude 255", "amplitude 255: OK\n", "intensity", "10000\n"},
            {"click --strength strong", "click: OK, 20 ms\n", "intensity", "10000\n"},
            {"click --strength=light --strength medium", "click: OK, 20 ms\n", "intensity",
             "5001\n"},
            {"effect 0 --strength light", "effect 0: OK, 20 ms\n", "intensity", "1379\n"},
            {"click --verbose", "click: OK, 20 ms [perform: OK]\n", "intensity", "5001\n"},
            {"intensity 7 --timeout 0", "intensity 7: OK\n", "intensity", "7\n"},
            {"force-touch 8", "force-touch 8: OK\n", "force_touch_intensity", "8\n"},
            {"frequency 4", "frequency 4: OK\n", "multi_freq", "4\n"},
            {"prebaked play 12 --amplitude 99", "prebaked play 12: OK\n", "cp_trigger_index",
             "12\n"},
            {"prebaked play 3 --repeat",
             "prebaked play 3: OK\n",
             "cp_trigger_queue",
             {"3.100, 10, 0~\0", 14}},
            {"engine 10,5000,150,0 --amplitude 5000", "engine: OK, 1 packet\n", "haptic_engine",
             "4 10 2500 150 0\n"},
            {"engine -- -5,429496,2,3 1,2,3,4", "engine: OK, 2 packets\n", "haptic_engine",
             "8 -5 429496 2 3 1 2 3 4\n"},
            {"engine 1,858993459,3,4 --amplitude 5", "engine: OK, 1 packet\n", "haptic_engine",
             "4 1 429496 3 4\n"},
            {"fold close", "fold close: OK\n", "event_cmd", "FOLDER_CLOSE\n"},
            {"fold open", "fold open: OK\n", "event_cmd", "FOLDER_OPEN\n"},
            {"on 0", "on 0: OK\n", "duration", "0\n"},
            {"external on", "external on: OK\n", "ext_control", "1\n"},
            {"external off", "external off: OK\n", "ext_control", "0\n"},
            {"prebaked count", "prebaked count: OK, 12 patterns\n", "num_waves", "12\n"},
            {"ladder", "ladder: OK, 0 3000 4000 6000 8000 10000\n", "motor_type", "LINEAR_1040\n"},
            {"ladder --type 1", "ladder: OK, 0 2000 4000 6000 8000 10000\n", "motor_type",
             "LINEAR_1040\n"},
            {"motor",
             "motor:    LINEAR_1040, number 7, found by the driver's name for it\n"
             "ladder 0: 0 3000 4000 6000 8000 10000\nladder 1: 0 2000 4000 6000 8000 10000\n"
             "enhanced patterns: yes\n",
             "motor_type", "LINEAR_1040\n"},
            {"--version", "vibratorctl 2.1\n", "state", "1\n"},
    };
    for (const auto& each : cases) {
        const Outcome outcome = run(each.line);
        EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
        EXPECT_EQ(outcome.output, each.output);
        EXPECT_EQ(outcome.errors, "");
        EXPECT_EQ(node(each.leaf), each.value) << each.line;
    }
    const Outcome beyond = run("prebaked play 13");
    EXPECT_EQ(beyond.exitCode, 0);
    EXPECT_EQ(beyond.errors,
              "vibratorctl: prebaked play 13: the driver counts only 12 stored patterns; it may "
              "play nothing\n");
    createDriver({"--motor", "COINDC", "--features", "fold,external-control"});
    EXPECT_EQ(run("supports -v")
                      .output.find("amplitudes of the platform: no "
                                   "[supportsAmplitudeControl]\nexternal control: yes "),
              0U);
    EXPECT_EQ(run("motor").output,
              "motor:    COINDC, number 1, found by the features of the driver\nladder 0: none\n"
              "ladder 1: none\nenhanced patterns: no\n");
}

TEST_F(VibratorctlTest, RefusalsAreExplained) {
    createDriver();
    start();
    const struct {
        const char* features;
        const char* harm;
        const char* line;
        uid_t uid;
        std::string reason;
    } cases[] = {
            {"intensity", "true", "amplitude 0", 0, "out of range: an amplitude is 1 to 255\n"},
            {"intensity", "true", "intensity 10001", 0,
             "out of range: an intensity is 1 to 10000\n"},
            {"intensity", "true", "frequency 5 -v", 0,
             "out of range: a frequency type is 0 to 4 [daxSetFrequencyType: BAD_VALUE]\n"},
            {"none", "true", "effect 3 --version 1.2", 0,
             "this service plays one effect only: effect 0 of version 1.0, the click\n"},
            {"none", "true", "ladder", 0, "the motor, COINDC, has no ladder\n"},
            {"none", "true", "ladder --type 2", 0, "out of range: the type is 0 or 1\n"},
            {"none", "true", "engine 100000000,1,1,1", 0,
             "out of range: at most 339 packets, an amplitude of 1 to 10000, values of at most 8 "
             "characters\n"},
            {"none", "true", "prebaked play 1 --amplitude 0", 0,
             "out of range: an amplitude is 1 to 10000\n"},
            {"none", "true", "intensity 5", 0, "this driver has no node \"intensity\"\n"},
            {"none", "true", "force-touch 5", 0,
             "this driver has no node \"force_touch_intensity\"\n"},
            {"none", "true", "frequency 1", 0, "this driver has no node \"multi_freq\"\n"},
            {"none", "true", "fold open", 0, "this driver has no node \"event_cmd\"\n"},
            {"none", "true", "external on", 0, "this driver has no node \"ext_control\"\n"},
            {"none", "true", "engine 1,2,3,4", 0, "this driver has no node \"haptic_engine\"\n"},
            {"none", "true", "prebaked count", 0, "this driver has no node \"num_waves\"\n"},
            {"prebaked", "true", "prebaked play 3", 0, "this driver has no node \"intensity\"\n"},
            {"intensity", "chmod 0444 intensity", "intensity 5", 0,
             "the node \"intensity\" cannot be opened; \"vibratorctl doctor\" says more\n"},
            {"intensity", "rm activate", "on 5", 0,
             "no vibrator driver is found; \"vibratorctl doctor\" says what to do\n"},
            {"external-control", "echo 70 >duration", "external on", 0,
             "refused while the motor counts as running (duration is 70); first: vibratorctl on "
             "0\n"},
            {"intensity", "true", "click --strength light", 2000, ""},
            {"intensity", "true", "amplitude 5", 1000, ""},
            {"intensity", "true", "amplitude 5", 2000, kNotPermitted},
            {"intensity", "true", "fold open", 2000, kNotPermitted},
            {"intensity", "true", "prebaked count", 2000, kNotPermitted},
            {"intensity", "true", "prebaked play 1", 2000, kNotPermitted},
            {"intensity", "true", "ladder", 2000, kNotPermitted},
            {"intensity", "true", "motor", 2000, kNotPermitted},
            {"external-control", "echo 70 >duration", "external on", 2000,
             "refused while the motor counts as running (duration is 70); first: vibratorctl on "
             "0\n"},
    };
    for (const auto& each : cases) {
        if (each.uid != 0 && geteuid() != 0) continue;
        createDriver({"--motor", "COINDC", "--features", each.features});
        harm(each.harm);
        const Outcome outcome = run(each.line, each.uid != 0 ? each.uid : geteuid());
        EXPECT_EQ(outcome.exitCode, each.reason.empty() ? 0 : 1) << each.line;
        const size_t start = outcome.errors.find(": ");
        EXPECT_EQ(start == std::string::npos ? "" : outcome.errors.substr(start + 2), each.reason)
                << outcome.errors;
    }
    createDriver();
    runProgram({VIBRATOR_SIM, "fault", "multi_freq", "write", "EIO"});
    EXPECT_EQ(run("frequency 1").errors, std::string("frequency 1: ") + kByTheDriver);
    if (geteuid() == 0) {
        const Outcome outcome = run("supports", 2000);
        EXPECT_EQ(outcome.exitCode, 0);
        EXPECT_EQ(outcome.errors, std::string("vibratorctl: supports: ") + kNotPermitted);
        EXPECT_EQ(outcome.output.find("amplitudes of the platform: may not ask\nexternal control: "
                                      "yes\nintensities: may not ask\n"),
                  0U);
        EXPECT_EQ(run("motor", 1000)
                          .output.find("motor:    not known, since its nodes cannot be "
                                       "opened here\nladder 0: 0 3000 "),
                  0U);
    }
    mService.kill();
    std::filesystem::remove_all(mDirectory.path() + "/sys");
    createDriver({"--layout", "timed"});
    start();
    run("on 9000");
    const std::string running = run("external on").errors;
    EXPECT_EQ(running.find("external on: refused while the motor counts as running (enable is "),
              0U);
    EXPECT_NE(running.find("); first: vibratorctl off\n"), std::string::npos) << running;
    EXPECT_NE(run("doctor").output.find("so external control is refused; \"vibratorctl\n      "
                                        "off\" stops it.\n"),
              std::string::npos);
}

TEST_F(VibratorctlTest, MistakesAreNamedInOneLine) {
    const std::string time = " is not a time in ms (0 to 2147483647)";
    const std::pair<const char*, std::string> cases[] = {
            {"", "no command; \"vibratorctl help\" lists them"},
            {"stauts", "no command \"stauts\"; did you mean \"status\"?"},
            {"dance", "no command \"dance\""},
            {"prebaked", "prebaked: no command; count or play"},
            {"prebaked pla", "no command \"prebaked pla\"; did you mean \"play\"?"},
            {"help dnace", "help: no command \"dnace\""},
            {"help prebakd", "help: no command \"prebakd\"; did you mean \"prebaked\"?"},
            {"on", "on: MS is missing: how long, in ms (0 to 2147483647)"},
            {"on -5", "on: \"-5\"" + time},
            {"on +5", "on: \"+5\"" + time},
            {"on 500ms", "on: \"500ms\"" + time},
            {"on 0x10", "on: \"0x10\"" + time},
            {"on 1.5", "on: \"1.5\"" + time},
            {"on 2147483648", "on: \"2147483648\"" + time},
            {"on 99999999999999999999", "on: \"99999999999999999999\"" + time},
            {"on \x1b[31m\xc2\x9b\xffé", "on: \"\\x1b[31m\\xc2\\x9b\\xffé\"" + time},
            {"on 5 6", "on: \"6\" is one argument too many"},
            {"on 5 -x", "on: no option \"-x\""},
            {"on 5 --jsn=3", "on: no option \"--jsn\"; did you mean \"--json\"?"},
            {"off --json=3", "--json: takes no value"},
            {"off --timeout 1h", "--timeout: \"1h\" is not a time in s (0 to 3600)"},
            {"off --instance", "off: --instance: the value is missing"},
            {"click --strength", "click: --strength: the value is missing"},
            {"click --strength ligth",
             "click: --strength: \"ligth\" is not light, medium or strong; did you mean "
             "\"light\"?"},
            {"amplitude 256", "amplitude: \"256\" is not an amplitude (1 to 255)"},
            {"intensity x", "intensity: \"x\" is not an intensity (1 to 10000)"},
            {"external maybe", "external: \"maybe\" is not on or off"},
            {"fold half", "fold: \"half\" is not open or close"},
            {"prebaked play 2147483648",
             "prebaked play: \"2147483648\" is not the number of a pattern (0 to 2147483647)"},
            {"engine", "engine: no packets; each is PARAM0,INTENSITY,PARAM2,PARAM3"},
            {"engine --file /dev/null",
             "engine: /dev/null: no packets; each is PARAM0,INTENSITY,PARAM2,PARAM3"},
            {"engine 1,2,3", "engine: \"1,2,3\" is not PARAM0,INTENSITY,PARAM2,PARAM3"},
            {"engine 1,429497,3,4",
             "engine: intensity 429497 cannot be scaled by amplitude 10000; it is 0 to 429496"},
            {"engine 1,2,3,4 1,-1,3,4 --amplitude 1",
             "engine: intensity -1 cannot be scaled by amplitude 1; it is 0 to 4294967295"},
            {"engine --file /no/such/file",
             "engine: /no/such/file: cannot be read: No such file or directory"},
            {"engine --file /tmp", "engine: /tmp: cannot be read: Is a directory"},
            {"completion tcsh", "completion: \"tcsh\" is not bash, zsh or fish"},
    };
    createDriver();
    start();
    for (const auto& [line, complaint] : cases) {
        const Outcome outcome = run(line);
        EXPECT_EQ(outcome.exitCode, 2) << line;
        EXPECT_EQ(outcome.output, "");
        EXPECT_EQ(outcome.errors, "vibratorctl: " + complaint + "\n");
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
            {"[[1,2,3,4],[5,6,7,8]]", "8 1 2 3 4 5 6 7 8\n"},
            {" [{\"param0\":1,\"intensity\":2,\"param2\":3,\"param3\":-4}] ", "4 1 2 3 -4\n"},
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
            {"[]", "no packets"},
            {std::string(5000, '['), "no JSON list"},
    };
    for (const auto& [text, complaint] : bad) {
        const Outcome outcome = run("engine --file -", geteuid(), text);
        EXPECT_EQ(outcome.exitCode, 2);
        EXPECT_NE(outcome.errors.find("-: " + complaint), std::string::npos) << outcome.errors;
    }
    EXPECT_EQ(node("haptic_engine"), "8 1 1 1 1 9 9 9 9\n");
}

TEST_F(VibratorctlTest, InputsAreLimited) {
    EXPECT_EQ(shell("head -c 67108865 /dev/zero | vibratorctl engine --file -"),
              "vibratorctl: engine: -: more than 64 MiB\n");
}

TEST_F(VibratorctlTest, ScriptsGetJson) {
    createDriver();
    start();
    const std::string refused = R"("ok":false,"status":)";
    const std::pair<const char*, std::string> cases[] = {
            {"on 5", R"({"command":"on","argument":"5","operation":"on","ok":true,"status":"OK"})"},
            {"click",
             R"({"command":"click","operation":"perform","ok":true,"status":"OK","lengthMs":20})"},
            {"effect 7 --version 1.3",
             R"({"command":"effect","argument":"7","operation":"perform_1_3",)" + refused +
                     R"("UNSUPPORTED_OPERATION","reason":"this service plays one effect only: )"
                     R"(effect 0 of version 1.0, the click"})"},
            {"intensity 0",
             R"({"command":"intensity","argument":"0","operation":"daxSetAmplitude",)" + refused +
                     R"("BAD_VALUE","reason":"out of range: an intensity is 1 to 10000"})"},
            {"prebaked count",
             R"({"command":"prebaked count","operation":"daxGetNumberOfPrebakedHapticPattern",)"
             R"("ok":true,"status":"OK","count":12})"},
            {"prebaked play 13",
             R"({"command":"prebaked play","argument":"13",)"
             R"("operation":"daxPerformPrebakedHapticPattern","ok":true,"status":"OK",)"
             R"("warning":"the driver counts only 12 stored patterns; it may play nothing"})"},
            {"engine 1,2,3,4",
             R"({"command":"engine","operation":"daxPerformHapticEngine","ok":true,)"
             R"("status":"OK","packets":1})"},
            {"ladder",
             R"({"command":"ladder","operation":"daxGetAmplitudeList","ok":true,"status":"OK",)"
             R"("ladder":[0,3000,4000,6000,8000,10000]})"},
            {"motor", R"({"command":"motor","ok":true,"name":"LINEAR_1040","number":7,)"
                      R"("found":"by the driver's name for it",)"
                      R"("ladders":{"0":[0,3000,4000,6000,8000,10000],)"
                      R"("1":[0,2000,4000,6000,8000,10000]},"enhancedPatterns":true})"},
            {"on x",
             R"({"command":"on",)" + refused +
                     R"-("USAGE","reason":"\"x\" is not a time in ms (0 to 2147483647)"})-"},
            {"\xff",
             R"({"command":null,)" + refused + R"("USAGE","reason":"no command \"\\xff\""})"},
            {"completion bash",
             R"({"command":"completion",)" + refused +
                     R"("USAGE","reason":"has no JSON answer; leave out --json"})"},
            {"help", R"({"command":"help",)" + refused +
                             R"("USAGE","reason":"has no JSON answer; leave out --json"})"},
    };
    for (const auto& [line, expected] : cases)
        EXPECT_EQ(run(line + std::string(" --json")).output, expected + "\n");
    const auto status = json::parse(run("--json status").output);
    EXPECT_EQ(status["answers"], true);
    EXPECT_EQ(status["interfaces"].size(), 7U);
    createDriver({"--features", "intensity,fold"});
    const auto supports = json::parse(run("supports --json").output);
    EXPECT_EQ(supports["permitted"], true);
    EXPECT_EQ(supports["supports"].size(), 9U);
    for (const auto& [query, yes] : supports["supports"].items()) {
        EXPECT_EQ(yes, query.find("AmplitudeControl") == query.find("upportsA") + 7 ||
                               query == "daxSupportsFolderStatusSetting")
                << query;
    }
    if (geteuid() != 0) return;
    const auto denied = json::parse(run("supports --json", 2000).output);
    EXPECT_EQ(denied["permitted"], false);
    EXPECT_EQ(denied["reason"].get<std::string>() + "\n", kNotPermitted);
}

TEST_F(VibratorctlTest, MissingServiceIsSaidAndWaitedFor) {
    for (const char* command : {"off", "supports", "status", "motor", "ladder", "click"}) {
        const Outcome outcome = run(std::string(command) + " --instance other");
        EXPECT_EQ(outcome.exitCode, 3) << command;
        EXPECT_EQ(outcome.errors.find("vibratorctl: " + std::string(command) +
                                      ": the service cannot be reached: "),
                  0U)
                << outcome.errors;
        EXPECT_NE(outcome.errors.find(": " + socketDirectory()), std::string::npos);
        EXPECT_NE(outcome.errors.find("; \"vibratorctl doctor\" says what to do\n"),
                  std::string::npos);
    }
    const auto unreachable = json::parse(run("--instance \xff --json off").output);
    EXPECT_EQ(unreachable["status"], "UNREACHABLE");
    EXPECT_EQ(unreachable["command"], "off");

    const auto begin = std::chrono::steady_clock::now();
    EXPECT_EQ(run("status --wait 1").exitCode, 3);
    EXPECT_GE(std::chrono::steady_clock::now() - begin, std::chrono::seconds(1));
    std::thread later([this] {
        std::this_thread::sleep_for(std::chrono::milliseconds(300));
        startDaemon(mService);
    });
    const Outcome outcome = run("status --wait 20");
    later.join();
    EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
    EXPECT_EQ(outcome.output.find("service:    default, answers\nserved by:  "), 0U);
    EXPECT_NE(outcome.output.find("\ninterfaces: vendor.velmora.hardware.vibrator@2.1::"
                                  "IDaxVibrator\n            vendor."),
              std::string::npos)
            << outcome.output;
}

TEST_F(VibratorctlTest, DoctorShowsATableOfEightyColumns) {
    createDriver();
    start();
    const std::string output = run("doctor").output;
    // How the calls go depends on the runtime.
    EXPECT_EQ(output.find("layout:    LED trigger\nservice:   answers\nserved by: "), 0U);
    const size_t motor = output.find("\nmotor: ");
    ASSERT_NE(motor, std::string::npos);
    EXPECT_EQ(output.substr(motor + 1), readFile(SOURCE_DIRECTORY "/tests/tools/doctor.txt"));

    harm("printf '\\033[2J\\302\\233\\377 a name that is longer than its cell' >motor_type");
    const Outcome strange = run("doctor");
    EXPECT_EQ(strange.exitCode, 1);
    EXPECT_NE(strange.output.find("rw \"\\x1b[2J\\xc2\\x9... name of the motor\n"),
              std::string::npos)
            << strange.output;
    EXPECT_EQ(strange.output.find_first_of("\033\302\233\377"), std::string::npos);
    std::istringstream lines(strange.output);
    for (std::string line; std::getline(lines, line);)
        // A path cannot be broken.
        EXPECT_TRUE(line.size() <= 80 || line.find(' ', 11) == std::string::npos) << line;
    EXPECT_NE(run("doctor --json").output.find("\\u001b[2J\\u009b\\ufffd a name"),
              std::string::npos);
}

TEST_F(VibratorctlTest, DoctorFindsWhatIsWrong) {
    const struct {
        const char* layout;
        const char* harm;
        uid_t uid;
        int exitCode;
        std::string text;
    } cases[] = {
            {"led", "true", 0, 0, "\nnothing is wrong\n"},
            {"led", "rm activate", 0, 1,
             "layout:    none\n|! the kernel offers no vibrator driver in /sys/class;\n  build the "
             "motor's driver in, or load it; docs/device.md tells how for a GPIO.\n"},
            {"led", "rm activate; touch trigger", 0, 1,
             "! /sys/class/leds/vibrator has no transient trigger;\n  load ledtrig-transient, and "
             "write \"transient\" to\n  /sys/class/leds/vibrator/trigger.\n"},
            {"led", "chmod 0444 state", 0, 1,
             "! /sys/class/leds/vibrator/state cannot be opened for reading and writing by uid\n  "
             "0;\n"
             "  give the node to the service's user, as the init declaration in device/ does.\n"},
            {"led", "chmod 0444 intensity", 0, 1,
             "! /sys/class/leds/vibrator/intensity is there, but uid 0 cannot write it;\n  give "
             "the "
             "node to the service's user, or give it a mode of 0644.\n|missing:   amplitude\n"},
            {"led", "chmod 0 num_waves", 0, 1,
             "vibrator/num_waves is there, but uid 0 cannot read it;\n|num_waves             0000 "
             "root     --                    number of patterns\n"},
            {"led", "echo FOO > motor_type", 0, 1,
             "! the driver's name for the motor, \"FOO\", is not a known one;\n  have the driver "
             "show one of the known names in\n  /sys/class/leds/vibrator/motor_type.\n|number 5, "
             "found by the features"},
            {"led", "echo 1 > ext_control", 0, 1,
             "! external control is on, so the motor may not follow the service;\n  switch it off "
             "with \"vibratorctl external off\".\n"},
            {"led", "echo 500 > duration", 0, 0,
             "nothing is wrong\nnote: the motor counts as running, so external control is refused; "
             "the trigger\n      keeps its last duration until \"vibratorctl on 0\".\n"},
            {"timed", "true", 0, 1,
             "layout:    timed output\n|! the kernel has both layouts, and the service takes the "
             "timed output;\n|\nenable                0644 "},
            {"led", "true", 2000, 0,
             "layout:    LED trigger\n|activate              0644 root     r- \"0\\n\"    "
             "          on, off\n|\nnothing is wrong\nnote: uid 2000 cannot open the nodes; root "
             "can, and sees more here.\nnote: uid 2000 may not set amplitudes, nor use what is for "
             "root and uid 1000\n      (system).\n"},
            {"led", "true", 1000, 0, "note: uid 1000 cannot open the nodes; root can"},
    };
    createDriver();
    start();
    for (const auto& [layout, command, uid, exitCode, text] : cases) {
        SCOPED_TRACE(command);
        if (geteuid() != 0) continue;
        std::filesystem::remove_all(mDirectory.path() + "/sys");
        createDriver();
        createDriver({"--layout", layout});
        harm(command);
        const Outcome outcome = run("doctor", uid);
        EXPECT_EQ(outcome.exitCode, exitCode) << outcome.output;
        std::istringstream parts(text);
        for (std::string part; std::getline(parts, part, '|');)
            EXPECT_NE(outcome.output.find(part), std::string::npos) << part << outcome.output;
    }
    mService.kill();
    const std::string alone = run("doctor --instance none").output;
    EXPECT_NE(alone.find("\nservice:   cannot be reached\n"), std::string::npos) << alone;
    EXPECT_NE(alone.find("! the service cannot be reached:"), std::string::npos);
    EXPECT_NE(alone.find("  start the daemon, or give the client the daemon's HWBINDER_DIR.\n"),
              std::string::npos);
    const auto examined = json::parse(run("doctor --json").output);
    EXPECT_EQ(examined["ok"], false);
    EXPECT_EQ(examined["nodes"].size(), 14U);
}

TEST_F(VibratorctlTest, DoctorAgreesWithTheServiceAndLeavesNoTrace) {
    const std::string temporary = mDirectory.path() + "/tmp";
    std::filesystem::create_directory(temporary);
    setenv("TMPDIR", temporary.c_str(), 1);
    for (const std::string motor : {"LINEAR_1040", "LINEAR_1030", "NONE"}) {
        for (const std::string some : {"intensity,motor-name", "prebaked,haptic-engine", "none"}) {
            SCOPED_TRACE(motor + " " + some);
            createDriver({"--motor", motor, "--features", some});
            start();
            const auto known = json::parse(run("motor --json").output);
            const std::string trace = readFile(mDirectory.path() + "/trace");
            const auto found = json::parse(run("doctor --json").output);
            EXPECT_EQ(readFile(mDirectory.path() + "/trace"), trace);
            EXPECT_EQ(found["ladders"], known["ladders"]);
            EXPECT_EQ(found["motor"]["name"], known["name"]);
            EXPECT_NE(log().find("daxGetAmplitudeList type: 0 : " + known["number"].dump() + "\n"),
                      std::string::npos);
            std::filesystem::remove(logFile());
            mService.kill();
        }
    }
    EXPECT_TRUE(std::filesystem::is_empty(temporary));
    unsetenv("TMPDIR");
}

TEST_F(VibratorctlTest, HelpShowsWhatWorks) {
    createDriver();
    start();
    std::string helps;
    std::istringstream commands(
            shell("vibratorctl --complete ''; vibratorctl --complete "
                  "prebaked '' | sed 's/^/prebaked /'"));
    for (std::string line; std::getline(commands, line);) {
        const std::string command = line.substr(0, line.find('\t'));
        // A group's help is that of its commands; what draws and follows has tests of its own.
        const bool isOthers = command == "prebaked" || command == "play" || command == "watch" ||
                              command == "plot";
        if (isOthers) continue;
        const Outcome help = run("help " + command);
        EXPECT_EQ(help.output, run(command + " -h").output);
        helps += help.output + "\n";
        const size_t example = help.output.find("\nExample: vibratorctl ");
        ASSERT_NE(example, std::string::npos) << command;
        EXPECT_EQ(run(help.output.substr(example + 22)).exitCode, 0) << help.output;
        run("on 0");
        run("external off");
    }
    helps += shell("vibratorctl help | sed '/^Tools:/,/^$/d'");
    EXPECT_EQ(run("help prebaked").output,
              run("help prebaked count").output + run("help prebaked play").output);
    EXPECT_EQ(helps, readFile(SOURCE_DIRECTORY "/tests/tools/help.txt"));
    std::istringstream lines(helps);
    for (std::string line; std::getline(lines, line);)
        // A path cannot be broken.
        EXPECT_TRUE(line.size() <= 80 || line.find(' ', 11) == std::string::npos) << line;
}

TEST_F(VibratorctlTest, FullDevicesAreErrors) {
    createDriver();
    start();
    for (const char* line :
         {"on 5", "off --json", "click", "supports", "status", "ladder", "motor", "doctor", "help",
          "help on", "--version", "completion zsh", "--instance x off --json"}) {
        EXPECT_EQ(shell(std::string("vibratorctl ") + line + " >/dev/full; echo $?"),
                  "1\nvibratorctl: standard output cannot be written: No space left on device\n")
                << line;
    }
}

TEST_F(VibratorctlTest, ShellsCompleteCommandsOptionsAndValues) {
    const std::string bash =
            "source <(vibratorctl completion bash); try() { COMP_WORDS=(vibratorctl \"$@\"); "
            "COMP_CWORD=$#; _vibratorctl vibratorctl; printf '%s|' \"${COMPREPLY[@]}\"; }; try ";
    const std::string zsh =
            "compdef() { }; source <(vibratorctl completion zsh); _describe() { print -rn -- "
            "\"${(Pj:|:)2}|\" }; _files() { print -n :files }; words=(vibratorctl ";
    const std::string fish = "vibratorctl completion fish | source; complete -C 'vibratorctl ";
    const struct {
        const char* typed;
        std::string completed;
    } cases[] = {
            {"o", "on\trun the motor\noff\tstop the motor\n"},
            {"prebaked ''",
             "count\ttell how many patterns the driver has stored\n"
             "play\tplay a pattern that the driver has stored\n"},
            {"prebak", "prebaked\tcount or play\n"},
            {"--instance x fold ''", "open\tthe device is open\nclose\tthe device is folded\n"},
            {"click --strength s", "strong\tfull strength\n"},
            {"prebaked play 3 --r", "--repeat\tplay it through the driver's queue\n"},
            {"effect 0 --version 1.2", "1.2\tperform_1_2\n"},
            {"fold --json c", "close\tthe device is folded\n"},
            {"help prebaked p", "play\tplay a pattern that the driver has stored\n"},
            {"fold open ''", ""},
            {"fold open --js", "--json\tanswer with a JSON object a line\n"},
            {"nonsense ''", ""},
            {"on ''", ""},
            {"engine --file ''", ":files\n"},
            {"engine 1,2,3,4 ''", ""},
    };
    for (const auto& [typed, completed] : cases) {
        const std::string words = typed;
        EXPECT_EQ(shell("vibratorctl --complete " + words), completed) << words;
        std::string shown = completed;
        const bool one = std::count(shown.begin(), shown.end(), '\n') == 1;
        std::string inBash;
        std::istringstream lines(completed);
        for (std::string line; std::getline(lines, line) && line != ":files";) {
            const size_t tab = line.find('\t');
            inBash += line.substr(0, tab) + (one ? "" : "  (" + line.substr(tab + 1) + ")") + "|";
        }
        EXPECT_EQ(shell(bash + words + " 2>/dev/null"), inBash.empty() ? "|" : inBash) << words;
        // The other shells take longer to start.
        if (words.find("fold") == std::string::npos || completed.empty()) continue;
        std::replace(shown.begin(), shown.end(), '\n', '|');
        std::replace(shown.begin(), shown.end(), '\t', ':');
        const auto count = "CURRENT=${#words}; _vibratorctl";
        if (shell("type -P zsh").empty() || shell("type -P fish").empty()) continue;
        EXPECT_EQ(shell(zsh + words + "); " + count, "zsh"), shown) << words;
        const bool ends = words.back() == '\'';
        const std::string line = ends ? words.substr(0, words.size() - 2) : words;
        EXPECT_EQ(shell(fish + line + "' | sort", "fish"),
                  shell("vibratorctl --complete " + words + " | sort"))
                << words;
    }
}

}  // namespace
