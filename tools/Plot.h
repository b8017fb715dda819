// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Timeline.h"

#include <string>

/** @return the timeline as a drawing, 1200 pixels wide. */
std::string plotSvg(const Timeline& timeline);

/** @return the timeline for a terminal of some columns. */
std::string plotText(const Timeline& timeline, size_t columns);

/** Writes a drawing as pixels. @return what is wrong; empty where nothing is. */
std::string writePng(const std::string& svg, const std::string& file);
