// SPDX-License-Identifier: Apache-2.0
#include "Driver.h"
#include "Faults.h"
#include "MotorType.h"
#include "Session.h"
#include "Trace.h"
#include "cli/CommandLine.h"
#include "cli/Text.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <fstream>
#include <iostream>
#include <sstream>
#include <string>
#include <vector>

namespace {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

using cli::UsageError;
using Names = std::vector<std::string>;

constexpr int kFailed = 1;
constexpr int kUsage = 2;

/** Refuses a word that is not among the known ones. */
void require(const std::string& word, const Names& known, const std::string& complaint) {
    if (std::find(known.begin(), known.end(), word) == known.end()) {
        throw UsageError(complaint + cli::suggestion(word, known));
    }
}

/** The options that say what driver to make. */
class DriverOptions {
  public:
    explicit DriverOptions(cli::Command& command) {
        mLayout = command.choice("--layout LAYOUT",
                                 {{"led", "the nodes of the LED trigger"},
                                  {"timed", "the nodes of the timed output"}},
                                 "layout of the nodes", 0);
        std::vector<cli::Choice> motors;
        for (const std::string& name : product::MotorTypeNames)
            motors.push_back({name, ""});
        constexpr auto kUsual = static_cast<size_t>(product::kMotorLinear1040);
        mMotor = command.choice("--motor NAME", motors, "name of the motor", kUsual);
        mWaves = command.number("--waves N", {"a number of stored patterns", 0, 65535},
                                "number of stored patterns", 12);
        mFeatures = command.text("--features LIST",
                                 "features of the driver, separated by commas; all, none, or of " +
                                         cli::join(simulator::featureNames(), ", ", " and "),
                                 "all");
    }

    simulator::Layout layout() const {
        return *mLayout == 0 ? simulator::Layout::kLedTrigger : simulator::Layout::kTimedOutput;
    }
    simulator::Features features() const {
        const Names all = simulator::featureNames();
        simulator::Features features{
                {}, product::MotorTypeNames[*mMotor], static_cast<int>(*mWaves)};
        if (*mFeatures == "all") features.names = {all.begin(), all.end()};
        if (*mFeatures == "all" || *mFeatures == "none") return features;
        std::istringstream words(*mFeatures + ",");
        for (std::string name; std::getline(words, name, ',');) {
            require(name, all, "--features: no feature " + cli::inQuotes(name));
            features.names.insert(name);
        }
        return features;
    }

  private:
    cli::Value<size_t> mLayout;
    cli::Value<size_t> mMotor;
    cli::Value<uint32_t> mWaves;
    cli::Value<std::string> mFeatures;
};

class Simulator {
  public:
    Simulator() {
        mDirectory = mProgram.shared().file("--dir DIRECTORY",
                                            "directory of the driver, instead of the one in "
                                            "VIBRATOR_SIM_DIR",
                                            "");
        mProgram.shared().note(
                "Exit code: 0 done; 1 failed; 2 a mistake in the command "
                "line; run: that of its command.");
        addRun();
        addCreate();
        addShow();
        addTrace();
        addFault();
        mProgram.addCompletion("Help");
    }

    int run(int argc, char** argv) {
        int code = runCommand(argc, argv);
        errno = 0;
        if (!std::cout.flush()) {
            code = fail(std::string("standard output cannot be written: ") +
                                strerror(errno != 0 ? errno : EIO),
                        kFailed);
        }
        return code;
    }

  private:
    int runCommand(int argc, char** argv) {
        try {
            return mProgram.run(argc, argv, [] { return false; });
        } catch (const UsageError& error) {
            return fail(error.what(), kUsage);
        } catch (const std::exception& error) {
            return fail(error.what(), kFailed);
        }
    }

    int fail(const std::string& what, int code) const {
        const cli::Command* command = mProgram.current();
        std::cerr << "vibrator-sim: " << (command == nullptr ? "" : command->name() + ": ")
                  << cli::printable(what) << '\n';
        return code;
    }

    std::string directory() const {
        const char* inherited = getenv("VIBRATOR_SIM_DIR");
        const bool isInherited = mDirectory->empty() && inherited != nullptr;
        std::string name = isInherited ? inherited : *mDirectory;
        if (!name.empty()) return name;
        throw UsageError("no directory of a driver; name one with --dir or VIBRATOR_SIM_DIR");
    }
    /** @return the directory, in which there is a driver. */
    std::string driver() const {
        const simulator::Folder folder(directory());
        if (simulator::isMarked(folder)) return directory();
        const int error = folder.error() != 0 ? folder.error() : ENOENT;
        throw std::runtime_error("\"" + directory() + "\" has no simulated driver: " +
                                 strerror(error) + "; \"vibrator-sim create\" makes one");
    }

