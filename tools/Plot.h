// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Timeline.h"

#include <string>

enum class PictureFormat { kSvg, kPng };

/** @return a script by which gnuplot writes a timeline as a picture to standard output. */
std::string plotScript(const Timeline& timeline, PictureFormat format);

/**
 * Lets gnuplot draw a timeline.
 *
 * @return the bytes of the picture. @throw std::runtime_error that says what to do.
 */
std::string drawPicture(const Timeline& timeline, PictureFormat format);

/** @return the timeline for a terminal of some columns. */
std::string plotText(const Timeline& timeline, size_t columns);

/** @return what a timeline is about, in a few words. */
std::string plotTitle(const Timeline& timeline);

/** @return what cannot be seen from a plot by itself, like that times are missing; or nothing. */
std::string plotNote(const Timeline& timeline);
