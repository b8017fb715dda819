// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <gtest/gtest.h>
#include <sys/wait.h>

#include <csignal>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <string>
#include <vector>

namespace {

namespace fs = std::filesystem;
using Words = std::vector<std::string>;

constexpr char kDaemon[] = "vendor.velmora.hardware.vibrator@2.1-service";

class VibratorSimTest : public ::testing::Test {
  protected:
    VibratorSimTest() {
        setenv("VIBRATOR_SIM_DIR", mDriver.c_str(), 1);
        // A sanitizer's own library does not come first in a process with a preloaded one.
        setenv("ASAN_OPTIONS", "verify_asan_link_order=0", 1);
    }
    ~VibratorSimTest() override { unsetenv("VIBRATOR_SIM_DIR"); }

    static Outcome run(Words words, const std::string& program = VIBRATOR_SIM) {
        words.insert(words.begin(), program);
        return runProgram(words);
    }
    static Outcome runShell(const std::string& script, const std::string& argument = {}) {
        return runProgram({"/bin/bash", "-c", script, VIBRATOR_SIM, argument});
    }
    /** Copies the programs to another folder, as they are built. */
    static void copyPrograms(const fs::path& folder) {
        for (const fs::path file : {VIBRATOR_SIM, PRELOAD, VIBRATORCTL, SERVICE}) {
            const fs::path place = folder / file.parent_path().filename();
            fs::create_directories(place);
            fs::copy(file, place);
        }
    }

