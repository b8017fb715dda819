// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/log.h>

#include <cstdlib>

/** Logs a message, tagged LOG_TAG, and ends the process. */
#define LOG_ALWAYS_FATAL(...)                                            \
    do {                                                                 \
        __android_log_print(ANDROID_LOG_FATAL, LOG_TAG, "" __VA_ARGS__); \
        abort();                                                         \
    } while (false)
