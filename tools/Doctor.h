// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <nlohmann/json.hpp>
#include <string>

/**
 * Examines the driver's nodes, with or without a running service.
 *
 * @param simulation directory of a simulated driver; empty for the kernel's.
 * @param serviceError why the service cannot be reached; empty where it answers.
 * @return what was found: layout, nodes, motor, features, ladders, and under "findings" what is
 *     wrong, each with what to do.
 */
nlohmann::ordered_json examine(const std::string& simulation, const std::string& serviceError);

/** @return the same for a person to read. */
std::string examinationInWords(const nlohmann::ordered_json& examination);
