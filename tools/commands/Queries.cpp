// SPDX-License-Identifier: Apache-2.0
#include "service/Queries.h"

#include "Commands.h"
#include "text/Text.h"

namespace vibratorctl {

using nlohmann::ordered_json;

namespace {

const Operation kLadder = {"daxGetAmplitudeList", true};

int supports(const Client& client) {
    const auto vibrator = client.service();
    const bool permitted = mayCallRestricted();
    std::string words;
    ordered_json answers;
    for (const Query& query : kQueries) {
        const bool answer = reached((*vibrator.*query.ask)());
        const bool mayAsk = permitted || query.isForAll;
        answers[query.operation] = mayAsk ? ordered_json(answer) : nullptr;
        words += std::string(query.words) + ": " + (answer ? "yes" : mayAsk ? "no" : "may not ask");
        if (client.report().isVerbose()) words += std::string(" [") + query.operation + "]";
        words += "\n";
    }
    ordered_json members = {{"permitted", permitted}, {"supports", answers}};
    if (!permitted) {
        members["reason"] = notPermitted();
        client.warn("supports: " + notPermitted());
    }
    return client.report().found(words, members);
}

int status(const Client& client, uint32_t waitMs) {
    const auto vibrator = connect(client.instance(), std::chrono::milliseconds(waitMs));
    const Served served = describe(serverOf(*vibrator));
    std::vector<std::string> interfaces;
    reached(vibrator->interfaceChain(
            [&](const auto& chain) { interfaces.assign(chain.begin(), chain.end()); }));
    const std::string indent = "\n            ";
    ordered_json members = {{"instance", client.instance()}, {"answers", true}};
    members.update(served.members);
    members["interfaces"] = interfaces;
    const std::string device = driverOf(*vibrator).look("input_device").firstLine();
    members["device"] = device.empty() ? ordered_json() : ordered_json(device);
    return client.report().found(
            "service:    " + client.instance() + ", answers\nserved by:  " + served.server +
                    "\ntransport:  " + served.transport + "\nmanager:    " + served.manager +
                    (device.empty() ? "" : "\nmotor:      through vibrator-driver, " + device) +
                    "\ninterfaces: " + cli::join(interfaces, indent, indent) + "\n",
            members);
}

int ladder(const Client& client, uint32_t type) {
    const auto vibrator = client.service();
    const auto steps = askLadder(*vibrator, type);
    if (!steps.empty()) {
        return client.report().answer(kLadder, VibratorStatus::OK,
                                      {"", ladderInWords(steps), {{"ladder", steps}}});
    }
    Answer answer;
    if (mayCallRestricted()) {
        const LocalDriver driver = driverOf(*vibrator);
        answer.reason = driver.isUsable() ? "the motor, " + driver.motor().name + ", has no ladder"
                                          : "the motor has no ladder";
    }
    return client.report().answer(kLadder, VibratorStatus::UNSUPPORTED_OPERATION, answer);
}

int motor(const Client& client) {
    const auto vibrator = client.service();
    if (!mayCallRestricted())
        return client.report().answer(kLadder, VibratorStatus::UNSUPPORTED_OPERATION);
    ordered_json members;
    std::string words = "not known, since the service has no driver";
    const LocalDriver driver = driverOf(*vibrator);
    if (driver.isUsable()) {
        const LocalDriver::Motor motor = driver.motor();
        words = motor.inWords();
        members = asJson(motor);
    }
    for (const uint32_t type : {0U, 1U}) {
        const auto steps = askLadder(*vibrator, type);
        words += "\nladder " + std::to_string(type) + ": " + ladderInWords(steps);
        members["ladders"][std::to_string(type)] = steps;
    }
    const bool isEnhanced = reached(vibrator->daxSupportsEnhancedVelmoraHapticPattern());
    members["enhancedPatterns"] = isEnhanced;
    words += std::string("\nenhanced patterns: ") + (isEnhanced ? "yes" : "no") + "\n";
    return client.report().found("motor:    " + words, members);
}

}  // namespace

void addQueries(Client& client) {
    client.command(kForAll, "supports", "ask the service what it can do here", "").run([&client] {
        return supports(client);
    });

    constexpr cli::Numbers kWaits = {"a time like 10, 500ms or 2m", 0, 3600, "s"};
    cli::Command& waiting = client.command(
            kForAll, "status", "say whether the service answers, and who serves it", "--wait 10");
    const auto* const wait =
            waiting.add("--wait SECONDS", kWaits, "how long to wait for the service", "0");
    waiting.run([&client, wait] { return status(client, wait->number()); });

    constexpr cli::Numbers kTypes = {"the type of a ladder", 0, 1};
    cli::Command& typed =
            client.command(kRestricted, "ladder",
                           "print the ladder of intensities that suits the motor", "--type 1");
    const auto* const type = typed.add("--type N", kTypes, "variant of the ladder", "0");
    typed.run([&client, type] { return ladder(client, type->number()); });

    client.command(kRestricted, "motor", "tell the name, number and ladders of the motor", "")
            .run([&client] { return motor(client); });
}

}  // namespace vibratorctl
