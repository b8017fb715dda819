// SPDX-License-Identifier: Apache-2.0
#include "support/ServiceTest.h"

#include <filesystem>
#include <fstream>
#include <sstream>

namespace {

/** @return the lines of a text, each behind a mark. */
std::string marked(const std::string& text, const std::string& mark) {
    std::istringstream lines(text);
    std::string all;
    for (std::string line; std::getline(lines, line);)
        all += mark + line + "\n";
    return all;
}

class TranscriptTest : public ServiceTest {
  protected:
    /**
     * Expects that everything happens as in a transcript. It begins with shell commands that come
     * before every line. Then there are headings, and shell lines behind the prompt of this user,
     * "$ ", or of another one, "2000$ ". Below each line stands what it prints, errors behind "! ",
     * and its exit code in brackets if it fails.
     */
    void expectAsIn(const std::string& transcript) const {
        // Others may not see the folder in which it was built.
        const std::string client = mDirectory.path() + "/vibratorctl";
        std::filesystem::copy_file(VIBRATORCTL, client);
        const std::string file = SOURCE_DIRECTORY "/tests/" + transcript;
        const std::string wanted = readFile(file);
        std::string got = wanted.substr(0, wanted.find("\n## "));
        const std::string prelude =
                "set -o pipefail; source='" SOURCE_DIRECTORY "'; PATH=$PATH:${0%/*}:" +
                std::filesystem::path(VIBRATOR_SIM).parent_path().string() + "\n" + got;
        std::istringstream lines(wanted);
        for (std::string line; std::getline(lines, line);) {
            const size_t prompt = line.find("$ ");
            if (line.rfind("## ", 0) == 0) got += "\n" + line + "\n";
            if (prompt == std::string::npos || line.find_first_not_of("0123456789") != prompt)
                continue;
            got += line + "\n";
            const uid_t uid = prompt == 0 ? geteuid() : static_cast<uid_t>(std::stoul(line));
            const Outcome outcome =
                    runProgram({"/bin/bash", "-c", prelude + line.substr(prompt + 2), client}, uid);
            got += marked(outcome.output, "") + marked(outcome.errors, "! ");
            if (outcome.exitCode != 0) got += "[" + std::to_string(outcome.exitCode) + "]\n";
        }
        if (got == wanted) return;
        const std::string gotFile = mDirectory.path() + "/transcript.txt";
        std::ofstream(gotFile) << got;
        FAIL() << runProgram({"/usr/bin/diff", "-U1", file, gotFile}).output;
    }
};

TEST_F(TranscriptTest, Calls) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can be another user";
    createDriver();
    start();
    expectAsIn("tools/transcript.txt");
}

TEST_F(TranscriptTest, Tools) {
    createDriver();
    start();
    expectAsIn("tools/tools.txt");
}

class SimulatorTranscriptTest : public TranscriptTest {
    /** Anybody may simulate a driver. */
    void SetUp() override {}
};

TEST_F(SimulatorTranscriptTest, Simulator) {
    expectAsIn("simulator/transcript.txt");
}

}  // namespace
