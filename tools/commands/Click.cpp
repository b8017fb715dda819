// SPDX-License-Identifier: Apache-2.0
#include "Click.h"

#include "Commands.h"

namespace {

namespace platform = ::android::hardware::vibrator;
using platform::V1_0::EffectStrength;
using service::IDaxVibrator;

cli::Value<size_t> addStrength(cli::Command& command) {
    constexpr size_t kMedium = 1;
    return command.choice("--strength STRENGTH",
                          {{"light", "weak"}, {"medium", "as usual"}, {"strong", "full strength"}},
                          "how strong", kMedium);
}

}  // namespace

int performEffect(const Client& client, const std::string& command, uint32_t effect, size_t version,
                  EffectStrength strength) {
    constexpr const char* kOperations[] = {"perform", "perform_1_1", "perform_1_2", "perform_1_3"};
    const std::string argument = command == "effect" ? std::to_string(effect) : "";
    const ::android::sp<IDaxVibrator> vibrator = client.service();
    VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
    uint32_t length = 0;
    const auto take = [&](VibratorStatus answered, uint32_t lengthMs) {
        status = answered;
        length = lengthMs;
    };
    Client::reached(
            version == 1 ? vibrator->perform_1_1(platform::V1_1::Effect_1_1{effect}, strength, take)
            : version == 2 ? vibrator->perform_1_2(platform::V1_2::Effect{effect}, strength, take)
            : version == 3 ? vibrator->perform_1_3(platform::V1_3::Effect{effect}, strength, take)
                           : vibrator->perform(platform::V1_0::Effect{effect}, strength, take));
    const Call call{command, kOperations[version], false, argument};
    if (status == VibratorStatus::UNSUPPORTED_OPERATION) {
        return client.report().answer(
                call, status, {},
                "this service plays one effect only: effect 0 of version 1.0, the click");
    }
    if (status != VibratorStatus::OK) return client.answer(call, status);
    return client.answer(call, status, {std::to_string(length) + " ms", {{"lengthMs", length}}});
}

void addClick(Client& client) {
    cli::Command& click = client.program().command(kForAll, "click", "play the predefined click",
                                                   "--strength strong");
    const auto strength = addStrength(click);
    click.run([&client, strength] {
        return performEffect(client, "click", 0, 0, static_cast<EffectStrength>(*strength));
    });

    constexpr cli::Numbers kEffects = {"the number of an effect", 0, UINT32_MAX};
    cli::Command& effect = client.program().command(
            kForAll, "effect", "ask for a predefined effect by its number", "0 --strength light");
    const auto number = effect.number("NUMBER", kEffects, "0 is the click");
    const auto version = effect.choice("--version VERSION",
                                       {{"1.0", "perform"},
                                        {"1.1", "perform_1_1"},
                                        {"1.2", "perform_1_2"},
                                        {"1.3", "perform_1_3"}},
                                       "version of the interface that has the effect", 0);
    const auto effectStrength = addStrength(effect);
    effect.run([=, &client] {
        return performEffect(client, "effect", *number, *version,
                             static_cast<EffectStrength>(*effectStrength));
    });
}
