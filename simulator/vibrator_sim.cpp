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
#include <iterator>
#include <optional>
#include <string>
#include <vector>

namespace {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

using cli::UsageError;
using Names = std::vector<std::string>;

constexpr int kFailed = 1;
constexpr int kUsage = 2;

/** The options that say what driver to make. */
class DriverOptions {
  public:
    explicit DriverOptions(cli::Command& command) {
        mLayout = command.choice("--layout LAYOUT",
                                 {{"led", "the nodes of the LED trigger"},
                                  {"timed", "the nodes of the timed output"}},
                                 "layout of the nodes", 0);
        std::vector<cli::Choice> motors;
        for (const std::string& name : motorNames())
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
        simulator::Features features;
        features.motor = motorNames()[*mMotor];
        features.waves = static_cast<int>(*mWaves);
        if (*mFeatures == "all") features.names = {all.begin(), all.end()};
        if (*mFeatures == "all" || *mFeatures == "none") return features;
        for (size_t start = 0; start <= mFeatures->size();) {
            const size_t end = std::min(mFeatures->find(',', start), mFeatures->size());
            const std::string name = mFeatures->substr(start, end - start);
            if (std::find(all.begin(), all.end(), name) == all.end()) {
                throw UsageError("--features: no feature " + cli::inQuotes(name) +
                                 cli::suggestion(name, all));
            }
            features.names.insert(name);
            start = end + 1;
        }
        return features;
    }

  private:
    /** @return the names that the service knows. */
    static Names motorNames() {
        return {std::begin(product::MotorTypeNames), std::end(product::MotorTypeNames)};
    }

