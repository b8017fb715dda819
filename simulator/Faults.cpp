// SPDX-License-Identifier: Apache-2.0
#include "Faults.h"

#include <fcntl.h>
#include <sys/file.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace simulator {
namespace {

constexpr char kPrefix[] = "fault.";

std::string fileName(const std::string& leaf, const std::string& operation) {
    return kPrefix + leaf + "." + operation;
}

std::vector<std::string> faultFiles(const Folder& folder) {
    std::vector<std::string> names;
    for (const std::string& name : folder.names()) {
        if (name.find(kPrefix) == 0) names.push_back(name);
    }
    return names;
}

std::string inWords(const Fault& fault) {
    return std::to_string(fault.error) + ' ' + std::to_string(fault.bytes) + ' ' +
           std::to_string(fault.times) + ' ' + std::to_string(fault.after) + '\n';
}

std::optional<Fault> fromWords(const std::string& text) {
    Fault fault;
    const int fields = sscanf(text.c_str(), "%d %zu %u %u", &fault.error, &fault.bytes,
                              &fault.times, &fault.after);
    return fields == 4 ? std::optional(fault) : std::nullopt;
}

/** Reads a fault from its file, and counts this time in the file. */
std::optional<Fault> countDown(int file) {
    char text[64] = {};
    if (pread(file, text, sizeof(text) - 1, 0) < 0) return std::nullopt;
    const std::optional<Fault> fault = fromWords(text);
    if (!fault || (fault->times == 0 && fault->after == 0)) return fault;

    Fault left = *fault;
    const bool happens = fault->after == 0;
    --(happens ? left.times : left.after);
    // The file of a fault that is used up is empty.
    const std::string words = happens && left.times == 0 ? "" : inWords(left);
    if (ftruncate(file, 0) != 0 || pwrite(file, words.data(), words.size(), 0) < 0) return fault;
    return happens ? fault : std::nullopt;
}

}  // namespace

std::optional<Fault> parseFault(const std::string& text) {
    Fault fault;
    char digits[7];
    int end = 0;
    if (sscanf(text.c_str(), "short=%6[0-9]%n", digits, &end) == 1 &&
        static_cast<size_t>(end) == text.size()) {
        fault.bytes = strtoul(digits, nullptr, 10);
        return fault;
    }
    constexpr int kLargestErrno = 133;
    for (fault.error = 1; fault.error <= kLargestErrno; ++fault.error) {
        const char* name = strerrorname_np(fault.error);
        if (name != nullptr && text == name) return fault;
    }
    return std::nullopt;
}

bool setFault(const Folder& directory, const std::string& leaf, const std::string& operation,
              const std::optional<Fault>& fault) {
    if (fault) return directory.replace(fileName(leaf, operation), inWords(*fault), 0644) == 0;
    directory.remove(fileName(leaf, operation));
    return directory.error() == 0;
}

std::optional<Fault> takeFault(const Folder& directory, const std::string& leaf,
                               const std::string& operation) {
    const UniqueFd file = directory.open(fileName(leaf, operation), O_RDWR);
    return flock(file.get(), LOCK_EX) == 0 ? countDown(file.get()) : std::nullopt;
}

std::vector<std::string> listFaults(const Folder& directory) {
    std::vector<std::string> lines;
    for (const std::string& name : faultFiles(directory)) {
        const auto fault = fromWords(directory.read(name));
        if (!fault) continue;
        std::string line = name.substr(strlen(kPrefix));
        line.replace(line.rfind('.'), 1, " ");
        line += fault->error != 0 ? std::string(" ") + strerrorname_np(fault->error)
                                  : " short=" + std::to_string(fault->bytes);
        if (fault->times > 0) line += ", " + std::to_string(fault->times) + " times";
        if (fault->after > 0) line += ", after " + std::to_string(fault->after);
        lines.push_back(line);
    }
    return lines;
}

int clearFaults(const Folder& directory) {
    for (const std::string& name : faultFiles(directory))
        directory.remove(name);
    return directory.error();
}

}  // namespace simulator
