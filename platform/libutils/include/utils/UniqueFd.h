// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <unistd.h>

#include <utility>

namespace android {

/** Owns a descriptor, and closes it in the end. */
class UniqueFd {
  public:
    UniqueFd() = default;
    /** @param descriptor may be -1, for none. */
    explicit UniqueFd(int descriptor) : mDescriptor(descriptor) {}
    UniqueFd(UniqueFd&& other) noexcept : mDescriptor(other.release()) {}
    UniqueFd& operator=(UniqueFd&& other) noexcept {
        reset(other.release());
        return *this;
    }
    UniqueFd(const UniqueFd&) = delete;
    UniqueFd& operator=(const UniqueFd&) = delete;
    ~UniqueFd() { reset(); }

    /** @return the descriptor, which stays this one's; -1 if there is none. */
    int get() const { return mDescriptor; }
    bool isValid() const { return mDescriptor >= 0; }
    /** @return the descriptor, which is the caller's now. */
    int release() { return std::exchange(mDescriptor, -1); }
    /** Closes the descriptor, and owns another one. */
    void reset(int descriptor = -1) {
        const int before = std::exchange(mDescriptor, descriptor);
        if (before >= 0) close(before);
    }

  private:
    int mDescriptor = -1;
};

}  // namespace android
