// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

namespace vibratorctl {

void addSettings(Client& client) {
    constexpr cli::Numbers kAmplitudes = {"an amplitude", 1, 255, "%"};
    constexpr cli::Numbers kFrequencyTypes = {"a frequency type", 0, 4};
    const auto add = [&](const char* name, const char* help, const char* example,
                         const OneArgument& argument, const Operation& operation,
                         const Call& call) {
        addCall(client, client.command(kRestricted, name, help, example), argument, operation,
                call);
    };
    add("amplitude", "set the strength on the platform's scale", "128",
        {"N", "from weakest to strongest", kAmplitudes}, {"setAmplitude", true, {"intensity"}},
        callOf(&IDaxVibrator::setAmplitude));
    add("intensity", "set the strength on the driver's own scale", "5000",
        {"N", "the strength; 10000 is full", kIntensities},
        {"daxSetAmplitude", true, {"intensity"}}, callOf(&IDaxVibrator::daxSetAmplitude));
    add("force-touch", "set the strength of force-touch feedback", "5000",
        {"N", "the strength; 10000 is full", kIntensities},
        {"daxSetForceTouchAmplitude", true, {"force_touch_intensity"}},
        callOf(&IDaxVibrator::daxSetForceTouchAmplitude));
    add("frequency", "choose the frequency type of the motor", "3",
        {"TYPE", "the driver defines its meaning", kFrequencyTypes},
        {"daxSetFrequencyType", true, {"multi_freq"}}, callOf(&IDaxVibrator::daxSetFrequencyType));
    add("fold", "tell the driver that the device is open or folded", "close",
        {"STATE",
         "the device's state",
         {},
         {{"open", "the device is open"}, {"close", "the device is folded"}}},
        {"daxSetFolderStatus", true, {"event_cmd"}}, callOf(&IDaxVibrator::daxSetFolderStatus));
}

}  // namespace vibratorctl
