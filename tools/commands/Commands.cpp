// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

void addCommands(Client& client) {
    for (const auto add : {addVibration, addSettings, addPatterns, addQueries, addDoctor, addPlay,
                           addWatch, addPlot}) {
        add(client);
    }
    client.program().addCompletion(kTools);
}

void addCall(Client& client, const OneCall& call) {
    cli::Command& command =
            client.program().command(call.group, call.name, call.help, call.example);
    std::function<uint32_t()> number;
    std::function<std::string()> argument;
    Operation operation = call.operation;
    if (call.numbers) {
        const auto value = command.number(call.argument, *call.numbers, call.argumentHelp);
        operation.range = std::string(call.numbers->what) + " is " + call.numbers->range();
        number = [value] { return *value; };
        argument = [value] { return std::to_string(*value); };
    } else {
        const auto value = command.choice(call.argument, call.choices, call.argumentHelp);
        number = [value] { return static_cast<uint32_t>(*value); };
        argument = [value, choices = call.choices] { return choices[*value].value; };
    }
    command.run([&client, operation, number, argument, make = call.call] {
        return client.answer(operation, make(*client.service(), number()), {argument()});
    });
    client.addStep({call.name, &command});
}
