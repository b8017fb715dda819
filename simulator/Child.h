// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <functional>
#include <string>
#include <vector>

namespace session {

/** A program that this one starts; the destructor kills it. */
class Child {
  public:
    /** @param prepare called in the child before it runs the program. */
    Child(const std::vector<std::string>& command, const std::function<void()>& prepare);
    Child(const Child&) = delete;
    Child& operator=(const Child&) = delete;
    ~Child();

    void signal(int number) const;
    /** @return whether the program has ended. */
    bool hasEnded();
    /** Waits for the program's end. @return its exit code, as a shell gives it. */
    int wait();

  private:
    pid_t mPid;
    int mStatus = 0;
};

}  // namespace session
