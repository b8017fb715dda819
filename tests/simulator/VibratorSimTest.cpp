// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/wait.h>

#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>

namespace {

namespace fs = std::filesystem;

class VibratorSimTest : public ::testing::Test {
  protected:
    TemporaryDirectory mDirectory;
};

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
        Child session;
        session.startProgram({VIBRATOR_SIM, "run", "bash", "-c", script, ready});
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

TEST_F(VibratorSimTest, DirectoryIsLookedUpOnce) {
    const std::string directory = mDirectory.path() + "/driver";
    const std::string link = mDirectory.path() + "/link";
    const std::string victim = mDirectory.path() + "/victim";
    for (const std::string& each : {directory, victim})
        fs::create_directory(each);
    std::ofstream(victim + "/log") << "precious";
    fs::create_symlink(victim, link);
    // Somebody exchanges the directory for a link while it is made a driver's.
    Child other;
    other.start([&] {
        for (;;)
            renameat2(AT_FDCWD, directory.c_str(), AT_FDCWD, link.c_str(), RENAME_EXCHANGE);
    });
    for (int i = 0; i < 40; ++i)
        runProgram({VIBRATOR_SIM, "run", "--dir", directory, "true"});
    EXPECT_EQ(readFile(victim + "/log"), "precious");
    EXPECT_FALSE(fs::exists(victim + "/sys"));
}

}  // namespace
