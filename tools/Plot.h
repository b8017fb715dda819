// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Timeline.h"

enum class PictureFormat { kSvg, kPng };

/** @return a gnuplot script that draws a timeline and writes the picture to standard output. */
std::string plotScript(const Timeline& timeline, PictureFormat format);

/**
 * Draws a timeline with gnuplot.
 *
 * @return the bytes of the picture. @throw std::runtime_error that says what to do.
 */
std::string drawPicture(const Timeline& timeline, PictureFormat format);

/** @return the timeline for a terminal of some columns. */
std::string plotText(const Timeline& timeline, size_t columns);

/** @return the title of a plot. */
std::string plotTitle(const Timeline& timeline);

/** @return what a plot does not show by itself, like missing times; empty if there is nothing. */
std::string plotNote(const Timeline& timeline);
