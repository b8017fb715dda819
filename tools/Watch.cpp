// SPDX-License-Identifier: Apache-2.0
#include "Watch.h"

#include "NodeAccess.h"
#include "Report.h"
#include "Trace.h"

#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <iostream>
#include <thread>

namespace {

constexpr char kRed[] = "\033[31m";
constexpr char kGreen[] = "\033[32m";
constexpr char kCyan[] = "\033[36m";
constexpr char kFaint[] = "\033[2m";
constexpr char kPlain[] = "\033[0m";

/** Colours are for people's eyes, and for those who have not said no; see https://no-color.org. */
bool wantsColour() {
    const char* no = getenv("NO_COLOR");
    return isatty(STDOUT_FILENO) != 0 && (no == nullptr || *no == '\0');
}

const char* colourOf(const NodeAccess& access) {
    if (!access.error.empty()) return kRed;
    return access.kind == NodeAccess::kWrite  ? kGreen
           : access.kind == NodeAccess::kRead ? kCyan
                                              : kFaint;
}

void print(const NodeAccess& access, bool coloured) {
    constexpr const char* kKinds[] = {"probe", "read", "write"};
    char start[64];
    snprintf(start, sizeof(start), "%12.6f  ", access.time);
    char middle[64];
    snprintf(middle, sizeof(middle), "%-30s  %-5s  ", access.node.c_str(), kKinds[access.kind]);
    std::cout << (coloured ? colourOf(access) : "") << (access.time > 0 ? start : "") << middle
              << (access.kind == NodeAccess::kProbe ? "" : simulator::quote(access.bytes) + "  ")
              << (access.error.empty() ? "ok" : access.error) << (coloured ? kPlain : "")
              << std::endl;
}

}  // namespace

int watch(const WatchSource& source) {
    std::ifstream file(source.file);
    std::istream& input = source.file == "-" ? std::cin : file;
    if (source.file != "-" && !file.is_open()) {
        std::cerr << "vibratorctl: " << source.file << ": cannot be read\n";
        return kUsage;
    }
    if (source.file != "-" && !source.fromStart) file.seekg(0, std::ios::end);

    const bool coloured = wantsColour();
    TraceReader trace;
    LogReader log;
    std::string line;
    for (;;) {
        std::string more;
        std::getline(input, more);
        line += more;
        if (!input.eof()) {
            const auto access = source.isLog ? log.read(line) : trace.read(line);
            if (access) print(*access, coloured);
            line.clear();
        } else if (source.once || source.file == "-") {
            return kSuccess;
        } else {
            // The file's end, for now; half a line is kept until its rest comes.
            input.clear();
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
        }
        if (!std::cout) return kSuccess;
    }
}
