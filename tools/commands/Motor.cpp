// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Ladder.h"
#include "LocalDriver.h"

void addMotor(Client& client) {
    cli::Command& command = client.program().command(
            kRestricted, "motor", "tell the name, number and ladders of the motor", "");
    command.run([&client] {
        const auto vibrator = client.service();
        const bool isEnhanced =
                Client::reached(vibrator->daxSupportsEnhancedVelmoraHapticPattern());
        const auto ladder0 = askLadder(vibrator, 0);
        const auto ladder1 = askLadder(vibrator, 1);
        const Call call{"motor", "daxGetAmplitudeList", true};
        if (!mayCallRestricted()) return client.answer(call, VibratorStatus::UNSUPPORTED_OPERATION);

        nlohmann::ordered_json members;
        std::string words = "motor:    not known, since its nodes cannot be opened here\n";
        const LocalDriver driver;
        if (driver.isUsable()) {
            const LocalDriver::Motor motor = driver.motor();
            words = "motor:    " + motor.name + ", number " + std::to_string(motor.number) +
                    ", found " + motor.found + "\n";
            members = {{"name", motor.name}, {"number", motor.number}, {"found", motor.found}};
        }
        members["ladders"] = {{"0", ladder0}, {"1", ladder1}};
        members["enhancedPatterns"] = isEnhanced;
        return client.report().found("motor",
                                     words + "ladder 0: " + ladderInWords(ladder0) +
                                             "\nladder 1: " + ladderInWords(ladder1) +
                                             "\nenhanced patterns: " + (isEnhanced ? "yes" : "no") +
                                             "\n",
                                     members);
    });
}
