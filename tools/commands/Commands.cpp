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
    std::function<uint32_t()> number;
    if (argument.choices.empty()) {
        const auto value = command.number(argument.name, argument.numbers, argument.help);
        number = [value] { return *value; };
    } else {
        const auto value = command.choice(argument.name, argument.choices, argument.help);
        number = [value] { return static_cast<uint32_t>(*value); };
    }
    const auto shown = [number, choices = argument.choices] {
        return choices.empty() ? std::to_string(number()) : choices[number()].value;
    };
    command.run([=, &client] {
        return client.report().answer(operation, call(*client.service(), number()), {shown()});
    });
    client.steps.push_back({command.name, &command});
}

std::function<std::string()> addTraffic(cli::Command& command) {
    const auto named = command.file("FILE",
                                    "trace of the simulated driver, or log of the daemon (default: "
                                    "the trace in VIBRATOR_SIM_DIR); - for standard input",
                                    "");
    return [named] {
        if (!named->empty()) return *named;
        const std::string simulated = simulator::inheritedDirectory();
        if (simulated.empty()) throw cli::UsageError("no FILE: name a trace, or the daemon's log");
        return simulator::traceFile(simulated);
    };
}

}  // namespace vibratorctl
