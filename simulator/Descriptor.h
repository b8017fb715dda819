// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <unistd.h>

#include <cerrno>
#include <utility>

namespace simulator {

/** An open file, which is closed in the end; or the errno that kept it from being opened. */
class Descriptor {
  public:
    /** Takes what an open function of the C library returned, and of a failure errno. */
    explicit Descriptor(int result) : mValue(result < 0 ? -errno : result) {}
    static Descriptor failed(int error) {
        errno = error;
        return Descriptor(-1);
    }
    Descriptor(Descriptor&& other) noexcept : mValue(std::exchange(other.mValue, -EBADF)) {}
    Descriptor& operator=(Descriptor&& other) noexcept {
        std::swap(mValue, other.mValue);
        return *this;
    }
    ~Descriptor() {
        if (isOpen()) close(mValue);
    }

    bool isOpen() const { return mValue >= 0; }
    /** @return the errno of opening it; 0 when it is open. */
    int error() const { return isOpen() ? 0 : -mValue; }
    /** @return the number, which no system call takes when it is not open. */
    int get() const { return mValue; }
    /** Gives it away. @return the number, or a negative errno. */
    int release() { return std::exchange(mValue, -EBADF); }

  private:
    int mValue;
};

}  // namespace simulator
