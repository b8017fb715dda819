// SPDX-License-Identifier: Apache-2.0
#pragma once

/** Descriptors and numbers that travel together; numFds + numInts of them follow. */
struct native_handle_t {
    int version;
    int numFds;
    int numInts;
};
