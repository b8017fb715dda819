// SPDX-License-Identifier: Apache-2.0
#include "support/Process.h"

#include <fcntl.h>
#include <grp.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <thread>

namespace {

/** Exit code of a child that could not even become what it should. */
constexpr int kNotStarted = 126;

int exitCodeOf(pid_t pid) {
    int status = 0;
    while (waitpid(pid, &status, 0) < 0 && errno == EINTR) {
    }
    return WIFSIGNALED(status) ? 128 + WTERMSIG(status) : WEXITSTATUS(status);
}

void becomeUser(uid_t uid) {
    if (uid == geteuid()) return;
    if (setgroups(0, nullptr) != 0 || setgid(uid) != 0 || setuid(uid) != 0) _exit(kNotStarted);
}

/** Becomes a program. */
[[noreturn]] void execute(const std::vector<std::string>& command) {
    std::vector<char*> arguments;
    for (const std::string& word : command)
        arguments.push_back(const_cast<char*>(word.c_str()));
    arguments.push_back(nullptr);
    execv(arguments[0], arguments.data());
    _exit(kNotStarted);
}

std::string takeText(int file) {
    std::string text(static_cast<size_t>(lseek(file, 0, SEEK_END)), '\0');
    if (pread(file, text.data(), text.size(), 0) < 0) text = "unreadable";
    close(file);
    return text;
}

}  // namespace

Outcome runProgram(const std::vector<std::string>& command, uid_t uid) {
    const int in = open("/dev/null", O_RDONLY | O_CLOEXEC);
    const int out = memfd_create("output", MFD_CLOEXEC);
    const int err = memfd_create("errors", MFD_CLOEXEC);
    const pid_t pid = fork();
    if (pid == 0) {
        dup2(in, STDIN_FILENO);
        dup2(out, STDOUT_FILENO);
        dup2(err, STDERR_FILENO);
        becomeUser(uid);
        execute(command);
    }
    const int code = exitCodeOf(pid);
    close(in);
    return {code, takeText(out), takeText(err)};
}

int runAs(uid_t uid, const std::function<int()>& function) {
    const pid_t pid = fork();
    if (pid == 0) {
        becomeUser(uid);
        _exit(function());
    }
    return exitCodeOf(pid);
}

void Child::startProgram(const std::vector<std::string>& command, const std::string& logFile) {
    const int log = open(logFile.c_str(), O_WRONLY | O_CREAT | O_APPEND, 0644);
    start([&] {
        dup2(log, STDERR_FILENO);
        execute(command);
    });
    close(log);
}

bool Child::isAlive() const {
    siginfo_t info{};
    return waitid(P_PID, static_cast<id_t>(pid()), &info, WEXITED | WNOHANG | WNOWAIT) == 0 &&
           info.si_pid == 0;
}

size_t descriptorsOf(pid_t pid) {
    const std::filesystem::directory_iterator files("/proc/" + std::to_string(pid) + "/fd");
    return static_cast<size_t>(std::distance(begin(files), end(files)));
}

size_t Child::residentKiB() const {
    std::ifstream sizes("/proc/" + std::to_string(pid()) + "/statm");
    size_t pages = 0;
    // The second number, after the size of all.
    sizes >> pages >> pages;
    return pages * static_cast<size_t>(getpagesize()) / 1024;
}

bool eventually(const std::function<bool()>& condition) {
    for (int attempt = 0; attempt < 2000; ++attempt) {
        if (condition()) return true;
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return false;
}

std::string readFile(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(path).rdbuf();
    return text.str();
}
