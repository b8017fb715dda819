// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "transport/Connection.h"
#include "transport/Message.h"

#include <hidl/Status.h>

#include <cstdint>
#include <functional>
#include <tuple>
#include <type_traits>
#include <utility>

namespace android::hardware::details {

/** The calling side of a remote object: turns a call into a request and its reply into results. */
class Proxy {
  public:
    explicit Proxy(sp<Connection> connection) : mConnection(std::move(connection)) {}
    virtual ~Proxy() = default;

    const sp<Connection>& connection() const { return mConnection; }

  protected:
    /** Calls an operation that returns its result; Result is void for one that has none. */
    template <typename Result, typename... Arguments>
    Return<Result> call(const char* descriptor, uint32_t code, const Arguments&... arguments) {
        if constexpr (std::is_void_v<Result>) {
            return {transact<>(
                    descriptor, code, [] {}, arguments...)};
        } else {
            Result value{};
            Status status = transact<Result>(
                    descriptor, code, [&](const Result& result) { value = result; }, arguments...);
            if (!status.isOk()) return {std::move(status)};
            return {value};
        }
    }

    /** Calls an operation that delivers its results through a callback. */
    template <typename... Results, typename... Arguments>
    Return<void> callBack(const char* descriptor, uint32_t code,
                          const std::function<void(Results...)>& callback,
                          const Arguments&... arguments) {
        return {transact<std::decay_t<Results>...>(descriptor, code, callback, arguments...)};
    }

  private:
    template <typename... Results, typename Callback, typename... Arguments>
    Status transact(const char* descriptor, uint32_t code, const Callback& callback,
                    const Arguments&... arguments) {
        Message message;
        Writer request(message);
        request.put(code);
        request.put(std::string_view(descriptor));
        (request.put(arguments), ...);
        if (!request.fits()) {
            return Status::fromStatusT(FAILED_TRANSACTION, "the arguments are too large");
        }
        Status status = mConnection->transact(message);
        if (!status.isOk()) return status;

        Reader reply(message);
        status_t error = UNKNOWN_ERROR;
        reply.take(&error);
        if (error != OK) return Status::fromStatusT(error);
        std::tuple<Results...> results;
        std::apply([&](auto&... each) { (reply.take(&each), ...); }, results);
        if (!reply.isComplete()) return Status::fromStatusT(BAD_TYPE);
        std::apply(callback, results);
        return Status::ok();
    }

    sp<Connection> mConnection;
};

}  // namespace android::hardware::details
