// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <CLI/App.hpp>
#include <string>

/** @return a script by which a shell, "bash" or "zsh", completes a program's commands and options.
 */
std::string completionScript(const CLI::App& app, const std::string& program,
                             const std::string& shell);
