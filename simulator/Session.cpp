// SPDX-License-Identifier: Apache-2.0
#include "Session.h"

#include "TraceFile.h"
#include "text/Text.h"

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <functional>
#include <iostream>
#include <stdexcept>

namespace simulator {
namespace {

namespace fs = std::filesystem;

constexpr char kDaemon[] = "vendor.velmora.hardware.vibrator@2.1-service";
constexpr char kPreload[] = "libvibrator_sim.so";

std::string failure(const std::string& what) {
    return what + ": " + strerror(errno);
}

/** @return a file that belongs to this program, beside it or where it is built or installed. */
fs::path findProgram(const std::string& name, const std::vector<const char*>& places) {
    const fs::path own = fs::read_symlink("/proc/self/exe").parent_path();
    for (const char* place : places) {
        fs::path path = (own / place / name).lexically_normal();
        if (access(path.c_str(), R_OK) == 0) return path;
    }
    throw std::runtime_error(name +
                             " is neither beside vibrator-sim nor where it is built or installed");
}

/** A program that this one starts; the destructor kills it. */
class Child {
  public:
    /** @param prepare called in the child before it runs the program. */
    Child(const std::vector<std::string>& command, const std::function<void()>& prepare) {
        std::vector<char*> arguments;
        arguments.reserve(command.size() + 1);
        for (const std::string& word : command)
            arguments.push_back(const_cast<char*>(word.c_str()));
        arguments.push_back(nullptr);
        mPid = fork();
        if (mPid < 0) throw std::runtime_error(failure("fork"));
        if (mPid != 0) return;
        prepare();
        sigset_t none;
        sigemptyset(&none);
        sigprocmask(SIG_SETMASK, &none, nullptr);
        execvp(arguments[0], arguments.data());
        const int error = errno;
        std::cerr << "vibrator-sim: run: " << cli::inQuotes(command[0]) << ": " << strerror(error)
                  << std::endl;
        _exit(error == ENOENT ? 127 : 126);
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;
    ~Child() {
        signal(SIGKILL);
        wait();
    }

    void signal(int number) const {
        if (mPid > 0) kill(mPid, number);
    }
    /** @return whether the program has ended. */
    bool hasEnded(int options = WNOHANG) {
        if (mPid > 0 && waitpid(mPid, &mStatus, options) == mPid) mPid = -1;
        return mPid < 0;
    }
    /** Waits for the program's end. @return its exit code, as a shell gives it. */
    int wait() {
        while (!hasEnded(0) && errno == EINTR) {
        }
        return WIFSIGNALED(mStatus) ? 128 + WTERMSIG(mStatus) : WEXITSTATUS(mStatus);
    }

  private:
    pid_t mPid;
    int mStatus = 0;
};

/** A directory in /tmp; a second process removes it when this one ends, even if it is killed. */
class PrivateDirectory {
  public:
    // Not in $TMPDIR: a socket's path must be short, and a preloaded library's without blanks.
    PrivateDirectory() {
        if (mkdtemp(mPath.data()) == nullptr) throw std::runtime_error(failure(mPath));
        // Its input ends when this process does. A dying daemon may still add files, so it retries.
        const std::string remover =
                "exec >/dev/null 2>&1; cat; for attempt in 1 2 3 4 5; do rm -rf " + mPath +
                " && break; sleep 0.2; done";
        mRemover = popen(remover.c_str(), "we");
        if (mRemover == nullptr) throw std::runtime_error(failure("sh"));
    }
    PrivateDirectory(const PrivateDirectory&) = delete;
    PrivateDirectory& operator=(const PrivateDirectory&) = delete;
    ~PrivateDirectory() { pclose(mRemover); }

    std::string operator/(const std::string& name) const { return mPath + "/" + name; }

