// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "service/LocalDriver.h"
#include "service/Queries.h"

#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace vibratorctl {

/** A node, what it is for, and what it is like now. */
struct NodeFinding {
    std::string path;
    const char* serves;
    LocalDriver::Node now;
};

/** What is wrong, and what to do about it. */
struct Finding {
    std::string problem;
    std::string advice;
};

/** The service and the driver, examined. */
struct Diagnosis {
    bool answers = false;
    std::optional<Process> server;
    Route route;
    std::string layout;
    std::optional<LocalDriver::Motor> motor;
    /** Features that the driver has and does not have, and its ladders; only with a motor. */
    std::vector<std::pair<std::string, bool>> features;
    std::vector<uint32_t> ladders[2];
    std::vector<NodeFinding> nodes;
    std::vector<Finding> findings;
    std::vector<std::string> notes;
};

/**
 * Examines all that the service needs. It makes calls that do not move the motor, each within some
 * seconds, and compares the answers with what the nodes show.
 */
Diagnosis diagnose(const std::string& instance);

}  // namespace vibratorctl
