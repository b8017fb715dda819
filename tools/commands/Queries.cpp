// SPDX-License-Identifier: Apache-2.0
#include "Queries.h"

#include "Commands.h"
#include "service/LocalDriver.h"
#include "text/Text.h"

#include <chrono>
#include <thread>

namespace vibratorctl {

using nlohmann::ordered_json;

const std::vector<Query> kQueries = {
        {"supportsAmplitudeControl", "amplitudes of the platform",
         &IDaxVibrator::supportsAmplitudeControl, nullptr},
        {"supportsExternalControl", "external control", &IDaxVibrator::supportsExternalControl,
         "external-control"},
        {"daxSupportsAmplitudeControl", "intensities", &IDaxVibrator::daxSupportsAmplitudeControl,
         "amplitude"},
        {"daxSupportsForceTouchAmplitudeControl", "force-touch feedback",
         &IDaxVibrator::daxSupportsForceTouchAmplitudeControl, "force-touch"},
        {"daxSupportsFrequencyControl", "frequency types",
         &IDaxVibrator::daxSupportsFrequencyControl, "frequency"},
        {"daxSupportsHapticEngine", "haptic engine packets", &IDaxVibrator::daxSupportsHapticEngine,
         "haptic-engine"},
        {"daxSupportsPrebakedHapticPattern", "stored patterns",
         &IDaxVibrator::daxSupportsPrebakedHapticPattern, "prebaked"},
        {"daxSupportsFolderStatusSetting", "fold state",
         &IDaxVibrator::daxSupportsFolderStatusSetting, "fold"},
        {"daxSupportsEnhancedVelmoraHapticPattern", "enhanced patterns",
         &IDaxVibrator::daxSupportsEnhancedVelmoraHapticPattern, nullptr},
};

std::vector<uint32_t> askLadder(IDaxVibrator& vibrator, uint32_t type) {
    using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
    std::vector<uint32_t> ladder;
    reached(vibrator.daxGetAmplitudeList(
            static_cast<DaxAmplitudeType>(type), [&](bool supported, const auto& amplitudes) {
                if (supported) ladder.assign(amplitudes.begin(), amplitudes.end());
            }));
    return ladder;
}

std::string ladderInWords(const std::vector<uint32_t>& ladder) {
    std::string words;
    for (const uint32_t step : ladder)
        words += (words.empty() ? "" : " ") + std::to_string(step);
    return words.empty() ? "none" : words;
}

namespace {

const Operation kLadder = {"daxGetAmplitudeList", true, {}, "the type is 0 or 1"};

int supports(const Client& client) {
    const auto vibrator = client.service();
    const bool permitted = mayCallRestricted();
    std::string words;
    ordered_json answers;
    for (const Query& query : kQueries) {
        const bool answer = reached((*vibrator.*query.ask)());
        answers[query.operation] = answer;
        const bool mayAsk = permitted || query.ask == &IDaxVibrator::supportsExternalControl;
        words += std::string(query.words) + ": " + (answer ? "yes" : mayAsk ? "no" : "may not ask");
        if (client.isVerbose()) words += std::string(" [") + query.operation + "]";
        words += "\n";
    }
    ordered_json members = {{"permitted", permitted}, {"supports", answers}};
    if (!permitted) {
        members["reason"] = notPermitted();
        client.warn("supports: " + notPermitted());
    }
    return client.found(words, members);
}

/** @return the service, waited for up to some seconds. @throw Unreachable */
::android::sp<IDaxVibrator> await(const Client& client, uint32_t seconds) {
    using Clock = std::chrono::steady_clock;
    const auto deadline = Clock::now() + std::chrono::seconds(seconds);
    for (;;) {
        try {
            return client.service();
        } catch (const Unreachable&) {
            if (Clock::now() >= deadline) throw;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
}

int status(const Client& client, uint32_t seconds) {
    const auto vibrator = await(client, seconds);
    const Description description = describe(vibrator);
    std::vector<std::string> interfaces;
    reached(vibrator->interfaceChain([&](const auto& chain) {
        for (const auto& descriptor : chain)
            interfaces.emplace_back(descriptor.c_str());
    }));
    const std::string indent = "\n            ";
    return client.found("service:    " + client.instance() + ", answers\nserved by:  " +
                                description.server + "\ntransport:  " + description.transport +
                                "\nmanager:    " + description.manager +
                                "\ninterfaces: " + cli::join(interfaces, indent, indent) + "\n",
                        {{"instance", client.instance()},
                         {"answers", true},
                         {"server", description.server},
                         {"transport", description.transport},
                         {"manager", description.manager},
                         {"interfaces", interfaces}});
}

int ladder(const Client& client, uint32_t type) {
    const auto steps = askLadder(*client.service(), type);
    if (!steps.empty()) {
        return client.answer(kLadder, VibratorStatus::OK,
                             {"", ladderInWords(steps), {{"ladder", steps}}});
    }
    if (type > 1) return client.answer(kLadder, VibratorStatus::BAD_VALUE);
    Answer answer;
    if (mayCallRestricted()) {
        const LocalDriver driver;
        answer.reason = driver.isUsable() ? "the motor, " + driver.motor().name + ", has no ladder"
                                          : "the motor has no ladder";
    }
    return client.answer(kLadder, VibratorStatus::UNSUPPORTED_OPERATION, answer);
}

int motor(const Client& client) {
    const auto vibrator = client.service();
    const bool isEnhanced = reached(vibrator->daxSupportsEnhancedVelmoraHapticPattern());
    const auto ladder0 = askLadder(*vibrator, 0);
    const auto ladder1 = askLadder(*vibrator, 1);
    if (!mayCallRestricted()) return client.answer(kLadder, VibratorStatus::UNSUPPORTED_OPERATION);

    ordered_json members;
    std::string words = "not known, since its nodes cannot be opened here";
    const LocalDriver driver;
    if (driver.isUsable()) {
        const LocalDriver::Motor motor = driver.motor();
        words = motor.inWords();
        members = {{"name", motor.name}, {"number", motor.number}, {"found", motor.found}};
    }
    members["ladders"] = {{"0", ladder0}, {"1", ladder1}};
    members["enhancedPatterns"] = isEnhanced;
    return client.found("motor:    " + words + "\nladder 0: " + ladderInWords(ladder0) +
                                "\nladder 1: " + ladderInWords(ladder1) +
                                "\nenhanced patterns: " + (isEnhanced ? "yes" : "no") + "\n",
                        members);
}

}  // namespace

void addQueries(Client& client) {
    client.command(kForAll, "supports", "ask the service what it can do here", "").run([&client] {
        return supports(client);
    });

    constexpr cli::Numbers kWaits = {"a time in s", 0, 3600};
    cli::Command& waiting = client.command(
            kForAll, "status", "say whether the service answers, and who serves it", "--wait 10");
    const auto wait =
            waiting.number("--wait SECONDS", kWaits, "how long to wait for the service", 0);
    waiting.run([&client, wait] { return status(client, *wait); });

    constexpr cli::Numbers kTypes = {"the type of a ladder", 0, 1, UINT32_MAX};
    cli::Command& typed =
            client.command(kRestricted, "ladder",
                           "print the ladder of intensities that suits the motor", "--type 1");
    const auto type = typed.number("--type N", kTypes, "variant of the ladder", 0);
    typed.run([&client, type] { return ladder(client, *type); });

    client.command(kRestricted, "motor", "tell the name, number and ladders of the motor", "")
            .run([&client] { return motor(client); });
}

}  // namespace vibratorctl
