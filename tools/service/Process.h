// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/stat.h>
#include <sys/types.h>

#include <optional>
#include <string>
#include <vector>

namespace vibratorctl {

/** A process, as the kernel tells of it in /proc. */
struct Process {
    pid_t pid = 0;
    uid_t uid = 0;
    /** The group of its files first. */
    std::vector<gid_t> groups = {};
    /** Whether the owners and modes of files do not bind it, as they do not bind root. */
    bool overridesModes = false;
    /** As in /proc/PID/stat: 'T' is stopped. */
    char state = '?';
    /** The program, as it was called. */
    std::string program = {};

    /** @return whether it may open a file of a driver. @param how S_IROTH or S_IWOTH. */
    bool mayOpen(const struct stat& file, mode_t how) const;
    /** @return "pid 812, uid 997". */
    std::string inWords() const;
};

/** @return a process; nothing where it is not seen. */
std::optional<Process> readProcess(pid_t pid);

/** @return the process that asks. */
Process thisProcess();

/** @return the processes that run the service's program. */
std::vector<Process> findServers();

}  // namespace vibratorctl
