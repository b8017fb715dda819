// SPDX-License-Identifier: Apache-2.0
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

driver::Patterns readPatterns(const std::string& path) {
    if (path.empty()) return driver::parsePatterns(kShippedPatterns, path);
    std::ifstream file(path);
    if (!file || std::filesystem::is_directory(path)) {
        throw cli::UsageError(cli::inQuotes(path) + " cannot be read");
    }
    return driver::parsePatterns({std::istreambuf_iterator<char>(file), {}}, path);
}

/** Adds the options that say which motor, and how. @return what they say. */
std::function<driver::Setup()> addOptions(cli::Command& command) {
    const auto* const device =
            command.add("--device PATH", cli::kFile, "the motor; not needed for the only one");
    const auto* const layout = command.add(
            "--layout LAYOUT",
            {{"timed", "the nodes of the timed output"}, {"led", "the nodes of the LED trigger"}},
            "layout of the nodes", "timed");
    const auto* const patterns = command.add("--patterns FILE", cli::kFile,
                                             "stored patterns, instead of the usual ones");
    return [=] {
        const bool isUsual = !patterns->isGiven() && std::filesystem::exists(kPatternFile);
        return driver::Setup{
                driver::Motor::choose(device->text()),
                layout->number() == 0 ? model::Layout::kTimedOutput : model::Layout::kLedTrigger,
                readPatterns(isUsual ? kPatternFile : patterns->text())};
    };
}

void addCommands(cli::Program& program) {
    const auto add = [&](const char* name, const char* help,
                         const char* example = "") -> cli::Command& {
        return program.command("A motor", name, help, example);
    };
    add("list", "list the motors of this machine and what they can do").run([&program] {
        const auto motors = driver::Motor::list();
        for (const auto& [number, motor] : motors)
            std::cout << motor.inWords() << '\n';
        if (motors.empty()) program.warn("list: this machine has no force-feedback motor");
        return cli::kSuccess;
    });
    cli::Command& run = add("run", "run the service on a motor, and a command or a shell beside it",
                            "vibratorctl click");
    const auto runOptions = addOptions(run);
    const auto* const words = run.add("[COMMAND...]", cli::kCommand,
                                      "the command and its arguments; without one, your shell");
    run.note(
            "VIBRATOR_SIM_DIR tells the command a directory with the trace and the service's log.");
    run.run([=] { return driver::runSession(runOptions(), words->given); });

    cli::Command& serve = add("serve", "serve the nodes when they are mounted");
    serve.run([options = addOptions(serve)] {
        driver::serveMounted(options());
        return cli::kSuccess;
    });
    cli::Command& mount = add("mount", "mount the nodes that a process serves",
                              "812 /run/vibrator-driver/class/timed_output/vibrator");
    const auto* const process =
            mount.add("PID", cli::Numbers{"the number of a process", 1, 4'194'304}, "the process");
    const auto* const directory =
            mount.add("DIRECTORY", cli::kFile, "where to; has only the nodes then");
    mount.run([=] {
        driver::mountNodes(static_cast<pid_t>(process->number()), directory->text());
        return cli::kSuccess;
    });
    add("patterns", "print the shipped patterns, to be edited").run([] {
        std::cout << kShippedPatterns;
        return cli::kSuccess;
    });
}

}  // namespace

int main(int argc, char** argv) {
    cli::Program program("vibrator-driver", VERSION,
                         "Offers a force-feedback motor, of a phone or a game controller, to the "
                         "service as a vibrator driver of the kernel's would be");
    program.shared().note(
            "Exit code: 0 done; 1 failed; 2 a mistake in the command line; run: that of its "
            "command.");
    addCommands(program);
    return program.run(argc, argv);
}
