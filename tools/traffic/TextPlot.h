// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "traffic/Timeline.h"

namespace vibratorctl {

/**
 * @param columns the width of the terminal.
 * @param isAscii whether to draw with the characters of ASCII alone.
 * @return the timeline, with numbers at the calls that are listed below it.
 */
std::string plotText(const Timeline& timeline, size_t columns, bool isAscii);

}  // namespace vibratorctl