    void addRun() {
        cli::Command& command = mProgram.command(
                "A driver with the service", "run",
                "make a driver, start the service on it, and run a command or a shell beside it",
                "--layout timed vibratorctl click");
        const DriverOptions options(command);
        const auto kept =
                command.file("--dir DIRECTORY", "directory of the driver, which is kept", "");
        const auto words =
                command.rest("COMMAND", "the command and its arguments; without one, your shell");
        command.note(
                "VIBRATOR_SIM_DIR tells the command the driver's directory; in it are \"trace\", "
                "all accesses of nodes, and \"log\", the log of the service. When the command "
                "ends, the service is ended and the directory removed, unless --dir named it.");
        command.run([=] {
            return simulator::runSession({kept->empty() ? *mDirectory : *kept, options.layout(),
                                          options.features(), *words});
        });
    }

    void addCreate() {
        cli::Command& command =
                mProgram.command(kAlone, "create", "make a driver, and replace what was there",
                                 "--motor LINEAR_1030 --features intensity,prebaked");
        const DriverOptions options(command);
        command.note("The directory must be new, empty, or a driver's.");
        command.run([=] {
            simulator::makeDriver(directory(), options.layout(), options.features());
            return 0;
        });
    }

    void addShow() {
        mProgram.command(kAlone, "show", "print what each node holds", "").run([this] {
            for (const simulator::Node& node : simulator::listNodes(driver()))
                std::cout << node.path << ' ' << simulator::quote(simulator::show(node)) << '\n';
            return 0;
        });
    }

    void addTrace() {
        mProgram.command(kAlone, "trace", "print every access of the nodes so far", "")
                .note("Each line: time in seconds, node, access, result.")
                .run([this] {
                    const std::string path = simulator::traceFile(driver());
                    std::ifstream file(path);
                    for (std::string line; std::getline(file, line);)
                        std::cout << cli::printable(line) << '\n';
                    file.clear();
                    if (file.tellg() >= simulator::kTraceLimit) {
                        std::cerr << "vibrator-sim: trace: full; remove " << cli::inQuotes(path)
                                  << " to begin a new one\n";
                    }
                    return 0;
                });
    }

    void addFault() {
        cli::Command& command = mProgram.command(
                kAlone, "fault", "make accesses of a node fail; without arguments, list the faults",
                "intensity write EIO --times 1");
        const auto leaf = command.text("NODE", "the node, like intensity", "");
        const auto operation = command.text("OPERATION", "open, read, write or close", "");
        const auto text = command.text("FAULT", "an errno like EINVAL; short=BYTES; none", "");
        constexpr uint32_t kMost = 1'000'000;
        const auto times = command.number(
                "--times N", {"a number of accesses", 1, kMost, 0},
                "how many accesses fail; without it, all until the fault is set to none", 0);
        const auto after = command.number("--after N", {"a number of accesses", 0, kMost},
                                          "how many accesses succeed first", 0);
        const auto clear = command.flag("--clear", "remove all faults");
        command.run([=] {
            if (*clear && !leaf->empty()) throw UsageError("--clear takes no NODE");
            if (*clear) return simulator::clearFaults(driver()) == 0 ? 0 : kFailed;
            if (!leaf->empty()) {
                setFault(*leaf, *operation, *text, *times, *after);
                return 0;
            }
            for (const std::string& line : simulator::listFaults(driver()))
                std::cout << line << '\n';
            return 0;
        });
    }

    void setFault(const std::string& leaf, const std::string& operation, const std::string& text,
                  unsigned times, unsigned after) const {
        require(operation, {"open", "read", "write", "close"},
                cli::inQuotes(operation) + " is not open, read, write or close");
        auto fault = simulator::parseFault(text);
        if (!fault && text != "none") {
            throw UsageError(cli::inQuotes(text) +
                             " is no fault: an errno's name, short=BYTES or none");
        }
        if (fault) fault->times = times;
        if (fault) fault->after = after;
        Names leaves;
        for (const simulator::Node& node : simulator::listNodes(driver()))
            leaves.push_back(node.leaf());
        require(leaf, leaves, "the driver has no node " + cli::inQuotes(leaf));
        if (!simulator::setFault(driver(), leaf, operation, fault)) {
            throw std::runtime_error("\"" + driver() + "\" cannot be written to");
        }
    }

    static constexpr char kAlone[] = "A driver alone";

    cli::Program mProgram{"vibrator-sim", VERSION,
                          "Makes a simulated kernel vibrator driver, runs the service on it, and "
                          "shows what the driver was told."};
    cli::Value<std::string> mDirectory;
};

}  // namespace

int main(int argc, char** argv) {
    try {
        return Simulator().run(argc, argv);
    } catch (const std::exception& error) {
        std::cerr << "vibrator-sim: " << error.what() << '\n';
        return kFailed;
    }
}
