// SPDX-License-Identifier: Apache-2.0
#include "Patterns.h"
#include "Serve.h"
#include "ShippedPatterns.h"
#include "cli/CommandLine.h"
#include "text/Text.h"

#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>

namespace {

/** Takes the place of the shipped patterns where it is there. */
constexpr char kPatternFile[] = "/etc/vibrator/patterns";

class VibratorDriver : public cli::Program {
  public:
    VibratorDriver()
        : Program("vibrator-driver", VERSION,
                  "Offers a force-feedback motor, of a phone or a game controller, to the service "
                  "as a vibrator driver of the kernel's would be.") {
        shared().note(
                "Exit code: 0 done; 1 failed; 2 a mistake in the command line; run: that of its "
                "command.");
        addList();
        addRun();
        addServe();
        addPatterns();
    }

  private:
    /** Adds the options that say which motor, and how. @return what they say. */
    static std::function<driver::Setup()> addOptions(cli::Command& command) {
        const auto device =
                command.file("--device PATH", "the motor; not needed for the only one", "");
        const auto layout = command.choice("--layout LAYOUT",
                                           {{"timed", "the nodes of the timed output"},
                                            {"led", "the nodes of the LED trigger"}},
                                           "layout of the nodes", 0);
        const auto patterns =
                command.file("--patterns FILE", "stored patterns, instead of the usual ones", "");
        return [=] {
            const std::string file = patterns->empty() ? usualPatterns() : *patterns;
            return driver::Setup{
                    driver::chooseDevice(*device),
                    *layout == 0 ? model::Layout::kTimedOutput : model::Layout::kLedTrigger,
                    driver::parsePatterns(readPatterns(file), file)};
        };
    }
    /** @return the file of patterns where no other is asked for; "": the shipped ones. */
    static std::string usualPatterns() {
        return std::filesystem::exists(kPatternFile) ? kPatternFile : "";
    }
    static std::string readPatterns(const std::string& path) {
        if (path.empty()) return kShippedPatterns;
        std::ifstream file(path);
        if (!file || std::filesystem::is_directory(path)) {
            throw cli::UsageError(cli::inQuotes(path) + " cannot be read");
        }
        return {std::istreambuf_iterator<char>(file), {}};
    }

    void addRun() {
        cli::Command& run = command(
                "A motor", "run", "run the service on a motor, and a command or a shell beside it",
                "vibratorctl click");
        const auto setup = addOptions(run);
        const auto words =
                run.rest("COMMAND", "the command and its arguments; without one, your shell");
        run.note(
                "VIBRATOR_SIM_DIR tells the command a directory with the trace and the service's "
                "log.");
        run.run([=] { return driver::runSession(setup(), *words); });
    }

    void addServe() {
        cli::Command& serve =
                command("A motor", "serve", "serve the nodes when they are mounted", "");
        const auto setup = addOptions(serve);
        serve.run([=] {
            driver::serveMounted(setup());
            return cli::kSuccess;
        });
        cli::Command& mount = command("A motor", "mount", "mount the nodes that a process serves",
                                      "812 /run/vibrator-driver/class");
        const auto process =
                mount.number("PID", {"the number of a process", 1, 4'194'304}, "the process");
        const auto directory =
                mount.file("DIRECTORY", "where to; has what belongs into /sys/class");
        mount.run([=] {
            driver::mountNodes(static_cast<pid_t>(*process), *directory);
            return cli::kSuccess;
        });
    }

    void addPatterns() {
        command("A motor", "patterns", "print the stored patterns, to be edited", "").run([] {
            std::cout << readPatterns(usualPatterns());
            return cli::kSuccess;
        });
    }

    void addList() {
        command("A motor", "list", "list the motors of this machine and what they can do", "")
                .run([this] {
                    const std::vector<driver::Device> devices = driver::listDevices();
                    for (const driver::Device& device : devices) {
                        std::cout << device.inWords() << '\n';
                    }
                    if (devices.empty()) warn("list: this machine has no force-feedback motor");
                    return cli::kSuccess;
                });
    }
};

}  // namespace

int main(int argc, char** argv) {
    return VibratorDriver().run(argc, argv);
}
