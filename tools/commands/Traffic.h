// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Client.h"
#include "Trace.h"

/** @return the file of node traffic to read: the one that was named, or the simulated driver's. */
inline std::string trafficFile(const std::string& named, bool isLog) {
    const std::string simulation = simulationDirectory();
    if (!named.empty()) return named;
    if (isLog || simulation.empty()) {
        throw cli::UsageError("no FILE: name a trace, or a log with --log");
    }
    return simulator::traceFile(simulation);
}
