// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdint>
#include <string>

/** How the client finds the service. All that depends on the runtime's transport is here. */
namespace service {

using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

/**
 * Finds the service, without waiting for it.
 *
 * @param whyNot set, where there is none, to the reason in words.
 * @return nullptr where none answers.
 */
::android::sp<IDaxVibrator> connect(const std::string& instance, std::string* whyNot);

/** Limits the time that a call may take from now on. @param seconds 0 for no limit. */
void setCallTimeout(uint32_t seconds);

/** Who serves the calls, and how they get there; in words for a person. */
struct Description {
    /** What carries the calls. */
    std::string transport;
    /** Whether a service manager answers. */
    std::string manager;
    /** Process and program; empty where there is no service. */
    std::string server;
};

/** @param vibrator the service; nullptr where there is none. */
Description describe(const ::android::sp<IDaxVibrator>& vibrator);

}  // namespace service
