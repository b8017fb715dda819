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
    static Outcome run(const std::string& line) {
        std::istringstream words(line);
        std::vector<std::string> command = {VIBRATORCTL};
        for (std::string word; words >> word;)
            command.push_back(word);
        return runProgram(command);
    }
    /** Runs a line of the shell, in which v is the client. @return all that it prints. */
    static std::string shell(const std::string& line, const std::string& program = "bash") {
        const std::string path = std::filesystem::path(VIBRATORCTL).parent_path();
        const Outcome outcome =
                runProgram({"/usr/bin/env", "PATH=/usr/bin:/bin:" + path, program, "-c", line});
        return outcome.output + outcome.errors;
    }
};

/** A transcript: headings, and shell lines behind the prompt of root or of a uid, "2000$ ". */
TEST_F(VibratorctlTest, AnswersAsInTheTranscript) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can be another user";
    createDriver();
    start();
    // Others may not see the folder in which it was built.
    const std::string client = mDirectory.path() + "/vibratorctl";
    std::filesystem::copy_file(VIBRATORCTL, client);
    const std::string prelude =
            "set -o pipefail; cd \"$VIBRATOR_SIM_DIR/sys/class/leds/vibrator\"; "
            "PATH=$PATH:${0%/*}:" +
            std::filesystem::path(VIBRATOR_SIM).parent_path().string() +
            "; v() { vibratorctl \"$@\"; }; node() { cat \"$@\" | tr '\\0' '~'; }; "
            "check() { v play --check - <<<\"$1\"; }; ";
    const auto print = [](const std::string& text, const std::string& start) {
        std::istringstream lines(text);
        std::string printed;
        for (std::string line; std::getline(lines, line);)
            printed += start + line + "\n";
        return printed;
    };
    const std::string wanted = readFile(SOURCE_DIRECTORY "/tests/tools/transcript.txt");
    std::string got;
    std::istringstream lines(wanted);
    for (std::string line; std::getline(lines, line);) {
        const size_t prompt = line.find("$ ");
        if (line.rfind("## ", 0) == 0) got += (got.empty() ? "" : "\n") + line + "\n";
        if (prompt == std::string::npos || line.find_first_not_of("0123456789") != prompt) continue;
        got += line + "\n";
        const uid_t uid = prompt == 0 ? 0 : static_cast<uid_t>(std::stoul(line));
        const Outcome outcome =
                runProgram({"/bin/bash", "-c", prelude + line.substr(prompt + 2), client}, uid);
        got += print(outcome.output, "") + print(outcome.errors, "! ");
        if (outcome.exitCode != 0) got += "[" + std::to_string(outcome.exitCode) + "]\n";
    }
    if (got == wanted) return;
    const std::string file = mDirectory.path() + "/transcript.txt";
    std::ofstream(file) << got;
    FAIL() << runProgram({"/usr/bin/diff", "-U1", SOURCE_DIRECTORY "/tests/tools/transcript.txt",
                          file})
                      .output;
}

TEST_F(VibratorctlTest, TimedOutputIsStoppedBeforeExternalControl) {
    createDriver({"--layout", "timed"});
    start();
    run("on 9000");
    const std::string refused = run("external on").errors;
    EXPECT_EQ(refused.find("external on: refused while the motor counts as running (enable is "),
              0U);
    EXPECT_NE(refused.find("); first: vibratorctl off\n"), std::string::npos) << refused;
    EXPECT_NE(run("doctor").output.find("\nnothing is wrong\nnote: the motor counts as running, so "
                                        "external control is refused; \"vibratorctl\n      "
                                        "off\" stops it.\n"),
              std::string::npos);
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
            {"fold open --js", "--json\tprint each answer as a line of JSON\n"},
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
