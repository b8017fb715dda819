// SPDX-License-Identifier: Apache-2.0
#pragma once

/** Priorities of a log line, least urgent first. */
enum android_LogPriority {
    ANDROID_LOG_UNKNOWN = 0,
    ANDROID_LOG_DEFAULT,
    ANDROID_LOG_VERBOSE,
    ANDROID_LOG_DEBUG,
    ANDROID_LOG_INFO,
    ANDROID_LOG_WARN,
    ANDROID_LOG_ERROR,
    ANDROID_LOG_FATAL,
    ANDROID_LOG_SILENT,
};

/**
 * Writes one line to standard error in the brief form, "D/Tag( pid): message". Lines that
 * ANDROID_LOG_TAGS filters out are not even formatted. Control characters in the message are
 * escaped, so that a call is always exactly one line. Leaves errno as it was.
 *
 * @return 1 when the line was written, 0 when it was filtered out, a negative errno otherwise.
 */
extern "C" int __android_log_print(int prio, const char* tag, const char* fmt, ...)
        __attribute__((__format__(printf, 3, 4)));
