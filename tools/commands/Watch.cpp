// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Traffic.h"
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
    if (access.kind != NodeAccess::kProbe) line << '"' << cli::printable(access.text) << "\"  ";
    line << (isGood ? "ok" : cli::printable(access.error));
    std::cout << (!isColoured ? ""
                  : isGood    ? kKinds[access.kind].colour
                              : kRed)
              << line.str() << (isColoured ? kPlain : "") << std::endl;
}

/** Prints the access that each line ends; warns once if no line does. */
class Printer {
  public:
    Printer(const Client& client, std::string file, bool isColoured)
        : mClient(client), mFile(std::move(file)), mIsColoured(isColoured) {}

    /** Takes what has come; an incomplete line is kept until the rest comes. */
    void take(const std::string& part) {
        constexpr size_t kMaxLine = 1 << 20;
        size_t start = 0;
        for (size_t end; (end = part.find('\n', start)) != std::string::npos; start = end + 1) {
            mLine.append(part, start, end - start);
            takeLine();
        }
        mLine.append(part, start);
        if (mLine.size() > kMaxLine) {
            throw cli::UsageError(mFile + ": a line of more than 1 MiB");
        }
    }
    void forgetIncomplete() { mLine.clear(); }
    void takeIncomplete() {
        if (!mLine.empty()) takeLine();
    }

    /** Called when all that there is has been read. */
    void end() {
        if (mIsKnown || mLines == 0) return;
        mIsKnown = true;
        mClient.warn("watch: " + mFile +
                     ": no access of a node in it; is it a trace, or the daemon's log?");
    }

  private:
    void takeLine() {
        constexpr size_t kMany = 100;
        const std::string line = std::exchange(mLine, {});
        const auto access = mReader.read(line);
        mIsKnown = mIsKnown || access;
        if (++mLines == kMany) end();
        if (access) print(*access, mIsColoured);
    }

    const Client& mClient;
    const std::string mFile;
    const bool mIsColoured;
    AccessReader mReader;
    std::string mLine;
    size_t mLines = 0;
    bool mIsKnown = false;
};

/** A file that others append to or replace; or standard input, "-". */
class GrowingFile {
  public:
    explicit GrowingFile(std::string name) : mName(std::move(name)) { open(); }

    void skip() const { lseek(mFile.get(), 0, SEEK_END); }
    /** @return some of the next bytes; "" at the end. */
    std::string read() const {
        char part[65536];
        const ssize_t size = ::read(mFile.get(), part, sizeof(part));
        if (size < 0) fail();
        return {part, static_cast<size_t>(size)};
    }
    /** Opens the file again if it was replaced or cut. @return whether it did. */
    bool openIfNew() {
        struct stat now = {};
        struct stat opened = {};
        if (stat(mName.c_str(), &now) != 0 || !S_ISREG(now.st_mode)) return false;
        fstat(mFile.get(), &opened);
        const bool isSame = now.st_dev == opened.st_dev && now.st_ino == opened.st_ino;
        if (isSame && lseek(mFile.get(), 0, SEEK_CUR) <= now.st_size) return false;
        open();
        return true;
    }

  private:
    void open() {
        mFile.reset(mName == "-" ? dup(STDIN_FILENO) : ::open(mName.c_str(), O_RDONLY | O_CLOEXEC));
        // A directory opens, too, and says only here that it is one.
        if (!mFile.isValid() || ::read(mFile.get(), nullptr, 0) < 0) fail();
    }
    [[noreturn]] void fail() const {
        throw cli::UsageError(mName + ": cannot be read: " + strerror(errno));
    }

    std::string mName;
    ::android::UniqueFd mFile;
};

/** Shows accesses as they come, or only those that are there. @return the exit code. */
int watch(const Client& client, const std::string& name, bool fromStart, bool once,
          bool isColoured) {
    const bool isInput = name == "-";
    GrowingFile file(name);
    if (!isInput && !fromStart && !once) file.skip();
    if (!once) {
        std::cerr << "Waiting for accesses in "
                  << (isInput ? "standard input" : cli::printable(name)) << "; Ctrl-C ends it."
                  << std::endl;
    }
    Printer printer(client, name, isColoured);
    while (std::cout) {
        const std::string part = file.read();
        printer.take(part);
        if (!part.empty()) continue;
        if (once || isInput) break;
        printer.end();
        if (file.openIfNew()) printer.forgetIncomplete();
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    printer.takeIncomplete();
    printer.end();
    return cli::kSuccess;
}

}  // namespace

void addWatch(Client& client) {
    cli::Command& command = client.command(kTools, "watch",
                                           "show the service's node traffic as it comes", "--once");
    const auto traffic = addTraffic(command);
    const auto fromStart = command.flag("--all", "also show what is there already");
    const auto once = command.flag("--once", "show what is there, and end");
    const auto colour = command.choice("--color WHEN",
                                       {{"auto", "on a terminal that has colours"},
                                        {"always", "also into a file or a pipe"},
                                        {"never", "plain text"}},
                                       "use colours", kAuto);
    command.note(
            "A trace does not show the calls that the service refused; the daemon's log does.");
    command.withoutJson().run([=, &client] {
        return watch(client, traffic(), *fromStart, *once, wantsColour(*colour));
    });
}

}  // namespace vibratorctl
