// SPDX-License-Identifier: Apache-2.0
#include "service/Process.h"

#include <unistd.h>

#include <algorithm>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

namespace vibratorctl {
namespace {

/** How the name of the service's program begins, whatever its version. */
constexpr char kPackage[] = "vendor.velmora.hardware.vibrator@";

}  // namespace

bool Process::mayOpen(const struct stat& file, mode_t how) const {
    // The mode of a driver's attribute binds root, too: a bit that nobody has, root has not.
    mode_t mode = file.st_mode;
    const bool isOurs = std::find(groups.begin(), groups.end(), file.st_gid) != groups.end();
    const mode_t shift = overridesModes ? 0 : file.st_uid == uid ? 6 : isOurs ? 3 : 0;
    if (overridesModes) mode |= mode >> 6 | mode >> 3;
    return (mode >> shift & how) != 0;
}

std::string Process::inWords() const {
    return "pid " + std::to_string(pid) + ", uid " + std::to_string(uid);
}

std::optional<Process> readProcess(pid_t pid) {
    constexpr uint64_t kMayOverride = 1U << 1U;  // CAP_DAC_OVERRIDE
    const std::string directory = "/proc/" + std::to_string(pid) + "/";
    std::ifstream status(directory + "status");
    if (!status) return std::nullopt;
    Process process;
    process.pid = pid;
    std::getline(std::ifstream(directory + "cmdline"), process.program, '\0');
    for (std::string line; std::getline(status, line);) {
        std::istringstream words(line);
        std::string key;
        std::string real;
        words >> key;
        if (key == "State:") words >> process.state;
        if (key == "Uid:") words >> real >> process.uid;
        if (key == "Gid:") words >> real >> process.groups.emplace_back();
        for (gid_t group = 0; key == "Groups:" && words >> group;)
            process.groups.push_back(group);
        uint64_t capabilities = 0;
        if (key == "CapEff:" && words >> std::hex >> capabilities)
            process.overridesModes = (capabilities & kMayOverride) != 0;
    }
    return process;
}

Process thisProcess() {
    return readProcess(getpid()).value_or(Process{getpid(), geteuid(), {getegid()}});
}

std::vector<Process> findServers() {
    std::vector<Process> servers;
    std::error_code error;
    for (const auto& each : std::filesystem::directory_iterator("/proc", error)) {
        // What is no number is 0, which no process has.
        const auto process = readProcess(atoi(each.path().filename().c_str()));
        if (!process) continue;
        const std::string program = std::filesystem::path(process->program).filename();
        if (program.rfind(kPackage, 0) == 0) servers.push_back(*process);
    }
    return servers;
}

}  // namespace vibratorctl
