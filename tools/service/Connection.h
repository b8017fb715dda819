// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "service/Process.h"

#include <hidl/Status.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <chrono>
#include <nlohmann/json.hpp>
#include <stdexcept>
#include <string>

/** How the client finds the service; only this part depends on the runtime's transport. */
namespace vibratorctl {

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

/** The service cannot be reached; what() says why. */
class Unreachable : public std::runtime_error {
  public:
    /** @param found whether there is such a service. */
    explicit Unreachable(const std::string& why, bool found = true)
        : runtime_error(why), isFound(found) {}
    const bool isFound;
};

/** Finds the service. @param wait the longest to wait for it. @throw Unreachable */
::android::sp<IDaxVibrator> connect(const std::string& instance,
                                    std::chrono::milliseconds wait = {});

/** Limits the time that a call may take from now on. @param limit 0 for no limit. */
void setCallTimeout(std::chrono::milliseconds limit);

/** @return the result of a call that reached the service. @throw Unreachable */
template <typename T>
T reached(const ::android::hardware::Return<T>& result) {
    if (!result.isOk()) throw Unreachable(result.description());
    return static_cast<T>(result);
}

/** @return the process that serves the calls; nothing where /proc does not show it. */
std::optional<Process> serverOf(IDaxVibrator& vibrator);

/** Who serves the calls and how they get there: the lines for a person, and the members. */
struct Served {
    std::string server;
    std::string transport;
    std::string manager;
    nlohmann::ordered_json members;
};

/** Describes the process that serves, if it is known, and the way that the last call took. */
Served describe(const std::optional<Process>& server);

}  // namespace vibratorctl
