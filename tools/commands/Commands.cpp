// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

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

}  // namespace vibratorctl
