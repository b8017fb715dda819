// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "support/Child.h"

#include <functional>
#include <string>
#include <vector>

/** What came of a program that has ended. */
struct Outcome {
    /** Its exit code; 128 and the signal's number where a signal ended it. */
    int exitCode;
    std::string output;
    std::string errors;
};

/** Runs a program to its end, without input, as another user where asked for. */
Outcome runProgram(const std::vector<std::string>& command, uid_t uid = geteuid());

/** Runs a function in a process of its own and another uid. @return its exit code. */
int runAs(uid_t uid, const std::function<int()>& function);

/** @return how many descriptors a process has open. */
size_t descriptorsOf(pid_t pid);

/** Waits up to ten seconds for something to become true. @return whether it has. */
bool eventually(const std::function<bool()>& condition);

/** @return what a file holds. */
std::string readFile(const std::string& path);
