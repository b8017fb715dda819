// SPDX-License-Identifier: Apache-2.0
#include "support/DaemonTest.h"

#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>

namespace {

namespace fs = std::filesystem;

/** @return the lines of a text, each behind a mark. */
std::string marked(const std::string& text, const std::string& mark) {
    std::istringstream lines(text);
    std::string all;
    for (std::string line; std::getline(lines, line);)
        all += mark + line + "\n";
    return all;
}

bool isOneLine(const std::string& text) {
    return !text.empty() && text.find('\n') == text.size() - 1;
}

/** @return what stands in a transcript behind a command and below it. */
std::string inTranscript(const Outcome& outcome) {
    const auto& [code, output, errors] = outcome;
    if (code == 0 && errors.empty() && isOneLine(output)) return " => " + output;
    const std::string number = code == 0 ? "" : std::to_string(code);
    if (code != 0 && output.empty() && isOneLine(errors)) return " =" + number + "> " + errors;
    return "\n" + marked(output, "") + marked(errors, "! ") +
           (code == 0 ? "" : "[" + number + "]\n");
}

/** A text file under tests/ with shell commands and what comes of them. */
class TranscriptTest : public DaemonTest, public ::testing::WithParamInterface<const char*> {
  protected:
    void SetUp() override {
        // Anybody may simulate a driver.
        if (GetParam() == std::string("simulator/transcript.txt")) return;
        DaemonTest::SetUp();
        if (IsSkipped()) return;
        createDriver();
        start();
    }
};

TEST_P(TranscriptTest, IsWhatHappens) {
    const std::string file = std::string(SOURCE_DIRECTORY "/tests/") + GetParam();
    const std::string wanted = readFile(file);
    // The user, the command, and the rest of its line.
    const std::regex command(R"((\d*)\$ (.*?)( =\d*> .*)?)");
    // Others may not see the folder in which it was built.
    const std::string client = mDirectory.path() + "/vibratorctl";
    fs::copy_file(VIBRATORCTL, client);
    std::string got = wanted.substr(0, wanted.find("\n## "));
    const std::string prelude =
            "set -o pipefail; source='" SOURCE_DIRECTORY "'; PATH=$PATH:" + mDirectory.path() +
            ":" + fs::path(VIBRATOR_SIM).parent_path().string() + "\n" + got;
    std::istringstream lines(wanted);
    for (std::string line; std::getline(lines, line);) {
        std::smatch parts;
        if (line.rfind("## ", 0) == 0) got += "\n" + line + "\n";
        if (!std::regex_match(line, parts, command)) continue;
        const uid_t uid =
                parts[1].length() == 0 ? geteuid() : static_cast<uid_t>(std::stoul(parts[1]));
        if (uid != geteuid() && geteuid() != 0) GTEST_SKIP() << "only root can be another user";
        got += parts[1].str() + "$ " + parts[2].str() +
               inTranscript(runProgram({"/bin/bash", "-c", prelude + parts[2].str(), client}, uid));
    }
    if (got == wanted) return;
    const std::string gotFile = mDirectory.path() + "/transcript.txt";
    std::ofstream(gotFile) << got;
    if (getenv("ACCEPT_TRANSCRIPTS") != nullptr) {
        fs::copy_file(gotFile, file, fs::copy_options::overwrite_existing);
        return;
    }
    FAIL() << runProgram({"/usr/bin/diff", "-U1", file, gotFile}).output
           << "If this is as it should be: scripts/test --accept";
}

INSTANTIATE_TEST_SUITE_P(, TranscriptTest,
                         ::testing::Values("tools/calls.txt", "tools/command_line.txt",
                                           "tools/doctor.txt", "tools/plots.txt",
                                           "tools/scores.txt", "tools/watch.txt",
                                           "simulator/transcript.txt"),
                         [](const auto& test) {
                             const std::string name = fs::path(test.param).stem();
                             return name == "transcript" ? std::string("simulator") : name;
                         });

}  // namespace
