// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

void addOnOff(Client& client) {
    cli::Command& on = client.program().command(kForAll, "on", "run the motor", "500");
    const auto time = on.number("MS", kTimes, "how long, in ms");
    on.run([&client, time] {
        return client.answer({"on", "on", false, std::to_string(*time)},
                             client.service()->on(*time));
    });

    cli::Command& off = client.program().command(kForAll, "off", "stop the motor", "");
    off.run([&client] { return client.answer({"off", "off"}, client.service()->off()); });
}
