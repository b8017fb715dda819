// SPDX-License-Identifier: Apache-2.0
#include "support/DaemonTest.h"

#include <cctype>
#include <filesystem>
#include <fstream>
#include <nlohmann/json.hpp>
#include <set>
#include <sstream>

namespace {

using nlohmann::json;

class VibratorctlTest : public DaemonTest {
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

TEST_F(VibratorctlTest, DoctorAgreesWithTheService) {
    for (const std::string motor : {"LINEAR_1040", "LINEAR_1030", "NONE"}) {
        for (const std::string some : {"intensity,motor-name", "pattern,haptic-engine", "none"}) {
            SCOPED_TRACE(motor + " " + some);
            createDriver("--motor " + motor + " --features " + some);
            start();
            const auto known = json::parse(run("motor --json").output);
            // Which includes that the service answers as the doctor expects.
            const auto found = json::parse(run("doctor --json").output);
            EXPECT_EQ(found["findings"].size(), motor == "NONE" && some[0] == 'i' ? 1U : 0U)
                    << found;
            EXPECT_NE(log().find("daxGetAmplitudeList type: 0 : " + known["number"].dump() + "\n"),
                      std::string::npos);
            std::filesystem::remove(logFile());
            mServer.kill();
        }
    }
}

/** Collects the names of an answer's members; those of features, queries and ladders are data. */
void collectNames(const json& answer, std::set<std::string>* names) {
    if (answer.is_array() && !answer.empty()) collectNames(answer[0], names);
    if (!answer.is_object()) return;
    for (const auto& [name, member] : answer.items()) {
        names->insert(name);
        if (name != "features" && name != "supports" && name != "ladders")
            collectNames(member, names);
    }
}

TEST_F(VibratorctlTest, TheManualNamesTheMembersOfTheJson) {
    createDriver();
    start();
    const std::string score = mDirectory.path() + "/score";
    std::ofstream(score) << "click";
    std::set<std::string> printed;
    const std::vector<std::string> commands = {"on 5 --strength 7",
                                               "intensity 0",
                                               "pattern count",
                                               "pattern play 13",
                                               "engine 1,2,3,4",
                                               "ladder",
                                               "supports",
                                               "status",
                                               "motor",
                                               "doctor --instance none",
                                               "selftest --quiet",
                                               "play " + score,
                                               "play --check " + score};
    for (const std::string& command : commands) {
        std::istringstream lines(run("--json " + command).output);
        for (std::string line; std::getline(lines, line);)
            collectNames(json::parse(line), &printed);
    }
    std::istringstream manual(readFile(SOURCE_DIRECTORY "/docs/man/vibratorctl.1"));
    std::set<std::string> named;
    bool isJson = false;
    for (std::string line; std::getline(manual, line);) {
        if (line.rfind(".Sh", 0) == 0) isJson = line == ".Sh JSON";
        std::istringstream words(line);
        std::string word;
        while (words >> word && word != ".Li" && word != "Li") {
        }
        while (isJson && words >> word) {
            if (std::isalpha(static_cast<unsigned char>(word[0])) != 0) named.insert(word);
        }
    }
    EXPECT_EQ(printed, named);
}

TEST_F(VibratorctlTest, EveryCommandHasHelpAndAnExampleThatWorks) {
    createDriver();
    start();
    std::istringstream commands(
            shell(R"(vibratorctl help | sed -nE 's/^  ([a-z][a-z-]*( [a-z-]+)?).*/\1/p')"));
    size_t count = 0;
    for (std::string command; std::getline(commands, command); ++count) {
        const std::string help = run("help " + command).output;
        EXPECT_EQ(help, run(command + " -h").output);
        const size_t example = help.find("\nExample: vibratorctl ");
        ASSERT_NE(example, std::string::npos) << command;
        // What draws and follows has tests of its own.
        if (command != "play" && command != "watch" && command != "plot") {
            EXPECT_EQ(run(help.substr(example + 22)).exitCode, 0) << help;
        }
        run("on 0");
        run("external off");
        std::istringstream lines(help);
        for (std::string line; std::getline(lines, line);)
            EXPECT_LE(line.size(), 80U) << line;
    }
    EXPECT_GT(count, 20U);
}

TEST_F(VibratorctlTest, OtherShellsCompleteAsBashDoes) {
    if (shell("type -P zsh").empty() || shell("type -P fish").empty())
        GTEST_SKIP() << "zsh or fish is not installed";
    const std::string zsh =
            "compdef() { }; source <(vibratorctl completion zsh); _describe() { print -rn -- "
            "\"${(Pj:|:)2}|\" }; words=(vibratorctl ";
    const std::string fish = "vibratorctl completion fish | source; complete -C 'vibratorctl ";
    for (const std::string line : {"--instance x fold ", "fold --json c", "fold open --js"}) {
        const std::string words = line.back() == ' ' ? line + "''" : line;
        const std::string complete = "vibratorctl --complete " + words;
        EXPECT_EQ(shell(zsh + words + "); CURRENT=${#words}; _vibratorctl", "zsh"),
                  shell(complete + " | tr '\\n\\t' '|:'"));
        EXPECT_EQ(shell(fish + line + "' | sort", "fish"), shell(complete + " | sort"));
    }
}

}  // namespace
