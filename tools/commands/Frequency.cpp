// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

void addFrequency(Client& client) {
    using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
    constexpr cli::Numbers kTypes = {"a frequency type", 0, 4, UINT32_MAX};
    cli::Command& frequency = client.program().command(
            kRestricted, "frequency", "choose the frequency type of the motor", "3");
    const auto type = frequency.number("TYPE", kTypes, "the driver gives it its meaning");
    frequency.run([&client, type] {
        return client.answer(
                {"frequency", "daxSetFrequencyType", true, std::to_string(*type)},
                client.service()->daxSetFrequencyType(static_cast<DaxFrequencyType>(*type)));
    });
}
