// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "transport/Message.h"

#include <android/hidl/base/1.0/IBase.h>
#include <utils/Errors.h>

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>
#include <tuple>
#include <type_traits>

namespace android::hardware::details {

using IBase = ::android::hidl::base::V1_0::IBase;

/** Serves one operation: takes its arguments from the request, puts its results into the reply. */
using Handler = void (*)(IBase& object, Reader& request, Writer& reply);

struct Operation {
    uint32_t code;
    Handler handler;
};

/** What the receiving side knows of an interface. */
struct Stub {
    const char* descriptor;
    const Operation* operations;
    size_t operationCount;
    /** The interface that this one extends; nullptr for the base of all. */
    const Stub* parent;
};

/**
 * Serves one request with an object.
 *
 * @param stub the most derived interface of the object.
 * @return OK, UNKNOWN_TRANSACTION for an interface or operation that the object does not have, or
 *     BAD_TYPE for arguments that are not the operation's. The reply is of use only when OK.
 */
status_t dispatch(const Stub& stub, IBase& object, Reader& request, Writer& reply);

/** Publishes an object under an instance name; what IFoo::registerAsService does. */
status_t registerService(const sp<IBase>& object, const Stub& stub, const std::string& instance);

template <typename T>
void prepareArgument(Reader& request, Writer& /* reply */, T* argument) {
    request.take(argument);
}

/** A result callback is no argument: it is made here, to put what it is given into the reply. */
template <typename... Results>
void prepareArgument(Reader& /* request */, Writer& reply,
                     std::function<void(Results...)>* callback) {
    *callback = [&reply](Results... results) { (reply.put(results), ...); };
}

template <typename Interface, typename Result, typename... Arguments>
void invoke(Return<Result> (Interface::*operation)(Arguments...), IBase& object, Reader& request,
            Writer& reply) {
    std::tuple<std::decay_t<Arguments>...> arguments;
    std::apply([&](auto&... each) { (prepareArgument(request, reply, &each), ...); }, arguments);
    if (!request.isComplete()) return;

    auto& target = static_cast<Interface&>(object);
    std::apply(
            [&](auto&... each) {
                Return<Result> result = (target.*operation)(each...);
                if constexpr (!std::is_void_v<Result>) reply.put(static_cast<Result>(result));
            },
            arguments);
}

/** The handler of an operation, made from the operation's own declaration. */
template <auto operation>
void handle(IBase& object, Reader& request, Writer& reply) {
    invoke(operation, object, request, reply);
}

}  // namespace android::hardware::details
