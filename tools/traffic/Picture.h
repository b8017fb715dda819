// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "traffic/Timeline.h"

namespace vibratorctl {

enum class PictureFormat { kSvg, kPng };

/** @return a gnuplot script that draws a timeline and writes the picture to standard output. */
std::string plotScript(const Timeline& timeline, PictureFormat format);

/**
 * Draws a timeline with gnuplot.
 *
 * @return the bytes of the picture. @throw std::runtime_error that says what to do.
 */
std::string drawPicture(const Timeline& timeline, PictureFormat format);

}  // namespace vibratorctl
