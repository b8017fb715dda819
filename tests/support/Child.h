// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <string>
#include <vector>

/** A child process, of tests and of benchmarks; the destructor kills it. */
class Child {
  public:
    Child() = default;
    template <typename Function>
    explicit Child(const Function& function) {
        start(function);
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;
    ~Child() { kill(); }

    /** Runs a function in a process of its own. */
    template <typename Function>
    void start(const Function& function) {
        mPid = fork();
        if (mPid != 0) return;
        function();
        _exit(0);
    }
    void kill() {
        if (mPid < 0) return;
        ::kill(mPid, SIGKILL);
        while (waitpid(mPid, nullptr, 0) < 0 && errno == EINTR) {
        }
        mPid = -1;
    }
    pid_t pid() const { return mPid; }

    // In Process.cpp, which benchmarks do without:
    /** Runs a program with standard error in a file. */
    void startProgram(const std::vector<std::string>& command,
                      const std::string& logFile = "/dev/null");
    bool isAlive() const;
    /** @return the memory that the process has, in KiB. */
    size_t residentKiB() const;

  private:
    pid_t mPid = -1;
};
