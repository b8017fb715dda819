// SPDX-License-Identifier: Apache-2.0
#include "Child.h"

#include "text/Text.h"

#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <iostream>
#include <stdexcept>

namespace session {

Child::Child(const std::vector<std::string>& command, const std::function<void()>& prepare) {
    std::vector<char*> arguments;
    arguments.reserve(command.size() + 1);
    for (const std::string& word : command)
        arguments.push_back(const_cast<char*>(word.c_str()));
    arguments.push_back(nullptr);
    mPid = fork();
    if (mPid < 0) throw std::runtime_error(std::string("fork: ") + strerror(errno));
    if (mPid != 0) return;
    prepare();
    sigset_t none;
    sigemptyset(&none);
    sigprocmask(SIG_SETMASK, &none, nullptr);
    execvp(arguments[0], arguments.data());
    const int error = errno;
    std::cerr << program_invocation_short_name << ": run: " << cli::inQuotes(command[0]) << ": "
              << strerror(error) << std::endl;
    _exit(error == ENOENT ? 127 : 126);
}

Child::~Child() {
    signal(SIGKILL);
    wait();
}

void Child::signal(int number) const {
    if (mPid > 0) kill(mPid, number);
}

bool Child::hasEnded() {
    if (mPid > 0 && waitpid(mPid, &mStatus, WNOHANG) == mPid) mPid = -1;
    return mPid < 0;
}

int Child::wait() {
    while (mPid > 0) {
        if (waitpid(mPid, &mStatus, 0) == mPid || errno != EINTR) mPid = -1;
    }
    return WIFSIGNALED(mStatus) ? 128 + WTERMSIG(mStatus) : WEXITSTATUS(mStatus);
}

}  // namespace session
