// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "text/Text.h"
#include "traffic/AccessReader.h"

#include <fcntl.h>
#include <unistd.h>
#include <utils/UniqueFd.h>

#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <iomanip>
#include <iostream>
#include <sstream>
#include <thread>

namespace vibratorctl {

namespace {

constexpr const char* kRed = "\033[31m";
constexpr const char* kPlain = "\033[0m";
/** The kinds of accesses, and the colours of those that succeeded. */
constexpr struct {
    const char* name;
    const char* colour;
} kKinds[] = {{"probe", "\033[2m"}, {"read", "\033[36m"}, {"write", "\033[32m"}, {"refused", kRed}};

/** Values of --color. */
enum { kAuto, kAlways };

/** @return whether to use colours: by default on a terminal that has them, unless NO_COLOR is set
 * (no-color.org). */
bool wantsColour(size_t when) {
    if (when != kAuto) return when == kAlways;
    const auto variable = [](const char* name) -> std::string {
        const char* value = getenv(name);
        return value == nullptr ? "" : value;
    };
    return isatty(STDOUT_FILENO) != 0 && variable("NO_COLOR").empty() && variable("TERM") != "dumb";
}

void print(const NodeAccess& access, bool isColoured) {
    const bool isGood = access.error.empty();
    std::ostringstream line;
    if (!access.clock.empty()) line << std::setw(12) << cli::printable(access.clock) << "  ";
    line << std::left << std::setw(30)
         << (access.node.empty() ? "a call" : cli::printable(access.node)) << "  " << std::setw(7)
         << kKinds[access.kind].name << "  ";
    if (access.kind != NodeAccess::kProbe) line << cli::inQuotes(access.text) << "  ";
    line << (isGood ? "ok" : cli::printable(access.error));
    std::cout << (!isColoured ? ""
                  : isGood    ? kKinds[access.kind].colour
                              : kRed)
              << line.str() << (isColoured ? kPlain : "") << std::endl;
}

/** Shows the accesses in a file that others append to or replace, or in standard input, "-". */
class Watch {
  public:
    Watch(const Client& client, std::string file, bool isColoured)
        : mClient(client), mName(std::move(file)), mIsColoured(isColoured) {
        open();
    }

    /** Shows accesses as they come, or only those that are there. @return the exit code. */
    int run(bool fromStart, bool once) {
        const bool isInput = mName == "-";
        if (!isInput && !fromStart && !once) lseek(mFile.get(), 0, SEEK_END);
        if (!once) {
            std::cerr << "Waiting for accesses in "
                      << (isInput ? "standard input" : cli::printable(mName)) << "; Ctrl-C ends it."
                      << std::endl;
        }
        while (std::cout) {
            if (readMore()) continue;
            if (once || isInput) break;
            warnIfUnknown();
            openIfNew();
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
        }
        if (!mLine.empty()) takeLine();
        warnIfUnknown();
        return cli::kSuccess;
    }

  private:
    void open() {
        mFile.reset(mName == "-" ? dup(STDIN_FILENO) : ::open(mName.c_str(), O_RDONLY | O_CLOEXEC));
        // A directory opens, too, and says only here that it is one.
        if (!mFile.isValid() || read(mFile.get(), nullptr, 0) < 0) fail();
    }
    [[noreturn]] void fail() const {
        throw cli::UsageError(mName + ": cannot be read: " + strerror(errno));
    }

    /** Takes some of what has come; an incomplete line is kept. @return false at the end. */
    bool readMore() {
        constexpr size_t kMaxLine = 1 << 20;
        char part[65536];
        const ssize_t size = read(mFile.get(), part, sizeof(part));
        if (size < 0) fail();
        for (const char* next = part; next < part + size; ++next) {
            if (*next == '\n') {
                takeLine();
            } else {
                mLine += *next;
            }
        }
        if (mLine.size() > kMaxLine) throw cli::UsageError(mName + ": a line of more than 1 MiB");
        return size > 0;
    }

    void takeLine() {
        constexpr size_t kMany = 100;
        const auto access = mReader.read(std::exchange(mLine, {}));
        mIsKnown = mIsKnown || access;
        if (++mLines == kMany) warnIfUnknown();
        if (access) print(*access, mIsColoured);
    }

    /** Warns once, if there are lines and none of them ends an access. */
    void warnIfUnknown() {
        if (mIsKnown || mLines == 0) return;
        mIsKnown = true;
        mClient.warn("watch: " + mName +
                     ": no access of a node in it; is it a trace, or the daemon's log?");
    }

    /** Begins anew with a file that was replaced or cut. */
    void openIfNew() {
        struct stat now = {};
        struct stat opened = {};
        if (stat(mName.c_str(), &now) != 0 || !S_ISREG(now.st_mode)) return;
        fstat(mFile.get(), &opened);
        const bool isSame = now.st_dev == opened.st_dev && now.st_ino == opened.st_ino;
        if (isSame && lseek(mFile.get(), 0, SEEK_CUR) <= now.st_size) return;
        open();
        mLine.clear();
    }

    const Client& mClient;
    const std::string mName;
    const bool mIsColoured;
    ::android::UniqueFd mFile;
    AccessReader mReader;
    /** A line whose end has not come. */
    std::string mLine;
    size_t mLines = 0;
    /** Whether a line has ended an access, or the user was warned. */
    bool mIsKnown = false;
};

}  // namespace

void addWatch(Client& client) {
    cli::Command& command = client.command(kTools, "watch",
                                           "show the service's node traffic as it comes", "--once");
    const auto traffic = addTraffic(command);
    const auto* const fromStart =
            command.add("--all", cli::kFlag, "also show what is there already");
    const auto* const once = command.add("--once", cli::kFlag, "show what is there, and end");
    const auto* const colour = command.add("--color WHEN",
                                           {{"auto", "on a terminal that has colours"},
                                            {"always", "also into a file or a pipe"},
                                            {"never", "plain text"}},
                                           "use colours", "auto");
    command.note(
            "A trace does not show the calls that the service refused; the daemon's log does.");
    command.hasJson = false;
    command.run([=, &client] {
        return Watch(client, traffic(), wantsColour(colour->number()))
                .run(fromStart->isGiven(), once->isGiven());
    });
}

}  // namespace vibratorctl
