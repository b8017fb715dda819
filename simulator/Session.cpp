// SPDX-License-Identifier: Apache-2.0
#include "Session.h"

#include "Folder.h"
#include "SimulatedDriver.h"
#include "text/Text.h"

#include <fcntl.h>
#include <sys/prctl.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iostream>
#include <stdexcept>

namespace session {
namespace {

namespace fs = std::filesystem;
using simulator::Folder;

constexpr char kDaemon[] = "vendor.velmora.hardware.vibrator@2.1-service";

/** Blocks the signals that end this program or report a child's end. @return them. */
sigset_t blockSignals() {
    sigset_t signals;
    sigemptyset(&signals);
    for (const int number : {SIGINT, SIGQUIT, SIGTERM, SIGHUP, SIGCHLD})
        sigaddset(&signals, number);
    sigprocmask(SIG_BLOCK, &signals, nullptr);
    return signals;
}

/** Begins the trace and the log of a driver. @param name the directory as the user knows it. */
void beginLog(const Folder& directory, const std::string& name) {
    if (!simulator::isMarked(directory)) {
        throw std::runtime_error(cli::inQuotes(name) + " is no longer a driver's");
    }
    directory.remove("trace");
    const int error = directory.replace("log", "", 0644);
    if (error != 0) throw std::runtime_error(cli::inQuotes(name + "/log") + ": " + strerror(error));
}

/** @return the user's shell. */
std::string shell() {
    const char* name = getenv("SHELL");
    return name == nullptr || *name == '\0' ? "/bin/sh" : name;
}

/** Prepares the daemon's process: its log, no signals of the terminal. */
void becomeDaemon(const Folder& directory, pid_t parent) {
    setpgid(0, 0);
    umask(0022);
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (getppid() != parent) _exit(1);
    const int log = directory.open("log", O_WRONLY | O_APPEND).release();
    dup2(open("/dev/null", O_RDONLY | O_CLOEXEC), STDIN_FILENO);
    dup2(log, STDOUT_FILENO);
    dup2(log, STDERR_FILENO);
}

/** @return a word that a shell reads as this text. */
std::string quoteForShell(const std::string& text) {
    std::string quoted = "'";
    for (const char c : text)
        quoted += c == '\'' ? "'\\''" : std::string(1, c);
    return quoted + "'";
}

std::string lastLine(std::string text) {
    text.erase(text.find_last_not_of('\n') + 1);
    return text.substr(text.rfind('\n') + 1);
}

}  // namespace

std::string findProgram(const std::string& name, const std::vector<const char*>& places) {
    const fs::path own = fs::read_symlink("/proc/self/exe");
    for (const char* place : places) {
        fs::path path = (own.parent_path() / place / name).lexically_normal();
        if (access(path.c_str(), R_OK) == 0) return path;
    }
    throw std::runtime_error(name + " is neither beside " + own.filename().string() +
                             " nor where it is built or installed");
}

std::string exportLines() {
    const char* driver = getenv("VIBRATOR_SIM_DIR");
    const char* sockets = getenv("HWBINDER_DIR");
    if (driver == nullptr || sockets == nullptr) return "";
    const fs::path programs = fs::path(sockets).parent_path() / "bin";
    if (!fs::exists(programs)) return "";
    return "export VIBRATOR_SIM_DIR=" + quoteForShell(driver) +
           " HWBINDER_DIR=" + quoteForShell(sockets) +
           (getenv("HWBINDER_DEVICE") == nullptr ? "" : " HWBINDER_DEVICE=") +
           "\nexport PATH=" + quoteForShell(programs) + ":\"$PATH\"\n";
}

Session::Session()
    : mDaemon(findProgram(kDaemon, {"../service", "../sbin"})),
      mClient(findProgram("vibratorctl", {"../tools", "."})),
      mSignals(blockSignals()) {}

/** @return the next blocked signal; 0 if none comes for 20 ms, where it does not wait longer. */
int Session::takeSignal(siginfo_t* info, bool waits) const {
    const timespec time{0, 20'000'000};
    return std::max(sigtimedwait(&mSignals, info, waits ? nullptr : &time), 0);
}

/** Waits until the daemon answers, and checks that it has probed the driver. */
void Session::awaitDaemon(Child& daemon, const Folder& directory) const {
    Child status({mClient, "status", "--wait", "10"}, [] {
        dup2(open("/dev/null", O_WRONLY | O_CLOEXEC), STDOUT_FILENO);
        dup2(STDOUT_FILENO, STDERR_FILENO);
    });
    while (!status.hasEnded() && !daemon.hasEnded()) {
        siginfo_t info{};
        const int number = takeSignal(&info, true);
        if (number == 0 || number == SIGCHLD) continue;
        throw std::runtime_error(std::string("ended by ") + strsignal(number));
    }
    if (daemon.hasEnded() || status.wait() != 0) {
        throw std::runtime_error(std::string("the daemon ") +
                                 (daemon.hasEnded() ? "has ended" : "does not answer") +
                                 "; the end of its log: " + lastLine(directory.read("log")));
    }
    const simulator::UniqueFd trace = directory.open("trace", O_RDONLY);
    struct stat info;
    if (fstat(trace.get(), &info) != 0 || info.st_size == 0) {
        throw std::runtime_error("the daemon does not use this driver");
    }
}

/** Passes signals on to a command until it ends. @return its exit code. */
int Session::awaitCommand(Child& command, Child& daemon, const Driver& driver) const {
    // A command that was told to end is killed after so many waits without a signal, two seconds.
    int patience = 100;
    bool isEnding = false;
    bool isServed = true;
    while (!command.hasEnded()) {
        siginfo_t info{};
        const int number = takeSignal(&info, !isEnding);
        if (number == 0 && isEnding && --patience == 0) command.signal(SIGKILL);
        if (number == SIGCHLD && isServed && daemon.hasEnded()) {
            isServed = false;
            driver.whenEnded();
        }
        // The terminal has sent its signals to the command, too.
        if (number == 0 || number == SIGCHLD || info.si_code == SI_KERNEL) continue;
        command.signal(number);
        isEnding = isEnding || number == SIGTERM || number == SIGHUP;
    }
    return command.wait();
}

/** Makes links to the programs, since a path in PATH may have no colons. */
void Session::linkPrograms() const {
    const fs::path programs = mPlace / "bin";
    fs::create_directory(programs);
    fs::permissions(programs, static_cast<fs::perms>(0755));
    fs::create_symlink(mClient, programs / "vibratorctl");
    fs::create_symlink(fs::read_symlink("/proc/self/exe"),
                       programs / program_invocation_short_name);
}

/** Leads this process's children to the driver, the sockets and, if they look, the programs. */
void Session::setEnvironment(const std::string& directory) const {
    setenv("VIBRATOR_SIM_DIR", directory.c_str(), 1);
    setenv("HWBINDER_DIR", (mPlace / "sockets").c_str(), 1);
    // It counts more than the directory of the sockets.
    if (getenv("HWBINDER_DEVICE") != nullptr) setenv("HWBINDER_DEVICE", "", 1);
    const char* path = getenv("PATH");
    setenv("PATH", (mPlace / "bin:" + (path == nullptr ? "/usr/bin:/bin" : path)).c_str(), 1);
}

int Session::run(const Driver& driver, std::vector<std::string> command) {
    const Folder folder(driver.directory);
    beginLog(folder, driver.directory);
    linkPrograms();
    setEnvironment(driver.directory);

    const pid_t self = getpid();
    Child daemon({mDaemon}, [&] {
        becomeDaemon(folder, self);
        driver.prepare();
    });
    awaitDaemon(daemon, folder);

    if (command.empty()) {
        command = {shell()};
        std::cerr << driver.banner << "The driver's trace and the daemon's log are in "
                  << cli::inQuotes(driver.directory)
                  << ".\nIn a second terminal, to use them from there, too:\n"
                  << exportLines() << "\"exit\" ends the daemon.\n";
    }
    Child child(command, [] { prctl(PR_SET_PDEATHSIG, SIGHUP); });
    return awaitCommand(child, daemon, driver);
}

}  // namespace session
