// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlSupport.h>
#include <utils/Errors.h>
#include <utils/StrongPointer.h>

#include <cstdint>
#include <memory>
#include <string>
#include <utility>

namespace android::hardware {

/** Outcome of the transport of a call, without the operation's own answer. */
class Status {
  public:
    /** The published exception codes that generated code uses; they travel in replies. */
    enum Exception : int32_t {
        EX_NONE = 0,
        EX_ILLEGAL_ARGUMENT = -3,
        EX_NULL_POINTER = -4,
        EX_TRANSACTION_FAILED = -129,
    };

    Status() = default;
    static Status ok() { return {}; }
    static Status fromExceptionCode(int32_t code, const std::string& message = {});

    /** Sets the outcome that an error of the transport means. */
    void setFromStatusT(status_t error) {
        mException = error == OK ? EX_NONE : EX_TRANSACTION_FAILED;
        mError = error;
        mMessage = nullptr;
    }

    bool isOk() const { return mException == EX_NONE; }
    int32_t exceptionCode() const { return mException; }
    std::string exceptionMessage() const { return mMessage == nullptr ? "" : *mMessage; }
    status_t transactionError() const { return mError; }
    /** @return the outcome in words, "No error" for success. */
    std::string description() const;

  private:
    int32_t mException = EX_NONE;
    status_t mError = OK;
    /** Only exceptions have one, and most calls succeed. */
    std::shared_ptr<const std::string> mMessage;
};

namespace details {

/** The part of a Return that does not depend on its value's type. */
class return_status {
  public:
    return_status() = default;
    return_status(Status status) : mStatus(std::move(status)) {}  // NOLINT: implicit as published

    /** @return whether the call reached its object and the answer came back. */
    bool isOk() const { return mStatus.isOk(); }
    /** @return the outcome of the transport; it is this platform's own to ask for it so. */
    const Status& status() const { return mStatus; }
    /** @return whether the object's process has ended. */
    bool isDeadObject() const { return mStatus.transactionError() == DEAD_OBJECT; }
    /** @return the outcome of the transport in words, "No error" for success. */
    std::string description() const { return mStatus.description(); }
    /** Ends the process, as on a device, when the call has failed. */
    void assertOk() const {
        if (!isOk()) abortOnUse();
    }

  private:
    [[noreturn]] void abortOnUse() const;

    Status mStatus;
};

}  // namespace details

/** Result of a call: the outcome of the transport and, where that is OK, a value. */
template <typename T>
class Return : public details::return_status {
  public:
    Return(T value) : mValue(std::move(value)) {}                // NOLINT: implicit as published
    Return(Status status) : return_status(std::move(status)) {}  // NOLINT: implicit as published

    /** @return the value; only for a Return that isOk(). */
    operator T() const {  // NOLINT: implicit as published
        assertOk();
        return mValue;
    }
    /** @return the value, or another one when the transport failed. */
    T withDefault(T other) const { return isOk() ? mValue : other; }

  private:
    T mValue{};
};

/** As above; an object also converts to and from its base classes. */
template <typename T>
class Return<sp<T>> : public details::return_status {
  public:
    Return(sp<T> value) : mValue(std::move(value)) {}            // NOLINT: implicit as published
    Return(T* value) : mValue(value) {}                          // NOLINT: implicit as published
    Return(Status status) : return_status(std::move(status)) {}  // NOLINT: implicit as published

    template <typename U>
    operator sp<U>() const {  // NOLINT: implicit as published
        assertOk();
        return mValue;
    }
    sp<T> withDefault(sp<T> other) const { return isOk() ? mValue : other; }

  private:
    sp<T> mValue;
};

template <>
class Return<void> : public details::return_status {
  public:
    using return_status::return_status;
};

/** @return the result of a call that delivers its values through a callback. */
inline Return<void> Void() {
    return {};
}

}  // namespace android::hardware
