// SPDX-License-Identifier: Apache-2.0
#include "Duration.h"
#include "Plot.h"
#include "cli/Text.h"

#include <spawn.h>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>

#include <cerrno>
#include <chrono>
#include <csignal>
#include <cstring>
#include <regex>
#include <thread>

namespace {

/** A file without a name, gone when it is closed. */
class MemoryFile {
  public:
    explicit MemoryFile(const std::string& text = {}) : mFile(memfd_create("plot", MFD_CLOEXEC)) {
        // What does not fit shows in what gnuplot makes of the rest.
        [[maybe_unused]] const ssize_t written = write(mFile, text.data(), text.size());
        lseek(mFile, 0, SEEK_SET);
    }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;
    ~MemoryFile() { close(mFile); }

    int descriptor() const { return mFile; }
    std::string text() const {
        std::string all;
        char part[65536];
        ssize_t size = 0;
        while ((size = pread(mFile, part, sizeof(part), static_cast<off_t>(all.size()))) > 0)
            all.append(part, static_cast<size_t>(size));
        return all;
    }

  private:
    int mFile;
};

/** Waits for a process, and kills it when that takes too long. @return whether it ended well. */
bool await(pid_t process) {
    constexpr auto kLongest = std::chrono::seconds(30);
    const auto deadline = std::chrono::steady_clock::now() + kLongest;
    int status = 0;
    while (waitpid(process, &status, WNOHANG) == 0) {
        if (std::chrono::steady_clock::now() > deadline) kill(process, SIGKILL);
        std::this_thread::sleep_for(std::chrono::milliseconds(5));
    }
    return status == 0;
}

std::string runGnuplot(const std::string& script, std::string* output) {
    const MemoryFile input(script);
    const MemoryFile picture;
    const MemoryFile complaints;
    posix_spawn_file_actions_t files;
    posix_spawn_file_actions_init(&files);
    posix_spawn_file_actions_adddup2(&files, input.descriptor(), STDIN_FILENO);
    posix_spawn_file_actions_adddup2(&files, picture.descriptor(), STDOUT_FILENO);
    posix_spawn_file_actions_adddup2(&files, complaints.descriptor(), STDERR_FILENO);
    char name[] = "gnuplot";
    // Without the user's own settings.
    char plain[] = "--default-settings";
    char* const arguments[] = {name, plain, nullptr};
    pid_t process = 0;
    const int error = posix_spawnp(&process, name, &files, nullptr, arguments, environ);
    posix_spawn_file_actions_destroy(&files);
    if (error == ENOENT) {
        return "gnuplot is not installed; install the package gnuplot-nox, or leave out -o for a "
               "plot in text";
    }
    if (error != 0) return std::string("gnuplot cannot be started: ") + strerror(error);
    const bool isWell = await(process);
    *output = picture.text();
    if (isWell && !output->empty()) return "";
    const std::string complaint = complaints.text();
    return "gnuplot failed: " + cli::printable(complaint.substr(0, 200));
}

/** Gives an SVG a title and a description, and dark colours for where the reader wants such. */
void describe(const Timeline& timeline, std::string* svg) {
    constexpr size_t kMostCalls = 20;
    std::string calls;
    for (size_t i = 0; i < timeline.marks.size() && i < kMostCalls; ++i) {
        calls += (i == 0 ? ": " : "; ") + timeline.marks[i].label + " at " +
                 durationInWords(timeline.marks[i].time);
    }
    const std::string note = plotNote(timeline);
    const std::string more = timeline.marks.size() > kMostCalls ? "; and more." : ".";
    const size_t start = svg->find("<title>");
    constexpr char kEnd[] = "</desc>";
    const size_t end = svg->find(kEnd, std::min(start, svg->size()));
    if (end == std::string::npos) return;
    svg->replace(start, end + strlen(kEnd) - start,
                 "<title>" + plotTitle(timeline) + "</title>\n<desc>Strength over time" + calls +
                         more + (note.empty() ? "" : " ") + note + "</desc>\n" +
                         "<style>@media (prefers-color-scheme: dark) "
                         "{ svg { filter: invert(1) hue-rotate(180deg) } }</style>");
    // Names of no meaning, which a reader would be told.
    *svg = std::regex_replace(*svg, std::regex("<title>gnuplot_plot_[0-9]+</title>"), "");
}

}  // namespace

std::string drawPicture(const Timeline& timeline, PictureFormat format, std::string* picture) {
    std::string error = runGnuplot(plotScript(timeline, format), picture);
    if (error.empty() && format == PictureFormat::kSvg) describe(timeline, picture);
    return error;
}