  private:
    std::string mPath = "/tmp/vibrator-sim.XXXXXX";
    std::FILE* mRemover;
};

/** Blocks the signals that end this program or report a child's end. @return them. */
sigset_t blockSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    for (const int number : {SIGINT, SIGQUIT, SIGTERM, SIGHUP, SIGCHLD})
        sigaddset(&signals, number);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    return signals;
}

/** @return the next blocked signal; 0 if none comes for 20 ms. */
int takeSignal(const sigset_t& signals, siginfo_t* info) {
    const timespec time{0, 20'000'000};
    return std::max(sigtimedwait(&signals, info, &time), 0);
}

/** Prepares the daemon's process: its log, no signals of the terminal, the preloaded library. */
void becomeDaemon(const std::string& directory, const std::string& preload, pid_t parent) {
    setpgid(0, 0);
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent) _exit(1);
    const int log = Folder(directory).open("log", O_WRONLY | O_APPEND);
    dup2(open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
    dup2(log, STDOUT_FILENO);
    dup2(log, STDERR_FILENO);
    const char* others = getenv("LD_PRELOAD");
    setenv("LD_PRELOAD", (preload + (others == nullptr ? "" : std::string(":") + others)).c_str(),
           1);
}

std::string lastLine(std::string text) {
    text.erase(text.find_last_not_of('\n') + 1);
    return text.substr(text.rfind('\n') + 1);
}

/** Waits until the daemon answers, and checks that it has probed the simulated driver. */
void awaitDaemon(Child& daemon, const std::string& client, const std::string& directory,
                 const sigset_t& signals) {
    Child status({client, "status", "--wait", "10"}, [] {
        dup2(open("/dev/null", O_WRONLY | O_CLOEXEC), STDOUT_FILENO);
        dup2(STDOUT_FILENO, STDERR_FILENO);
    });
    while (!status.hasEnded() && !daemon.hasEnded()) {
        siginfo_t info{};
        const int number = takeSignal(signals, &info);
        if (number == 0 || number == SIGCHLD) continue;
        throw std::runtime_error(std::string("ended by ") + strsignal(number));
    }
    if (daemon.hasEnded() || status.wait() != 0) {
        throw std::runtime_error(
                std::string("the daemon ") + (daemon.hasEnded() ? "has ended" : "does not answer") +
                "; the end of its log: " + lastLine(Folder(directory).read("log")));
    }
    struct stat trace;
    if (stat(traceFile(directory).c_str(), &trace) != 0 || trace.st_size == 0) {
        throw std::runtime_error("the daemon does not use the simulated driver");
    }
}

/** Passes signals on to a command until it ends. @return its exit code. */
int awaitCommand(Child& command, const sigset_t& signals) {
    // A command that was told to end is killed after so many waits without a signal, two seconds.
    int patience = 100;
    bool isEnding = false;
    while (!command.hasEnded()) {
        siginfo_t info{};
        const int number = takeSignal(signals, &info);
        if (number == 0 && isEnding && --patience == 0) command.signal(SIGKILL);
        // The terminal has sent its signals to the command, too.
        if (number == 0 || number == SIGCHLD || info.si_code == SI_KERNEL) continue;
        command.signal(number);
        isEnding = isEnding || number == SIGTERM || number == SIGHUP;
    }
    return command.wait();
}

}  // namespace

void makeDriver(const std::string& directory, Layout layout, const Features& features) {
    const int error = createDriver(directory, layout, features);
    if (error == ENOTEMPTY) {
        throw std::runtime_error("\"" + directory +
                                 "\" is neither empty nor a driver's; name a new directory");
    }
    if (error != 0) throw std::runtime_error("\"" + directory + "\": " + strerror(error));
}

int runSession(const std::string& directory, Layout layout, const Features& features,
               std::vector<std::string> command) {
    const fs::path daemonFile = findProgram(kDaemon, {"../service", "../sbin"});
    const fs::path preload = findProgram(kPreload, {".", "../" LIBRARY_DIRECTORY});
    const fs::path client = findProgram("vibratorctl", {"../tools", "."});

    // In this order: the process that removes the directory must not get the signals either.
    const sigset_t signals = blockSignals();
    const PrivateDirectory place;
    const std::string driver =
            directory.empty() ? place / "driver" : fs::absolute(directory).string();
    makeDriver(driver, layout, features);
    const Folder folder(driver);
    folder.remove("trace");
    if (folder.replace("log", "", 0644) != 0) throw std::runtime_error(failure(driver + "/log"));
    // Links, since a path in LD_PRELOAD or PATH may have no blanks or colons.
    fs::create_symlink(preload, place / kPreload);
    fs::create_directory(place / "bin");
    fs::create_symlink(client, place / "bin/vibratorctl");
    fs::create_symlink(fs::read_symlink("/proc/self/exe"), place / "bin/vibrator-sim");
    setenv("VIBRATOR_SIM_DIR", driver.c_str(), 1);
    setenv("HWBINDER_DIR", (place / "sockets").c_str(), 1);

    const pid_t self = getpid();
    Child daemon({daemonFile}, [&] { becomeDaemon(driver, place / kPreload, self); });
    awaitDaemon(daemon, client, driver, signals);

    const char* path = getenv("PATH");
    setenv("PATH", (place / "bin:" + (path == nullptr ? "/usr/bin:/bin" : path)).c_str(), 1);
    if (command.empty()) {
        const char* shell = getenv("SHELL");
        command = {shell == nullptr || *shell == '\0' ? "/bin/sh" : shell};
        std::cerr << "vibrator-sim: the driver is in " << cli::inQuotes(driver)
                  << ", and so is the daemon's log; \"exit\" ends the daemon\n";
    }
    Child child(command, [] { prctl(PR_SET_PDEATHSIG, SIGHUP); });
    return awaitCommand(child, signals);
}

}  // namespace simulator
