// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "transport/Stub.h"

#include <hidl/Status.h>

#include <string>

namespace android::hardware::details {

/**
 * Makes an instance of an interface reachable: a listening socket named after the interface, and a
 * link to it for each interface that it extends. What a dead process has left is taken over; what a
 * living one has published is not, with ALREADY_EXISTS.
 *
 * @param listener set to the socket, which does not block; it stays published until the process
 *     ends.
 */
Status publish(const Stub& stub, const std::string& instance, int* listener);

}  // namespace android::hardware::details
