// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cerrno>
#include <cstdint>

namespace android {

/** 0 for success, else a negative error; the values are the platform's, and travel in replies. */
using status_t = int32_t;

enum : status_t {
    OK = 0,
    UNKNOWN_ERROR = INT32_MIN,
    BAD_TYPE = UNKNOWN_ERROR + 1,
    FAILED_TRANSACTION = UNKNOWN_ERROR + 2,
    UNEXPECTED_NULL = UNKNOWN_ERROR + 8,
    NO_MEMORY = -ENOMEM,
    INVALID_OPERATION = -ENOSYS,
    BAD_VALUE = -EINVAL,
    NAME_NOT_FOUND = -ENOENT,
    NO_INIT = -ENODEV,
    DEAD_OBJECT = -EPIPE,
    UNKNOWN_TRANSACTION = -EBADMSG,
    NOT_ENOUGH_DATA = -ENODATA,
    TIMED_OUT = -ETIMEDOUT,
};

}  // namespace android
