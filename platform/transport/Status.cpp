// SPDX-License-Identifier: Apache-2.0
#include <android/log.h>
#include <hidl/Status.h>

#include <cstdlib>
#include <cstring>

namespace android::hardware {

Status Status::fromStatusT(status_t error, std::string what) {
    Status status;
    status.mError = error;
    status.mWhat = std::move(what);
    return status;
}

std::string Status::description() const {
    if (!mWhat.empty()) return mWhat;
    switch (mError) {
        case OK:
            return "No error";
        case DEAD_OBJECT:
            return "the service is gone";
        case UNKNOWN_TRANSACTION:
            return "the service does not know the operation";
        case BAD_TYPE:
            return "the message does not hold what the operation takes";
        case FAILED_TRANSACTION:
            return "the message is too large";
        case UNKNOWN_ERROR:
            return "unknown error";
        default:
            return strerror(-mError);
    }
}

namespace details {

void return_status::abortOnUse() const {
    __android_log_print(ANDROID_LOG_FATAL, "hwbinder", "the value of a failed call was used: %s",
                        description().c_str());
    abort();
}

}  // namespace details
}  // namespace android::hardware
