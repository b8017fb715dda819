// SPDX-License-Identifier: Apache-2.0
#include "Faults.h"
#include "MotorType.h"
#include "Run.h"
#include "Session.h"
#include "TraceFile.h"
#include "TraceLine.h"
#include "cli/CommandLine.h"
#include "text/Text.h"

#include <algorithm>
#include <cstring>
#include <exception>
#include <fstream>
#include <iostream>
#include <sstream>

namespace {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

using cli::UsageError;
using model::Layout;
using Names = std::vector<std::string>;

/** Refuses a word that is not among the known ones. */
void require(const std::string& word, const Names& known, const std::string& complaint) {
    if (std::find(known.begin(), known.end(), word) == known.end()) {
        throw UsageError(complaint + cli::suggestion(word, known));
    }
}

/** @return the features that a list names. */
Names featuresOf(const std::string& list) {
    Names all = model::featureNames();
    if (list == "all") return all;
    if (list == "none") return {};
    Names features;
    std::istringstream words(list + ",");
    for (std::string name; std::getline(words, name, ',');) {
        require(name, all, "--features: no feature " + cli::inQuotes(name));
        features.push_back(name);
    }
    return features;
}

/** @return names as choices. */
std::vector<cli::Choice> choicesOf(const Names& names) {
    std::vector<cli::Choice> choices;
    for (const std::string& name : names)
        choices.push_back({name, ""});
    return choices;
}

/** What driver to make. */
struct DriverKind {
    Layout layout;
    model::Features features;
};

/** Adds the options that say what driver to make. @return what they say. */
std::function<DriverKind()> addDriverOptions(cli::Command& command) {
    const auto* const layout = command.add(
            "--layout LAYOUT",
            {{"led", "the nodes of the LED trigger"}, {"timed", "the nodes of the timed output"}},
            "layout of the nodes", "led");
    const Names motors(std::begin(product::MotorTypeNames), std::end(product::MotorTypeNames));
    const auto* const motor = command.add("--motor NAME", choicesOf(motors), "name of the motor",
                                          motors[product::kMotorLinear1040]);
    const auto* const waves =
            command.add("--waves N", cli::Numbers{"a number of stored patterns", 0, 65535},
                        "number of stored patterns", "12");
    const auto* const features =
            command.add("--features LIST", choicesOf(model::featureNames()),
                        "features of the driver, separated by commas; all, none, or of " +
                                cli::join(model::featureNames(), ", ", " and "),
                        "all", cli::kText);
    return [=] {
        return DriverKind{
                layout->number() == 0 ? Layout::kLedTrigger : Layout::kTimedOutput,
                {featuresOf(features->text()), motor->text(), static_cast<int>(waves->number())}};
    };
}

class Simulator : public cli::Program {
  public:
    Simulator()
        : Program("vibrator-sim", VERSION,
                  "Makes a simulated kernel vibrator driver, runs the service on it, and shows "
                  "what the driver was told") {
        mDirectory = shared().add("--dir DIRECTORY", cli::kFile,
                                  "directory of the driver, instead of the one in "
                                  "VIBRATOR_SIM_DIR");
        shared().note(
                "Exit code: 0 done; 1 failed; 2 a mistake in the command line; run: that of its "
                "command.");
        addRun();
        addEnv();
        addCreate();
        addShow();
        addTrace();
        addFault();
    }

  private:
    std::string directory() const {
        std::string name =
                mDirectory->text().empty() ? simulator::inheritedDirectory() : mDirectory->text();
        if (!name.empty()) return name;
        throw UsageError("no directory of a driver; name one with --dir or VIBRATOR_SIM_DIR");
    }
    /** @return the directory, in which there is a driver. */
    simulator::Folder driver() const {
        simulator::Folder folder(directory());
        if (simulator::isMarked(folder)) return folder;
        const int error = folder.error() != 0 ? folder.error() : ENOENT;
        throw std::runtime_error("\"" + directory() + "\" has no simulated driver: " +
                                 strerror(error) + "; \"vibrator-sim create\" makes one");
    }

    void addRun() {
        cli::Command& run = command(
                "A driver with the service", "run",
                "make a driver, start the service on it, and run a command or a shell beside it",
                "--layout timed vibratorctl click");
        const auto kind = addDriverOptions(run);
        const auto* const kept =
                run.add("--dir DIRECTORY", cli::kFile, "directory of the driver, which is kept");
        const auto* const words = run.add("[COMMAND...]", cli::kCommand,
                                          "the command and its arguments; without one, your shell");
        run.note(
                "VIBRATOR_SIM_DIR tells the command the driver's directory; in it are \"trace\", "
                "all accesses of nodes, and \"log\", the log of the service. When the command "
                "ends, the service is ended and the directory removed, unless --dir named it.");
        run.run([=] {
            const auto [layout, features] = kind();
            return simulator::runSession(kept->text().empty() ? mDirectory->text() : kept->text(),
                                         layout, features, words->given);
        });
    }

