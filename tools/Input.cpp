// SPDX-License-Identifier: Apache-2.0
#include "Input.h"

#include "cli/CommandLine.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <iostream>

namespace vibratorctl {

std::string readInput(const std::string& name, size_t maxMiB) {
    const size_t most = maxMiB << 20U;
    errno = 0;
    std::ifstream file(name);
    std::istream& input = name == "-" ? std::cin : file;
    std::string text;
    char block[65536];
    while (text.size() <= most && (input.read(block, sizeof(block)) || input.gcount() > 0))
        text.append(block, static_cast<size_t>(input.gcount()));
    if (text.size() > most)
        throw cli::UsageError(name + ": more than " + std::to_string(maxMiB) + " MiB");
    if (input.bad() || (name != "-" && !file.is_open())) {
        throw cli::UsageError(name + ": cannot be read: " + strerror(errno != 0 ? errno : EIO));
    }
    return text;
}

}  // namespace vibratorctl
