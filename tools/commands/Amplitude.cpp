// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

using service::IDaxVibrator;

namespace {

/** An intensity on the driver's own scale. */
void addIntensity(Client& client, const char* name, const char* help, const char* operation,
                  ::android::hardware::Return<VibratorStatus> (IDaxVibrator::*set)(uint32_t)) {
    cli::Command& command = client.program().command(kRestricted, name, help, "5000");
    const auto number = command.number("N", kIntensities, "the strength; 10000 is full");
    command.run([=, &client] {
        return client.answer({name, operation, true, std::to_string(*number)},
                             (*client.service().*set)(*number));
    });
}

}  // namespace

void addAmplitude(Client& client) {
    constexpr cli::Numbers kAmplitudes = {"an amplitude", 1, 255, UINT8_MAX};
    cli::Command& amplitude = client.program().command(
            kRestricted, "amplitude", "set the strength on the platform's scale", "128");
    const auto number = amplitude.number("N", kAmplitudes, "from weakest to strongest");
    amplitude.run([&client, number] {
        return client.answer({"amplitude", "setAmplitude", true, std::to_string(*number)},
                             client.service()->setAmplitude(static_cast<uint8_t>(*number)));
    });
    addIntensity(client, "intensity", "set the strength on the driver's own scale",
                 "daxSetAmplitude", &IDaxVibrator::daxSetAmplitude);
    addIntensity(client, "force-touch", "set the strength of force-touch feedback",
                 "daxSetForceTouchAmplitude", &IDaxVibrator::daxSetForceTouchAmplitude);
}
