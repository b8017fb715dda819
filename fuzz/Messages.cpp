// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"
#include "interface/Stubs.h"
#include "transport/Message.h"

#include <cstdlib>
#include <cstring>

using namespace ::android::hardware::details;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

/** Any bytes as a request to the service object: they get an answer, and nothing else. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    [[maybe_unused]] static const int quiet = setenv("ANDROID_LOG_TAGS", "*:S", 1);
    static const ::android::sp<Vibrator> vibrator = new Vibrator;
    static Message request;
    static Message reply;
    if (size > kMaxMessageSize) return 0;
    memcpy(request.data, data, size);
    request.size = size;

    Reader reader(request);
    Writer writer(reply);
    const ::android::status_t error = dispatch(kDax21Stub, *vibrator, reader, writer);
    const bool known = error == ::android::OK || error == ::android::UNKNOWN_TRANSACTION ||
                       error == ::android::BAD_TYPE;
    // No answer of this object comes near the limit of a message.
    if (!known || reply.size > 4096) abort();
    return 0;
}
