// SPDX-License-Identifier: Apache-2.0
#include "transport/Stub.h"

#include <string_view>

namespace android::hardware::details {
namespace {

const Stub* findInterface(const Stub& stub, std::string_view descriptor) {
    for (const Stub* each = &stub; each != nullptr; each = each->parent) {
        if (descriptor == each->descriptor) return each;
    }
    return nullptr;
}

Handler findHandler(const Stub& stub, uint32_t code) {
    for (size_t i = 0; i < stub.operationCount; ++i) {
        if (stub.operations[i].code == code) return stub.operations[i].handler;
    }
    return nullptr;
}

}  // namespace

status_t dispatch(const Stub& stub, IBase& object, Reader& request, Writer& reply) {
    uint32_t code = 0;
    std::string_view descriptor;
    request.take(&code);
    request.take(&descriptor);

    const Stub* interface = findInterface(stub, descriptor);
    const Handler handler = interface == nullptr ? nullptr : findHandler(*interface, code);
    if (handler == nullptr) return UNKNOWN_TRANSACTION;

    handler(object, request, reply);
    if (!request.isComplete()) return BAD_TYPE;
    return reply.fits() ? OK : FAILED_TRANSACTION;
}

}  // namespace android::hardware::details
