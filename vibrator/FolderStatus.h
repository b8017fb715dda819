// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstddef>
#include <string_view>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

/** The most bytes of the driver's text for fold events that are looked at. */
constexpr size_t kFolderTextSize = 511;

/**
 * @param text what the driver shows; one that takes fold events shows one of its commands, so any
 *     of these letters will do.
 * @return whether the driver takes the fold state.
 */
constexpr bool takesFolderStatus(std::string_view text) {
    return text.find_first_of("DFLO") != std::string_view::npos;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
