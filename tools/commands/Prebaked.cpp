// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

namespace {

/** @return the status of the query for the number of stored patterns. */
VibratorStatus countPatterns(const Client& client, uint32_t* count) {
    VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
    Client::reached(client.service()->daxGetNumberOfPrebakedHapticPattern(
            [&](VibratorStatus answered, uint32_t patterns) {
                status = answered;
                *count = patterns;
            }));
    return status;
}

int play(const Client& client, uint32_t pattern, uint32_t amplitude, bool isRepeated) {
    const Call call{"prebaked play", "daxPerformPrebakedHapticPattern", true,
                    std::to_string(pattern)};
    uint32_t count = 0;
    Details details;
    if (countPatterns(client, &count) == VibratorStatus::OK && pattern > count) {
        const std::string warning = "the driver counts only " + std::to_string(count) +
                                    " stored patterns; it may play nothing";
        client.report().warn(call.command + " " + call.argument + ": " + warning);
        details.members["warning"] = warning;
    }
    return client.answer(
            call, client.service()->daxPerformPrebakedHapticPattern(pattern, amplitude, isRepeated),
            details);
}

}  // namespace

void addPrebaked(Client& client) {
    cli::Command& count = client.program().command(
            kRestricted, "prebaked count", "tell how many patterns the driver has stored", "");
    count.run([&client] {
        uint32_t number = 0;
        const VibratorStatus status = countPatterns(client, &number);
        Details details;
        if (status == VibratorStatus::OK)
            details = {std::to_string(number) + " patterns", {{"count", number}}};
        return client.answer({"prebaked count", "daxGetNumberOfPrebakedHapticPattern", true},
                             status, details);
    });

    constexpr cli::Numbers kPatterns = {"the number of a pattern", 0, INT32_MAX};
    cli::Command& command = client.program().command(kRestricted, "prebaked play",
                                                     "play a pattern that the driver has stored",
                                                     "3 --amplitude 5000");
    const auto pattern = command.number("PATTERN", kPatterns, "0 selects without playing");
    const auto amplitude =
            command.number("--amplitude N", kIntensities, "how strong; 10000 is full", 10000);
    const auto isRepeated = command.flag("--repeat", "play it through the driver's queue");
    command.run([=, &client] { return play(client, *pattern, *amplitude, *isRepeated); });
}
