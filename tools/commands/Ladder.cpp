// SPDX-License-Identifier: Apache-2.0
#include "Ladder.h"

#include "Commands.h"
#include "LocalDriver.h"

std::vector<uint32_t> askLadder(const ::android::sp<service::IDaxVibrator>& vibrator,
                                uint32_t type) {
    using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
    std::vector<uint32_t> ladder;
    Client::reached(vibrator->daxGetAmplitudeList(
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

void addLadder(Client& client) {
    constexpr cli::Numbers kTypes = {"the type of a ladder", 0, 1, UINT32_MAX};
    cli::Command& ladder = client.program().command(
            kRestricted, "ladder", "print the ladder of intensities that suits the motor",
            "--type 1");
    const auto type = ladder.number("--type N", kTypes, "variant of the ladder", 0);
    ladder.run([&client, type] {
        const auto steps = askLadder(client.service(), *type);
        const Call call{"ladder", "daxGetAmplitudeList", true};
        if (!steps.empty()) {
            return client.answer(call, VibratorStatus::OK,
                                 {ladderInWords(steps), {{"ladder", steps}}});
        }
        if (*type > 1) return client.answer(call, VibratorStatus::BAD_VALUE);
        if (!mayCallRestricted()) return client.answer(call, VibratorStatus::UNSUPPORTED_OPERATION);
        const LocalDriver driver;
        return client.report().answer(
                call, VibratorStatus::UNSUPPORTED_OPERATION, {},
                driver.isUsable() ? "the motor, " + driver.motor().name + ", has no ladder"
                                  : "the motor has no ladder");
    });
}