    cli::Value<size_t> mLayout;
    cli::Value<size_t> mMotor;
    cli::Value<uint32_t> mWaves;
    cli::Value<std::string> mFeatures;
};

class Simulator {
  public:
    Simulator() {
        const char* directory = getenv("VIBRATOR_SIM_DIR");
        mDirectory = mProgram.shared().file("--dir DIRECTORY",
                                            "directory of the driver, instead of the one in "
                                            "VIBRATOR_SIM_DIR",
                                            "");
        mInherited = directory == nullptr ? "" : directory;
        mProgram.shared().note(
                "Exit code: 0 done; 1 it cannot be done; 2 a mistake in the command "
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
        if (!mDirectory->empty()) return *mDirectory;
        if (mInherited.empty()) {
            throw UsageError("no directory of a driver; name one with --dir or VIBRATOR_SIM_DIR");
        }
        return mInherited;
    }
    /** @return the directory, in which there is a driver. */
    std::string driver() const {
        const simulator::Folder folder(directory());
        if (folder.error() == 0 && simulator::isMarked(folder)) return directory();
        const int error = folder.error() != 0 ? folder.error() : ENOENT;
        throw std::runtime_error("\"" + directory() + "\" has no simulated driver: " +
                                 strerror(error) + "; \"vibrator-sim create\" makes one");
    }

    void addRun();
    void addCreate();
    void addShow();
    void addTrace();
    void addFault();
    void setFault(const std::string& leaf, const std::string& operation, const std::string& text,
                  simulator::Fault counts) const;

    cli::Program mProgram{"vibrator-sim", VERSION,
                          "Makes a simulated kernel vibrator driver, runs the service on it, and "
                          "shows what the driver was told."};
    cli::Value<std::string> mDirectory;
    std::string mInherited;
};

void Simulator::addRun() {
    cli::Command& command = mProgram.command(
            "A driver with the service", "run",
            "make a driver, start the service on it, and run a command or a shell beside it",
            "--layout timed vibratorctl click");
    const DriverOptions options(command);
    const auto kept = command.file("--dir DIRECTORY", "directory of the driver, which is kept", "");
    const auto words =
            command.rest("COMMAND", "the command and its arguments; without one, your shell");
    command.note(
            "The command has VIBRATOR_SIM_DIR, the directory of the driver with \"trace\", all "
            "accesses of nodes, and \"log\", the log of the service. In the end the service "
            "is ended and the directory removed, unless --dir has named one.");
    command.run([=] {
        return simulator::runSession({kept->empty() ? *mDirectory : *kept, options.layout(),
                                      options.features(), *words});
    });
}

void Simulator::addCreate() {
    cli::Command& command = mProgram.command("A driver alone", "create",
                                             "make a driver, in place of what was there",
                                             "--motor LINEAR_1030 --features intensity,prebaked");
    const DriverOptions options(command);
    command.note("The directory must be new, empty, or a driver's.");
    command.run([=] {
        simulator::makeDriver(directory(), options.layout(), options.features());
        return 0;
    });
}

void Simulator::addShow() {
    mProgram.command("A driver alone", "show", "print what each node holds", "").run([this] {
        for (const simulator::Node& node : simulator::listNodes(driver()))
            std::cout << node.path << ' ' << simulator::quote(simulator::show(node)) << '\n';
        return 0;
    });
}

void Simulator::addTrace() {
    mProgram.command("A driver alone", "trace", "print every access of the nodes so far", "")
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

void Simulator::addFault() {
    cli::Command& command =
            mProgram.command("A driver alone", "fault",
                             "make accesses of a node fail; without arguments, list the faults",
                             "intensity write EIO --times 1");
    const auto leaf = command.text("NODE", "the node, like intensity", "");
    const auto operation = command.text("OPERATION", "open, read, write or close", "");
    const auto text = command.text("FAULT", "an errno like EINVAL; short=BYTES; none", "");
    constexpr uint32_t kMost = 1'000'000;
    const auto times =
            command.number("--times N", {"how often the access fails", 1, kMost, 0},
                           "how often the access fails; without it, until it is set to none", 0);
    const auto after = command.number("--after N", {"how often it succeeds before", 0, kMost},
                                      "how often it succeeds before", 0);
    const auto clear = command.flag("--clear", "take back all faults");
    command.run([=] {
        simulator::Fault counts;
        counts.times = *times;
        counts.after = *after;
        if (*clear && !leaf->empty()) throw UsageError("--clear takes no NODE");
        if (*clear && simulator::clearFaults(driver()) == 0) return 0;
        if (!leaf->empty()) {
            setFault(*leaf, *operation, *text, counts);
            return 0;
        }
        for (const std::string& line : simulator::listFaults(driver()))
            std::cout << line << '\n';
        return 0;
    });
}

void Simulator::setFault(const std::string& leaf, const std::string& operation,
                         const std::string& text, simulator::Fault counts) const {
    const Names operations = {"open", "read", "write", "close"};
    if (std::find(operations.begin(), operations.end(), operation) == operations.end()) {
        throw UsageError(cli::inQuotes(operation) + " is not open, read, write or close" +
                         cli::suggestion(operation, operations));
    }
    std::optional<simulator::Fault> fault;
    if (text != "none") {
        fault = simulator::parseFault(text);
        if (!fault) {
            throw UsageError(cli::inQuotes(text) +
                             " is no fault: an errno's name, short=BYTES or none");
        }
        fault->times = counts.times;
        fault->after = counts.after;
    }
    Names leaves;
    for (const simulator::Node& node : simulator::listNodes(driver()))
        leaves.push_back(node.leaf());
    if (std::find(leaves.begin(), leaves.end(), leaf) == leaves.end()) {
        throw UsageError("the driver has no node " + cli::inQuotes(leaf) +
                         cli::suggestion(leaf, leaves));
    }
    if (!simulator::setFault(driver(), leaf, operation, fault)) {
        throw std::runtime_error("\"" + driver() + "\" cannot be written to");
    }
}

}  // namespace

int main(int argc, char** argv) {
    try {
        return Simulator().run(argc, argv);
    } catch (const std::exception& error) {
        std::cerr << "vibrator-sim: " << error.what() << '\n';
        return kFailed;
    }
}
