// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

/** The platform's fixed user ids, as many as are used here. */
inline constexpr uid_t AID_ROOT = 0;
/** Owns the device's drivers, and calls the hardware services for the applications. */
inline constexpr uid_t AID_SYSTEM = 1000;
/** The user of "adb shell". */
inline constexpr uid_t AID_SHELL = 2000;
