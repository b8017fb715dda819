// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

void addExternal(Client& client) {
    cli::Command& external = client.program().command(
            kForAll, "external", "hand the motor to an external control, or take it back", "on");
    const auto state = external.choice(
            "STATE",
            {{"on", "something else runs the motor"}, {"off", "the service runs the motor"}},
            "who runs the motor");
    external.run([&client, state] {
        const bool isOn = *state == 0;
        return client.answer({"external", "setExternalControl", false, isOn ? "on" : "off"},
                             client.service()->setExternalControl(isOn));
    });
}