    void addCreate() {
        cli::Command& create =
                command(kAlone, "create", "make a driver, and replace what was there",
                        "--motor LINEAR_1030 --features intensity,pattern");
        const auto kind = addDriverOptions(create);
        create.note("The directory must be new, empty, or a driver's.");
        create.run([=] {
            const auto [layout, features] = kind();
            simulator::makeDriver(directory(), layout, features);
            return cli::kSuccess;
        });
    }

    void addShow() {
        command(kAlone, "show", "print what each node holds", "").run([this] {
            driver();
            for (const simulator::Node& node : simulator::listNodes(directory()))
                std::cout << node.path << ' ' << model::quote(simulator::show(node)) << '\n';
            return cli::kSuccess;
        });
    }

    void addTrace() {
        command(kAlone, "trace", "print every access of the nodes so far", "")
                .note("Each line: time in seconds, node, access, result.")
                .run([this] {
                    driver();
                    const std::string path = simulator::traceFile(directory());
                    std::ifstream file(path);
                    for (std::string line; std::getline(file, line);)
                        std::cout << cli::printable(line) << '\n';
                    file.clear();
                    if (file.tellg() >= model::kTraceLimit) {
                        warn("trace: full; remove \"" + path + "\" to begin a new one");
                    }
                    return cli::kSuccess;
                });
    }

    void addFault() {
        cli::Command& fault = command(
                kAlone, "fault", "make accesses of a node fail; without arguments, list the faults",
                "intensity write EIO --times 1");
        Names leaves;
        for (const model::Attribute& each : model::attributes())
            leaves.push_back(each.leaf);
        const auto* const leaf =
                fault.add("[NODE]", choicesOf(leaves), "the node, like intensity", "", cli::kText);
        const auto* const operation = fault.add("[OPERATION]", choicesOf(kOperations),
                                                "open, read, write or close", "", cli::kText);
        const auto* const text =
                fault.add("[FAULT]", choicesOf({"EACCES", "EINVAL", "EIO", "short=", "none"}),
                          "an errno like EINVAL; short=BYTES; none", "", cli::kText);
        constexpr uint32_t kMax = 1'000'000;
        const auto* const times =
                fault.add("--times N", cli::Numbers{"a number of accesses", 1, kMax},
                          "how many accesses fail; without it, all until the fault is set to none");
        const auto* const after =
                fault.add("--after N", cli::Numbers{"a number of accesses", 0, kMax},
                          "how many accesses succeed first", "0");
        const auto* const clear = fault.add("--clear", cli::kFlag, "remove all faults");
        fault.run([=] {
            if (clear->isGiven() && leaf->isGiven()) throw UsageError("--clear takes no NODE");
            if (clear->isGiven())
                return simulator::clearFaults(driver()) == 0 ? cli::kSuccess : cli::kFailed;
            if (leaf->isGiven()) {
                setFault(leaf->text(), operation->text(), text->text(), times->number(),
                         after->number());
            } else {
                for (const std::string& line : simulator::listFaults(driver()))
                    std::cout << line << '\n';
            }
            return cli::kSuccess;
        });
    }

    void addEnv() {
        command("A driver with the service", "env",
                "print lines for a second terminal that is to use this driver and this service", "")
                .note("In what \"run\" has started. The lines are for a shell to read.")
                .run([] {
                    const std::string lines = session::exportLines();
                    if (lines.empty()) throw UsageError("this is not in a \"vibrator-sim run\"");
                    std::cout << lines;
                    return cli::kSuccess;
                });
    }

    void setFault(const std::string& leaf, const std::string& operation, const std::string& text,
                  unsigned times, unsigned after) const {
        if (text.empty()) {
            throw UsageError("what is to fail, and how? For example \"vibrator-sim fault " + leaf +
                             " write EIO\"");
        }
        require(operation, kOperations,
                cli::inQuotes(operation) + " is not open, read, write or close");
        auto fault = simulator::parseFault(text);
        if (!fault && text != "none") {
            throw UsageError(cli::inQuotes(text) +
                             " is no fault: an errno's name, short=BYTES or none");
        }
        if (fault) fault->times = times;
        if (fault) fault->after = after;
        const simulator::Folder folder = driver();
        Names leaves;
        for (const simulator::Node& node : simulator::listNodes(directory()))
            leaves.push_back(node.leaf());
        require(leaf, leaves, "the driver has no node " + cli::inQuotes(leaf));
        if (!simulator::setFault(folder, leaf, operation, fault)) {
            throw std::runtime_error("\"" + directory() + "\" cannot be written to");
        }
    }

    static constexpr char kAlone[] = "A driver alone";
    const Names kOperations = {"open", "read", "write", "close"};

    const cli::Argument* mDirectory;
};

}  // namespace

int main(int argc, char** argv) {
    return Simulator().run(argc, argv);
}
