// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Report.h"

#include <string>

/** @return why the service refused a call, as far as the driver tells; with what to do. */
std::string reasonOf(const Call& call, VibratorStatus status);
