// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <string>

namespace vibratorctl {

/** @return what a file holds, or standard input for "-". @throw cli::UsageError */
std::string readInput(const std::string& name);

}  // namespace vibratorctl
