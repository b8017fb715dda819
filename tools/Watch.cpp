// SPDX-License-Identifier: Apache-2.0
#include "Watch.h"

#include "NodeAccess.h"
#include "Trace.h"
#include "cli/CommandLine.h"
#include "cli/Text.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <fstream>
#include <iomanip>
#include <iostream>
#include <optional>
#include <sstream>
#include <thread>
#include <utility>

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
    constexpr const char* kKinds[] = {"probe", "read", "write", "refused"};
    const bool isCall = access.kind == NodeAccess::kRefusal;
    const std::string name = isCall && access.node.empty() ? "a call" : access.node;
    const std::string bytes =
            access.kind == NodeAccess::kProbe ? "" : simulator::quote(access.bytes) + "  ";
    std::ostringstream line;
    if (!access.clock.empty()) line << std::setw(12) << cli::printable(access.clock) << "  ";
    line << std::left << std::setw(30) << cli::printable(name) << "  " << std::setw(7)
         << kKinds[access.kind] << "  " << bytes
         << (access.error.empty() ? "ok" : cli::printable(access.error));
    std::cout << (coloured ? colourOf(access) : "") << line.str() << (coloured ? kPlain : "")
              << std::endl;
}

/** A file that others append to, and may begin anew. */
class GrowingFile {
  public:
    explicit GrowingFile(std::string name) : mName(std::move(name)) { open(); }

    std::istream& stream() { return mFile; }

    /** Opens the file again where it is another one by now, or shorter. @return whether it did. */
    bool openIfNew() {
        struct stat now;
        if (stat(mName.c_str(), &now) != 0 || !S_ISREG(now.st_mode)) return false;
        const bool isSame = now.st_dev == mOpened.st_dev && now.st_ino == mOpened.st_ino;
        if (isSame && mFile.tellg() <= now.st_size) return false;
        mFile.close();
        open();
        return true;
    }

  private:
    void open() {
        mFile.open(mName);
        if (!mFile.is_open() || stat(mName.c_str(), &mOpened) != 0) {
            throw cli::UsageError(mName + ": cannot be read: " + strerror(errno));
        }
    }

    std::string mName;
    std::ifstream mFile;
    struct stat mOpened = {};
};

/** Prints what becomes of each line, and warns once where nothing does. */
class Printer {
  public:
    explicit Printer(const WatchSource& source) : mSource(source), mIsColoured(wantsColour()) {}

    void take(const std::string& line) {
        constexpr size_t kMany = 100;
        const auto access = mSource.isLog ? mLog.read(line) : mTrace.read(line);
        mIsKnown = mIsKnown || access;
        if (++mLines == kMany) end();
        if (access) print(*access, mIsColoured);
    }

    /** What there is has been read. */
    void end() {
        if (mIsKnown || mLines == 0) return;
        mIsKnown = true;
        std::cerr << "vibratorctl: watch: " << cli::printable(mSource.file) << ": "
                  << (mSource.isLog ? "no log of the daemon"
                                    : "no trace of the driver; for a log give --log, too")
                  << std::endl;
    }

  private:
    const WatchSource& mSource;
    bool mIsColoured;
    TraceReader mTrace;
    LogReader mLog;
    size_t mLines = 0;
    bool mIsKnown = false;
};

enum class Part { kWholeLine, kUnfinished, kEnd };

/** Reads on in a line, up to its end or the stream's, or a part of it. */
Part readPart(std::istream& input, const std::string& name, std::string* line) {
    constexpr size_t kLongest = 1 << 20;
    char part[4096];
    input.getline(part, sizeof(part));
    const auto size = static_cast<size_t>(input.gcount());
    if (input.bad()) throw cli::UsageError(name + ": cannot be read");
    const bool isWhole = input.good();
    const bool isEnd = input.eof();
    line->append(part, isWhole ? size - 1 : size);
    if (line->size() > kLongest) throw cli::UsageError(name + ": a line of more than 1 MiB");
    input.clear();
    return isWhole ? Part::kWholeLine : isEnd ? Part::kEnd : Part::kUnfinished;
}

}  // namespace

void watch(const WatchSource& source) {
    std::optional<GrowingFile> file;
    if (source.file != "-") file.emplace(source.file);
    std::istream& input = file ? file->stream() : std::cin;
    if (file && !source.fromStart) input.seekg(0, std::ios::end);
    if (!source.once) {
        std::cerr << "Waiting for " << (source.isLog ? "lines of the daemon's log" : "accesses")
                  << " in " << (file ? cli::printable(source.file) : "standard input")
                  << "; Ctrl-C ends it." << std::endl;
    }
    Printer printer(source);
    std::string line;
    while (std::cout) {
        const Part part = readPart(input, source.file, &line);
        if (part == Part::kWholeLine) {
            printer.take(line);
            line.clear();
        } else if (part == Part::kEnd) {
            if (source.once || !file) break;
            printer.end();
            // Half a line is kept until its rest comes.
            if (file->openIfNew()) line.clear();
            std::this_thread::sleep_for(std::chrono::milliseconds(50));
        }
    }
    if (!line.empty()) printer.take(line);
    printer.end();
}
