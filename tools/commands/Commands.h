// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Amplitude.h"
#include "Client.h"

namespace vibratorctl {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

/** Adds all commands, in the order of the help. */
void addCommands(Client& client);

// Each subject's commands are in a file of its name.
void addVibration(Client& client);
void addSettings(Client& client);
void addPatterns(Client& client);
void addQueries(Client& client);
void addDoctor(Client& client);
void addSelftest(Client& client);
void addPlay(Client& client);
void addWatch(Client& client);
void addPlot(Client& client);

// The groups of the help.
inline constexpr char kForAll[] = "For everybody";
inline constexpr char kRestricted[] = "For root and system";
inline constexpr char kTools[] = "Tools";

/** The driver's own scale, up to full strength. */
inline constexpr cli::Numbers kIntensities = {"an intensity", 1, product::kMaxAmplitude, "%"};

/** The only argument of a command: a number, or one of some words. */
struct OneArgument {
    const char* name;
    const char* help;
    cli::Numbers numbers = {};
    std::vector<cli::Choice> choices = {};
};

/** A call with a number, or the index of a choice. */
using Call = std::function<::android::hardware::Return<VibratorStatus>(IDaxVibrator&, uint32_t)>;

/** @return the call of an operation with one argument. */
template <typename Interface, typename T>
Call callOf(::android::hardware::Return<VibratorStatus> (Interface::*operation)(T)) {
    return [operation](IDaxVibrator& vibrator, uint32_t number) {
        return (vibrator.*operation)(static_cast<T>(number));
    };
}

/** Waits, unless a play is interrupted. */
void wait(uint32_t ms);

/** Adds a command that makes one call with one argument, and that is also a step of scores. */
void addCall(Client& client, cli::Command& command, const OneArgument& argument,
             const Operation& operation, const Call& call);

/** Adds the argument of a command that reads node traffic. @return gives the name of the file. */
std::function<std::string()> addTraffic(cli::Command& command);

}  // namespace vibratorctl
