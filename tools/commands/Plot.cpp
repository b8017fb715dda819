// SPDX-License-Identifier: Apache-2.0
#include "Plot.h"

#include "Commands.h"
#include "Duration.h"
#include "Traffic.h"
#include "WholeFile.h"
#include "cli/Text.h"

#include <sys/ioctl.h>
#include <unistd.h>

#include <iostream>
#include <limits>

namespace {

struct Options {
    cli::Value<std::string> file;
    cli::Value<std::string> output;
    cli::Value<size_t> format;
    cli::Value<bool> isLog;
    cli::Value<std::string> from;
    cli::Value<std::string> to;
    cli::Value<std::string> last;
};

template <typename Reader>
Timeline read(const std::string& text) {
    Reader reader;
    TimelineMaker maker;
    for (size_t start = 0; start < text.size();) {
        const size_t end = std::min(text.find('\n', start), text.size());
        if (const auto access = reader.read(std::string_view(text).substr(start, end - start))) {
            maker.add(*access);
        }
        start = end + 1;
    }
    return maker.finish();
}

/** @return the time that an option gives, in s, or what holds without it. */
double timeOf(const char* option, const std::string& text, double without) {
    if (text.empty()) return without;
    const auto time = parseDuration(text);
    if (!time) {
        throw cli::UsageError(option + (": " + cli::inQuotes(text)) +
                              " is not a time like 10s, 500ms, 2m or 1h");
    }
    return *time;
}

void cutTo(const Options& options, Timeline* timeline) {
    const double length = timeline->end;
    double from = timeOf("--from", *options.from, 0);
    const double to = timeOf("--to", *options.to, std::numeric_limits<double>::max());
    if (!options.last->empty()) {
        if (!options.from->empty() || !options.to->empty()) {
            throw cli::UsageError("--last goes with neither --from nor --to");
        }
        from = length - timeOf("--last", *options.last, 0);
    }
    cut(timeline, from, to);
    if (timeline->marks.empty() && timeline->segments.empty()) {
        throw cli::UsageError("nothing in that time; all of it lies within " +
                              durationInWords(length) + " from the first call on");
    }
}

/** @return the format of the picture, where the name of its file or an option says it. */
PictureFormat formatOf(const Options& options) {
    const std::string& name = *options.output;
    const std::string ending = name.size() < 4 ? "" : name.substr(name.size() - 4);
    if (*options.format == 1 || (*options.format == 0 && (name == "-" || ending == ".svg"))) {
        return PictureFormat::kSvg;
    }
    if (*options.format == 0 && ending != ".png") {
        throw cli::UsageError(name + ": neither .svg nor .png; name one of them or give --format");
    }
    return PictureFormat::kPng;
}

int plot(const Client& client, const Options& options) {
    const std::string input = trafficFile(*options.file, *options.isLog);
    const std::string& output = *options.output;
    const PictureFormat format = output.empty() ? PictureFormat::kSvg : formatOf(options);
    if (!output.empty() && output != "-") checkTarget(output, input);
    const std::string text = readInput(input);
    Timeline timeline = *options.isLog ? read<LogReader>(text) : read<TraceReader>(text);
    if (timeline.marks.empty()) {
        throw cli::UsageError(input + ": no write to the driver in it; is it " +
                              (*options.isLog ? "the daemon's log?"
                                              : "a trace? For the daemon's log give --log, too"));
    }
    cutTo(options, &timeline);
    if (output.empty()) {
        winsize window{};
        const bool known = ioctl(STDOUT_FILENO, TIOCGWINSZ, &window) == 0 && window.ws_col > 0;
        std::cout << plotText(timeline, known ? window.ws_col : 80U);
        return kSuccess;
    }
    std::string picture;
    std::string error = drawPicture(timeline, format, &picture);
    if (error.empty() && output == "-") {
        std::cout << picture;
    } else if (error.empty()) {
        error = writeWhole(output, picture);
        if (!error.empty()) error = output + ": " + error;
    }
    if (error.empty()) return kSuccess;
    client.report().failure("plot", "FAILED", error);
    return kRefused;
}

}  // namespace

void addPlot(Client& client) {
    cli::Command& command = client.program().command(
            kTools, "plot", "draw what the driver was told", "--last 10s -o plot.svg");
    Options options;
    options.file = command.file("FILE",
                                "trace of the simulated driver (default: the one in "
                                "VIBRATOR_SIM_DIR), - for standard input",
                                "");
    options.output = command.file("-o,--output FILE",
                                  "picture to draw, .svg or .png, by gnuplot; - for standard "
                                  "output; without it, text",
                                  "");
    options.format = command.choice("--format FORMAT",
                                    {{"auto", "as the file's name ends; SVG for -"},
                                     {"svg", "lines that stay sharp"},
                                     {"png", "pixels"}},
                                    "of the picture", 0);
    options.isLog = command.flag("--log", "FILE is the daemon's log, as on a device");
    options.from = command.text("--from TIME", "leave out what is before, like 10s or 2m", "");
    options.to = command.text("--to TIME", "leave out what is after", "");
    options.last = command.text("--last TIME", "draw the end only", "");
    command.note("Times count from the first call on.");
    command.withoutJson().run([=, &client] { return plot(client, options); });
}