    TemporaryDirectory mDirectory;
    std::string mDriver = mDirectory.path() + "/driver";
};

TEST_F(VibratorSimTest, MistakesAreNamedInOneLine) {
    ASSERT_EQ(run({"create"}).exitCode, 0);
    const struct {
        Words words;
        int code;
        const char* complaint;
    } cases[] = {
            {{}, 2, "no command; "},
            {{"shoow"}, 2, "no command \"shoow\"; did you mean \"show\"?"},
            {{"show", "\x1b[2J\xc2\x9b"}, 2, "show: \"\\x1b[2J\\xc2\\x9b\" is one argument"},
            {{"create", "--motor", "LINEAR_1041"}, 2, "create: --motor: \"LINEAR_1041\" is not "},
            {{"create", "--layout", "usb"}, 2, "create: --layout: \"usb\" is not led or timed"},
            {{"create", "--waves", "0x10"}, 2, "create: --waves: \"0x10\" is not a number of "},
            {{"create", "--features", "fold,prebakd"}, 2, "did you mean \"prebaked\"?"},
            {{"run", "--layot", "led"}, 2, "run: no option \"--layot\"; did you mean \"--layout\""},
            {{"fault", "intensty", "write", "EIO"}, 2, "no node \"intensty\"; did you mean "},
            {{"fault", "../x", "write", "EIO"}, 2, "no node \"../x\""},
            {{"fault", "intensity", "wirte", "EIO"}, 2, "did you mean \"write\"?"},
            {{"fault", "intensity", "write", "EOOPS"}, 2, "\"EOOPS\" is no fault: an errno's "},
            {{"fault", "intensity", "write", "short=x"}, 2, "\"short=x\" is no fault"},
            {{"fault", "intensity", "write"}, 2, "\"\" is no fault"},
            {{"fault", "intensity", "write", "EIO", "--times", "0"}, 2, "--times: \"0\" is not "},
            {{"fault", "intensity", "--clear"}, 2, "fault: --clear takes no NODE"},
            {{"show", "--dir", "/no/such"}, 1, "show: \"/no/such\" has no simulated driver: No "},
            {{"trace", "--dir", "/"}, 1, "trace: \"/\" has no simulated driver"},
            {{"fault", "--clear", "--dir", "/"}, 1, "fault: \"/\" has no simulated driver"},
            {{"create", "--dir", "/dev/null/x"}, 1, "create: \"/dev/null/x\": Not a directory"},
    };
    for (const auto& [words, code, complaint] : cases) {
        const Outcome outcome = run(words);
        EXPECT_EQ(outcome.exitCode, code) << complaint;
        EXPECT_EQ(outcome.output, "") << complaint;
        EXPECT_EQ(outcome.errors.find("vibrator-sim: "), 0U) << outcome.errors;
        EXPECT_EQ(outcome.errors.find('\n'), outcome.errors.size() - 1) << outcome.errors;
        EXPECT_NE(outcome.errors.find(complaint), std::string::npos) << outcome.errors;
    }
    unsetenv("VIBRATOR_SIM_DIR");
    EXPECT_EQ(run({"show"}).errors,
              "vibrator-sim: show: no directory of a driver; name one with --dir or "
              "VIBRATOR_SIM_DIR\n");
    EXPECT_EQ(runShell("\"$0\" help >/dev/full").exitCode, 1);
    EXPECT_EQ(run({"run", "--help"}).output, run({"help", "run"}).output);
}

TEST_F(VibratorSimTest, FaultsAreListedAndCleared) {
    ASSERT_EQ(run({"create"}).exitCode, 0);
    EXPECT_EQ(run({"fault"}).output, "");
    run({"fault", "state", "open", "ENOENT"});
    run({"fault", "intensity", "write", "short=2", "--times", "3", "--after", "4"});
    run({"fault", "activate", "write", "EIO"});
    EXPECT_EQ(run({"fault", "activate", "write", "none"}).exitCode, 0);
    EXPECT_EQ(run({"fault"}).output,
              "intensity write short=2, 3 times, after 4\nstate open ENOENT\n");
    EXPECT_EQ(run({"fault", "--clear"}).exitCode, 0);
    EXPECT_EQ(run({"fault"}).output, "");
    run({"fault", "state", "open", "ENOENT"});
    run({"create"});
    EXPECT_EQ(run({"fault"}).output, "") << "a new driver has none";
}

TEST_F(VibratorSimTest, OthersFilesAreLeftAlone) {
    const std::string victim = mDirectory.path() + "/victim";
    std::ofstream(victim) << "precious";
    const struct {
        const char* harm;
        int code;
    } cases[] = {
            {"mkdir -p \"$1/faults\"; touch \"$1/faults/mine\"", 1},
            {"mkdir \"$1\"; touch \"$1/.hidden\"", 1},
            {"ln -s victim \"$1\"", 1},
            {"mkdir \"$1\"", 0},
            {"\"$0\" create && rm -r \"$1/sys\" && ln -s / \"$1/sys\"", 1},
            {"\"$0\" create && ln -sf ../../../../../victim "
             "\"$1/sys/class/leds/vibrator/intensity\"",
             0},
            {"\"$0\" create && ln -s ../victim \"$1/fault.intensity.write\" && "
             "\"$0\" fault intensity write EIO",
             0},
            {"\"$0\" create && ln -s ../victim \"$1/trace\" && ln -s ../victim \"$1/log\" && "
             "\"$0\" run --dir \"$1\" vibratorctl on 5",
             0},
    };
    for (const auto& [harm, code] : cases) {
        fs::remove_all(mDriver);
        ASSERT_EQ(runShell(harm, mDriver).exitCode, 0) << harm;
        const std::string before = runShell("find \"$1\"", mDriver).output;
        const Outcome outcome = run({"create"});
        EXPECT_EQ(outcome.exitCode, code) << harm << outcome.errors;
        const std::string after = runShell("find \"$1\"", mDriver).output;
        EXPECT_TRUE(code == 0 || after == before) << harm << after;
        EXPECT_EQ(readFile(victim), "precious") << harm;
    }
}

TEST_F(VibratorSimTest, FilesHaveTheirModesWhateverTheUmask) {
    for (const char* umask : {"000", "077"}) {
        const Outcome outcome = runShell(
                "umask $1; \"$0\" run bash -c 'vibratorctl on 5; vibrator-sim fault state read EIO;"
                "cd \"$VIBRATOR_SIM_DIR\"; stat -c \"%a %n\" .vibrator-sim fault.state.read log "
                "sys/class/leds/vibrator/{.deadline,activate,num_waves}'",
                umask);
        EXPECT_EQ(outcome.output.substr(outcome.output.find('\n') + 1),
                  "644 .vibrator-sim\n644 fault.state.read\n644 log\n"
                  "644 sys/class/leds/vibrator/.deadline\n644 sys/class/leds/vibrator/activate\n"
                  "444 sys/class/leds/vibrator/num_waves\n")
                << outcome.errors;
    }
}

TEST_F(VibratorSimTest, RunGivesTheCommandsExitCodeAndLeavesNothing) {
    const struct {
        Words words;
        int code;
        const char* output;
    } cases[] = {
            {{"true"}, 0, ""},
            {{"--", "bash", "-c", "exit 7"}, 7, ""},
            {{"bash", "-c", "kill -9 $$"}, 137, ""},
            {{"/no/such"}, 127, ""},
            {{"/etc/passwd"}, 126, ""},
            {{"vibratorctl", "on", "soon"}, 2, ""},
            {{"--layout", "timed", "--motor", "COINDC", "--features", "motor-name", "bash", "-c",
              "vibratorctl on 0 >&2; vibrator-sim show"},
             0,
             "/sys/class/timed_output/vibrator/enable \"0\\n\"\n"
             "/sys/class/timed_output/vibrator/motor_type \"COINDC\\n\"\n"},
    };
    for (const auto& [words, code, output] : cases) {
        Words all = {"run"};
        all.insert(all.end(), words.begin(), words.end());
        const Outcome outcome = run(all);
        EXPECT_EQ(outcome.exitCode, code) << words.front() << outcome.errors;
        EXPECT_EQ(outcome.output, output) << words.front();
    }
    setenv("SHELL", "/bin/echo", 1);
    const Outcome shell = run({"run"});
    EXPECT_EQ(shell.output, "\n");
    const std::string place = shell.errors.substr(shell.errors.find("/tmp/"), 24);
    EXPECT_FALSE(fs::exists(place)) << shell.errors;
    EXPECT_FALSE(fs::exists(mDriver)) << "a driver of its own";
}

TEST_F(VibratorSimTest, RunIsNotMisledByPaths) {
    const fs::path folder = mDirectory.path() + "/a b:c\nd";
    copyPrograms(folder);
    const std::string program = folder / "simulator/vibrator-sim";
    const std::string driver = folder / "e f:g\nh";
    const Outcome outcome = run({"run", "--dir", driver, "vibratorctl", "on", "5"}, program);
    EXPECT_EQ(outcome.exitCode, 0) << outcome.errors;
    EXPECT_NE(readFile(driver + "/trace").find("leds/duration write \"5\\n\" = 2"),
              std::string::npos);
    EXPECT_NE(readFile(driver + "/log").find("Vibrator using LED trigger"), std::string::npos);

    // A library that is not loaded, or a daemon that does not live, is noticed before the command.
    const std::pair<std::string, const char*> harms[] = {
            {"simulator/libvibrator_sim.so", "run: the daemon does not use the simulated driver"},
            {std::string("service/") + kDaemon, "run: the daemon has ended; the end of its log: "}};
    for (const auto& [file, complaint] : harms) {
        fs::remove(folder / file);
        fs::copy("/bin/false", folder / file);
        const Outcome harmed = run({"run", "echo", "reached"}, program);
        EXPECT_EQ(harmed.exitCode, 1);
        EXPECT_EQ(harmed.output, "");
        EXPECT_NE(harmed.errors.find(complaint), std::string::npos) << harmed.errors;
    }
    fs::remove(folder / "tools/vibratorctl");
    EXPECT_NE(run({"run", "true"}, program).errors.find("vibratorctl is neither"),
              std::string::npos);
}

TEST_F(VibratorSimTest, RunCleansUpWhateverEndsIt) {
    const std::string ready = mDirectory.path() + "/ready";
    const struct {
        int signal;
        const char* trap;
        int code;
    } cases[] = {{SIGTERM, ":", 143},
                 {SIGINT, ":", 130},
                 {SIGHUP, ":", 129},
                 {SIGTERM, "trap '' TERM", 137},
                 {SIGKILL, ":", 137}};
    for (const auto& [signal, trap, code] : cases) {
        SCOPED_TRACE(std::string(strsignal(signal)) + " " + trap);
        // A shell starts what runs in its background with some of these ignored.
        if (signal != SIGKILL) ::signal(signal, SIG_DFL);
        // The daemon's pid stands in its log.
        // The shell is gone before a signal comes: it might take one for that of its last child.
        const std::string script = std::string(trap) +
                                   "; { grep -om1 '[0-9]*):' $VIBRATOR_SIM_DIR/log; dirname "
                                   "$HWBINDER_DIR; } >$0.new; (sleep 0.1; mv $0.new $0) & "
                                   "exec sleep 10";
        ChildProcess session;
        session.startProgram({VIBRATOR_SIM, "run", "bash", "-c", script, ready}, "/dev/null", {});
        ASSERT_TRUE(eventually([&] { return fs::exists(ready); }));
        std::ifstream file(ready);
        pid_t daemon = -1;
        std::string place;
        file >> daemon >> place >> place;
        ASSERT_GT(daemon, 0);
        kill(session.pid(), signal);
        int status = -1;
        waitpid(session.pid(), &status, 0);
        EXPECT_EQ(WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status), code);
        EXPECT_TRUE(eventually([&] { return kill(daemon, 0) != 0; }));
        EXPECT_TRUE(eventually([&] { return !fs::exists(place); })) << place;
        fs::remove(ready);
    }
}

}  // namespace
