// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Folder.h"
#include "Input.h"
#include "text/Text.h"
#include "traffic/AccessReader.h"
#include "traffic/Picture.h"
#include "traffic/TextPlot.h"

#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <iostream>
#include <limits>
#include <sstream>

namespace vibratorctl {

namespace {

namespace fs = std::filesystem;

/** Checks that a file may be written in place of what it is now, and is not the input. */
void checkTarget(const std::string& file, const std::string& input) {
    std::error_code error;
    if (!fs::exists(file, error)) return;
    if (!fs::is_regular_file(file, error)) {
        throw cli::UsageError(file + ": is no regular file; -o - writes to standard output");
    }
    if (fs::equivalent(file, input == "-" ? "/dev/stdin" : input, error)) {
        throw cli::UsageError(file + ": is the input, too");
    }
}

/** Writes a file whole or not at all; where its name is a link, what that leads to. */
void writeWhole(const std::string& file, const std::string& bytes) {
    std::error_code none;
    const bool isNew = !fs::exists(file, none);
    const fs::path target = isNew ? fs::absolute(file) : fs::canonical(file, none);
    const mode_t mask = umask(0);
    umask(mask);
    const simulator::Folder folder(target.parent_path());
    const mode_t mode = isNew ? 0666 & ~mask : folder.mode(target.filename()) & 07777;
    const int error = folder.replace(target.filename(), bytes, mode);
    if (error != 0) throw std::runtime_error(file + ": cannot be written: " + strerror(error));
}

/** @return whether the user's locale has only the characters of ASCII. */
bool isAsciiLocale() {
    for (const char* name : {"LC_ALL", "LC_CTYPE", "LANG"}) {
        const char* value = getenv(name);
        if (value == nullptr || *value == '\0') continue;
        return strcmp(value, "C") == 0 || strcmp(value, "POSIX") == 0;
    }
    return false;
}

Timeline readTimeline(const std::string& file) {
    AccessReader reader;
    std::vector<NodeAccess> accesses;
    std::istringstream lines(readInput(file));
    for (std::string line; std::getline(lines, line);) {
        if (const auto access = reader.read(line)) accesses.push_back(*access);
    }
    const std::string clock = accesses.empty() ? "" : accesses[0].clock;
    if (clock.find(':') < clock.size() && clock.find('.') > clock.size()) {
        throw cli::UsageError(file +
                              ": its times are whole seconds, in which calls cannot be told "
                              "apart; plot what this prints: journalctl -u vibrator -o "
                              "short-precise");
    }
    Timeline timeline = makeTimeline(accesses);
    if (!timeline.marks.empty()) return timeline;
    throw cli::UsageError(file +
                          ": no write to the driver in it; is it a trace, or the daemon's log?");
}

/** @return the part of a file's timeline between two times in ms, or the last ms of it. */
Timeline readPart(const std::string& file, uint32_t from, uint32_t to, uint32_t last) {
    if (last != 0 && (from != 0 || to != 0))
        throw cli::UsageError("--last goes with neither --from nor --to");
    Timeline timeline = readTimeline(file);
    const double length = timeline.end;
    cut(&timeline, last != 0 ? length - last / 1000.0 : from / 1000.0,
        to != 0 ? to / 1000.0 : std::numeric_limits<double>::max());
    if (!timeline.marks.empty() || !timeline.segments.empty()) return timeline;
    throw cli::UsageError("nothing in that time; all of it lies within " +
                          cli::durationInWords(length) + " from the first call on");
}

/** @return the format of the picture, where the name of its file or an option says it. */
PictureFormat formatOf(const std::string& name, size_t format) {
    const std::string ending = fs::path(name).extension();
    if (format == 1 || (format == 0 && (name == "-" || ending == ".svg"))) {
        return PictureFormat::kSvg;
    }
    if (format == 2 || ending == ".png") return PictureFormat::kPng;
    throw cli::UsageError(name + ": neither .svg nor .png; name one of them or give --format");
}

}  // namespace

void addPlot(Client& client) {
    cli::Command& command = client.command(kTools, "plot", "draw what the driver was told",
                                           "--last 10s -o plot.svg");
    const auto traffic = addTraffic(command);
    const auto* const output =
            command.add("-o, --output FILE", cli::kFile,
                        "picture to draw, .svg or .png, by gnuplot; - for standard "
                        "output; without it, text");
    const auto* const format = command.add("--format FORMAT",
                                           {{"auto", "as the file's name ends; SVG for -"},
                                            {"svg", "lines that stay sharp"},
                                            {"png", "pixels"}},
                                           "format of the picture", "auto");
    constexpr cli::Numbers kTimes = {"a time like 500, 500ms or 2s", 1, UINT32_MAX, "ms"};
    const auto* const from = command.add("--from TIME", kTimes, "start of the part to draw");
    const auto* const to = command.add("--to TIME", kTimes, "end of the part to draw");
    const auto* const last =
            command.add("--last TIME", kTimes, "draw only the end, of this length");
    const auto* const ascii =
            command.add("--ascii", cli::kFlag, "draw the text with the characters of ASCII alone");
    command.note("Times count from the first call on.");
    command.hasJson = false;
    command.run([=] {
        const std::string file = output->text();
        const bool isText = file.empty();
        if (isText && format->number() != 0)
            throw cli::UsageError("--format is of a picture; name its file with -o");
        const PictureFormat kind = isText ? PictureFormat::kSvg : formatOf(file, format->number());
        if (!isText && file != "-") checkTarget(file, traffic());
        const Timeline timeline = readPart(traffic(), from->number(), to->number(), last->number());
        if (isText) {
            winsize window{};
            ioctl(STDOUT_FILENO, TIOCGWINSZ, &window);
            std::cout << plotText(timeline, window.ws_col > 0 ? window.ws_col : 80U,
                                  ascii->isGiven() || isAsciiLocale());
        } else if (file == "-") {
            std::cout << drawPicture(timeline, kind);
        } else {
            writeWhole(file, drawPicture(timeline, kind));
        }
        return cli::kSuccess;
    });
}

}  // namespace vibratorctl
