// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

/** A child process that runs a function; the destructor kills it. */
class Child {
  public:
    template <typename Function>
    explicit Child(Function function) : mPid(fork()) {
        if (mPid == 0) {
            function();
            _exit(0);
        }
    }
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;
    ~Child() {
        kill(mPid, SIGKILL);
        waitpid(mPid, nullptr, 0);
    }

  private:
    pid_t mPid;
};
