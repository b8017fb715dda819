// SPDX-License-Identifier: Apache-2.0
#include "Driver.h"
#include "Faults.h"
#include "Trace.h"

#include <CLI/CLI.hpp>
#include <cstdio>
#include <cstring>
#include <exception>
#include <fstream>
#include <iostream>
#include <map>
#include <string>
#include <vector>

namespace {

using simulator::Layout;

int fail(const std::string& what) {
    std::cerr << "vibrator-sim: " << what << '\n';
    return 1;
}

int create(const std::string& directory, Layout layout, const simulator::Features& features) {
    const int error = simulator::createDriver(directory, layout, features);
    return error == 0 ? 0 : fail(directory + ": " + strerror(error));
}

int show(const std::string& directory) {
    for (const simulator::Node& node : simulator::listNodes(directory)) {
        std::cout << node.path << ' ' << simulator::quote(simulator::show(node)) << '\n';
    }
    return 0;
}

int printTrace(const std::string& directory) {
    std::ifstream file(simulator::traceFile(directory));
    if (!file) return fail("no access has been traced in " + directory);
    std::cout << file.rdbuf();
    return 0;
}

int setFault(const std::string& directory, const std::string& leaf, const std::string& operation,
             const std::string& text, unsigned times, unsigned after) {
    std::optional<simulator::Fault> fault;
    if (text != "none") {
        fault = simulator::parseFault(text);
        if (!fault)
            return fail("\"" + text + "\" is no fault: an errno's name, short=BYTES or none");
        fault->times = times;
        fault->after = after;
    }
    if (simulator::setFault(directory, leaf, operation, fault)) return 0;
    return fail(directory + ": no simulated driver that could be written to");
}

int run(int argc, char** argv) {
    CLI::App app{"Makes and inspects a simulated kernel vibrator driver."};
    app.require_subcommand(1);
    app.failure_message(CLI::FailureMessage::help);
    std::string directory;
    app.add_option("--dir", directory, "directory of the simulated driver")
            ->envname("VIBRATOR_SIM_DIR")
            ->required();

    auto* createCommand = app.add_subcommand("create", "make a driver, in place of what was there");
    Layout layout = Layout::kLedTrigger;
    createCommand->add_option("--layout", layout, "sysfs layout: led or timed (default: led)")
            ->transform(CLI::CheckedTransformer(std::map<std::string, Layout>{
                    {"led", Layout::kLedTrigger}, {"timed", Layout::kTimedOutput}}));
    simulator::Features features;
    createCommand->add_option("--motor", features.motor, "name of the motor")
            ->capture_default_str();
    createCommand->add_option("--waves", features.waves, "number of stored patterns")
            ->capture_default_str()
            ->check(CLI::NonNegativeNumber);
    const std::vector<std::string> all = simulator::featureNames();
    std::vector<std::string> names = all;
    createCommand
            ->add_option("--features", names,
                         "features of the driver, separated by commas (default: all)")
            ->delimiter(',')
            ->check(CLI::IsMember(all) | CLI::IsMember({"none"}));

    auto* showCommand = app.add_subcommand("show", "print what each node holds");
    auto* traceCommand = app.add_subcommand("trace", "print every access of the nodes so far");

    auto* faultCommand = app.add_subcommand("fault", "make accesses of a node go wrong");
    std::string leaf;
    std::string operation;
    std::string fault;
    unsigned times = 0;
    unsigned after = 0;
    faultCommand->add_option("NODE", leaf, "the node, like intensity")->required();
    faultCommand->add_option("OPERATION", operation, "open, read, write or close")
            ->required()
            ->check(CLI::IsMember({"open", "read", "write", "close"}));
    faultCommand->add_option("FAULT", fault, "an errno like EINVAL, short=BYTES, or none")
            ->required();
    faultCommand->add_option("--times", times, "how often (default: until it is set to none)");
    faultCommand->add_option("--after", after, "how often it still goes well before (default: 0)");

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        return app.exit(error) == 0 ? 0 : 2;
    }
    if (*createCommand) {
        features.names = {names.begin(), names.end()};
        return create(directory, layout, features);
    }
    if (*showCommand) return show(directory);
    if (*traceCommand) return printTrace(directory);
    return setFault(directory, leaf, operation, fault, times, after);
}

}  // namespace

int main(int argc, char** argv) {
    try {
        return run(argc, argv);
    } catch (const std::exception& error) {
        std::fprintf(stderr, "vibrator-sim: %s\n", error.what());
        return 1;
    }
}
