// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utils/Errors.h>

#include <cerrno>
#include <cstring>
#include <initializer_list>
#include <string>
#include <string_view>
#include <utility>

namespace android {

/** What has come of an operation: OK, or an error with its reason in words. */
class [[nodiscard]] Error {
  public:
    /** OK. */
    Error() = default;
    /** @param code a negative status. @param text the reason: "/run/x: is not a directory". */
    Error(status_t code, std::string text) : mCode(code), mText(std::move(text)) {}

    /**
     * The failure of the last system call.
     *
     * @param what it was called for, in parts: to put them together could change errno.
     */
    static Error ofErrno(std::initializer_list<std::string_view> what) {
        const int error = errno;
        std::string text;
        for (const std::string_view part : what)
            text += part;
        return {-error, text + ": " + strerror(error)};
    }

    bool isOk() const { return mCode == OK; }
    /** @return OK or a negative status, which for a failed system call is its negative errno. */
    status_t code() const { return mCode; }
    const std::string& text() const { return mText; }

  private:
    status_t mCode = OK;
    std::string mText;
};

}  // namespace android
