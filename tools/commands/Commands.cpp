// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "SimulatedDriver.h"
#include "TraceFile.h"

namespace vibratorctl {

void addCommands(Client& client) {
    for (const auto add : {addVibration, addSettings, addPatterns, addQueries, addDoctor,
                           addSelftest, addPlay, addWatch, addPlot}) {
        add(client);
    }
    client.secondNames["prebaked"] = "pattern";
}

void addCall(Client& client, cli::Command& command, const OneArgument& argument,
             const Operation& operation, const Call& call) {
    const bool isNumber = argument.choices.empty();
    const auto* const given = isNumber
                                      ? command.add(argument.name, argument.numbers, argument.help)
                                      : command.add(argument.name, argument.choices, argument.help);
    command.run([=, &client] {
        const std::string shown = isNumber ? std::to_string(given->number()) : given->text();
        return client.report().answer(operation, call(*client.service(), given->number()), {shown});
    });
    client.steps.push_back({command.name, &command});
}

std::function<std::string()> addTraffic(cli::Command& command) {
    const auto* const file = command.add(
            "[FILE]", cli::kFile,
            "trace of the simulated driver, or log of the daemon (default: the trace in "
            "VIBRATOR_SIM_DIR); - for standard input");
    return [file] {
        if (file->isGiven()) return file->text();
        const std::string simulated = simulator::inheritedDirectory();
        if (simulated.empty()) throw cli::UsageError("no FILE: name a trace, or the daemon's log");
        return simulator::traceFile(simulated);
    };
}

}  // namespace vibratorctl
