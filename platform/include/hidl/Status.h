// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlSupport.h>
#include <utils/Errors.h>
#include <utils/StrongPointer.h>

#include <string>
#include <utility>

namespace android::hardware {

/** Outcome of the transport of a call; what the operation itself answers is not in it. */
class Status {
  public:
    static Status ok() { return {}; }
    /** @param what what happened, for description(); the error's own text when empty. */
    static Status fromStatusT(status_t error, std::string what = {});

    bool isOk() const { return mError == OK; }
    status_t transactionError() const { return mError; }
    /** @return the outcome in words, "No error" for success. */
    std::string description() const;

  private:
    status_t mError = OK;
    std::string mWhat;
};

namespace details {

/** The part of a Return that does not depend on its value's type. */
class return_status {
  public:
    return_status() = default;
    return_status(Status status) : mStatus(std::move(status)) {}  // NOLINT: implicit as published
    return_status(return_status&&) = default;
    return_status& operator=(return_status&&) = default;
    return_status(const return_status&) = delete;
    return_status& operator=(const return_status&) = delete;
    ~return_status() = default;

    /** @return whether the call reached its object and the answer came back. */
    bool isOk() const { return mStatus.isOk(); }
    /** @return whether there is no process any more, or none yet, behind the object. */
    bool isDeadObject() const { return mStatus.transactionError() == DEAD_OBJECT; }
    std::string description() const { return mStatus.description(); }

  protected:
    /** Ends the process, as on a device, when the value of a failed call is asked for. */
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
