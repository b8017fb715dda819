// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Driver.h"

#include <android/log.h>
#include <hidl/Status.h>

#include <cstdlib>
#include <cstring>

namespace android::hardware {

Status Status::fromExceptionCode(int32_t code, const std::string& message) {
    Status status;
    status.mException = code;
    status.mMessage = std::make_shared<const std::string>(message);
    return status;
}

std::string Status::description() const {
    if (mException != EX_NONE && mException != EX_TRANSACTION_FAILED) {
        const std::string message = exceptionMessage();
        return message.empty() ? "exception " + std::to_string(mException) : message;
    }
    switch (mError) {
        case OK:
            return "No error";
        case DEAD_OBJECT:
            return "the service has gone, or has closed the connection";
        case TIMED_OUT:
            return "the service did not answer in time";
        case UNKNOWN_TRANSACTION:
            return "the service does not know the operation";
        case BAD_TYPE:
        case NOT_ENOUGH_DATA:
            return "the message does not hold what the operation takes";
        case FAILED_TRANSACTION:
            return "the message could not be delivered; it may be too large: over sockets, more "
                   "than 64 KiB";
        case UNKNOWN_ERROR:
            return "unknown error";
        default:
            return strerror(-mError);
    }
}

namespace details {

void return_status::abortOnUse() const {
    __android_log_print(ANDROID_LOG_FATAL, kLogTag, "the value of a failed call was used: %s",
                        description().c_str());
    abort();
}

}  // namespace details
}  // namespace android::hardware
