// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Client.h"

/** All commands, in the order of the help. Each NAME has a file NAME.cpp with an addNAME(). */
#define VIBRATORCTL_COMMANDS(ADD) \
    ADD(OnOff)                    \
    ADD(Click)                    \
    ADD(External)                 \
    ADD(Supports)                 \
    ADD(Status)                   \
    ADD(Amplitude)                \
    ADD(Frequency)                \
    ADD(Fold)                     \
    ADD(Prebaked)                 \
    ADD(Engine)                   \
    ADD(Ladder)                   \
    ADD(Motor)                    \
    ADD(Doctor)                   \
    ADD(Play)                     \
    ADD(Watch)                    \
    ADD(Plot)                     \
    ADD(Completion)

#define DECLARE(name) void add##name(Client& client);
VIBRATORCTL_COMMANDS(DECLARE)
#undef DECLARE

// The groups of the help.
inline constexpr char kForAll[] = "For everybody";
inline constexpr char kRestricted[] = "For root and system";
inline constexpr char kTools[] = "Tools";

/** A time that the motor runs. */
inline constexpr cli::Numbers kTimes = {"a time in ms", 0, INT32_MAX};
/** Full strength and less on the driver's own scale; the service judges what is beyond. */
inline constexpr cli::Numbers kIntensities = {"an intensity", 1, 10000, UINT32_MAX};
