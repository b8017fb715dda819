// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "traffic/Timeline.h"

namespace vibratorctl {

/** @return the timeline for a terminal of some columns. */
std::string plotText(const Timeline& timeline, size_t columns);

}  // namespace vibratorctl
