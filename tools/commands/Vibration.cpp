// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "EffectPlayback.h"
#include "Strengths.h"
#include "service/Queries.h"

#include <cstdlib>

namespace vibratorctl {

namespace platform = ::android::hardware::vibrator;
using platform::V1_0::EffectStrength;

namespace {

/** The minor versions of the platform's interface, and the operation for effects in each. */
const std::vector<cli::Choice> kVersions = {
        {"1.0", "perform"}, {"1.1", "perform_1_1"}, {"1.2", "perform_1_2"}, {"1.3", "perform_1_3"}};

const cli::Argument* addStrength(cli::Command& command) {
    return command.add("--strength STRENGTH",
                       {{kStrengths[0], "weak"},
                        {kStrengths[1], "as usual"},
                        {kStrengths[2], "full strength"}},
                       "how strong", kStrengths[1]);
}

/** @return what a click that is answered with OK does without; empty if nothing. */
std::string whatClickLacks(const LocalDriver& driver) {
    if (!driver.isUsable()) {
        return R"(the service has no driver, nothing moved; "vibratorctl doctor" says what to do)";
    }
    // The LED trigger keeps the time that it was told. Who may not read it does not know.
    if (driver.mode() == product::kLedTriggerMode && driver.look("duration").firstLine() == "0") {
        return "the service does not use the driver, nothing moved; \"vibratorctl doctor\" says "
               "what to do";
    }
    if (!mayCallRestricted()) {
        return "the strength is the one that was set before; only " + permittedUsers() +
               " may change it";
    }
    if (driver.daxSupportsAmplitudeControl()) return "";
    return "this driver has no control of the strength";
}

/**
 * Asks for a predefined effect, and reports the answer.
 *
 * @param argument what the user asked for, for the report.
 * @param version which of kVersions has the effect.
 */
int performEffect(const Client& client, const std::string& argument, uint32_t effect,
                  size_t version, size_t strengthIndex) {
    const auto strength = static_cast<EffectStrength>(strengthIndex);
    const ::android::sp<IDaxVibrator> vibrator = client.service();
    VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
    Answer answer{argument};
    const auto take = [&](VibratorStatus answered, uint32_t lengthMs) {
        status = answered;
        if (status != VibratorStatus::OK) return;
        answer.words = std::to_string(lengthMs) + " ms";
        answer.members["lengthMs"] = lengthMs;
    };
    reached(version == 1 ? vibrator->perform_1_1(platform::V1_1::Effect_1_1{effect}, strength, take)
            : version == 2 ? vibrator->perform_1_2(platform::V1_2::Effect{effect}, strength, take)
            : version == 3 ? vibrator->perform_1_3(platform::V1_3::Effect{effect}, strength, take)
                           : vibrator->perform(platform::V1_0::Effect{effect}, strength, take));
    if (status == VibratorStatus::UNSUPPORTED_OPERATION) {
        answer.reason = "this service plays one effect only: effect 0 of version 1.0, the click";
    } else if (status == VibratorStatus::OK) {
        answer.warning = whatClickLacks(driverOf(*vibrator));
    }
    return client.report().answer({kVersions[version].meaning}, status, answer);
}

void addClick(Client& client) {
    cli::Command& click =
            client.command(kForAll, "click", "play the predefined click", "--strength strong");
    const auto* const strength = addStrength(click);
    click.run([&client, strength] { return performEffect(client, "", 0, 0, strength->number()); });
    client.steps.push_back({"click", &click, [] { return product::kClickMs; }});
}

void addEffect(Client& client) {
    constexpr cli::Numbers kEffects = {"the number of an effect", 0, UINT32_MAX};
    cli::Command& effect = client.command(
            kForAll, "effect", "ask for a predefined effect by its number", "0 --strength light");
    const auto* const number = effect.add("NUMBER", kEffects, "0 is the click");
    const auto* const version =
            effect.add("--version VERSION", kVersions,
                       "version of the interface that has the effect", kVersions[0].value);
    const auto* const strength = addStrength(effect);
    effect.run([=, &client] {
        return performEffect(client, std::to_string(number->number()), number->number(),
                             version->number(), strength->number());
    });
}

/** Runs the motor. @param intensity set before it; 0 for none. @return the exit code. */
int runMotor(const Client& client, uint32_t ms, uint32_t intensity) {
    const ::android::sp<IDaxVibrator> vibrator = client.service();
    Answer answer{std::to_string(ms)};
    if (intensity != 0) {
        const VibratorStatus status = reached(vibrator->daxSetAmplitude(intensity));
        if (status != VibratorStatus::OK) {
            return client.report().answer({"daxSetAmplitude", true, {"intensity"}}, status, answer);
        }
        const int made = atoi(driverOf(*vibrator).look("intensity").value.c_str());
        answer.words = "intensity " + std::to_string(made);
        answer.members["intensity"] = made;
    }
    return client.report().answer({"on"}, vibrator->on(ms), answer);
}

}  // namespace

void addVibration(Client& client) {
    constexpr cli::Numbers kTimes = {"a time like 500, 500ms or 2s", 0, INT32_MAX, "ms"};
    cli::Command& on = client.command(kForAll, "on", "run the motor", "500 --strength 50%");
    const auto* const ms = on.add("MS", kTimes, "how long");
    const auto* const strength =
            on.add("--strength N", kIntensities, "sets the intensity first, for root and system");
    const auto* const waits = on.add("--wait", cli::kFlag, "wait until the motor has stopped");
    on.run([=, &client] {
        const int code = runMotor(client, ms->number(), strength->number());
        if (code == cli::kSuccess && waits->isGiven()) wait(ms->number());
        return code;
    });
    client.steps.push_back({"on", &on, [ms] { return ms->number(); },
                            [ms, waits] { return waits->isGiven() ? ms->number() : 0; }});

    cli::Command& off = client.command(kForAll, "off", "stop the motor", "");
    off.run([&client] { return client.report().answer({"off"}, client.service()->off()); });
    client.steps.push_back({"off", &off, [] { return 0; }});

    addClick(client);
    addEffect(client);
    addCall(client,
            client.command(kForAll, "external",
                           "hand the motor to an external control, or take it back", "on"),
            {"STATE",
             "who runs the motor",
             {},
             {{"on", "something else runs the motor"}, {"off", "the service runs the motor"}}},
            {"setExternalControl", false, {"ext_control"}},
            [](IDaxVibrator& vibrator, uint32_t index) {
                return vibrator.setExternalControl(index == 0);
            });
}

}  // namespace vibratorctl
