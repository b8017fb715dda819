// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/socket.h>

#include <chrono>

namespace android::hardware {

/** Sees that interruptions do not make the waits for a socket take longer than they may. */
class SocketTimeLimit {
  public:
    /**
     * Begins to count.
     *
     * @param milliseconds what the socket's own limit is, too; 0 for none.
     */
    SocketTimeLimit(int socket, int milliseconds) : mSocket(socket), mLimit(milliseconds) {
        if (mLimit.count() != 0) mEnd = Clock::now() + mLimit;
    }
    ~SocketTimeLimit() {
        if (mIsShortened) set(mSocket, mLimit);
    }
    SocketTimeLimit(const SocketTimeLimit&) = delete;
    SocketTimeLimit& operator=(const SocketTimeLimit&) = delete;

    /** Has the socket wait no longer than what is left. @return whether anything is. */
    bool shorten() {
        if (mLimit.count() == 0) return true;
        const auto left =
                std::chrono::duration_cast<std::chrono::microseconds>(mEnd - Clock::now());
        if (left.count() <= 0) return false;
        set(mSocket, left);
        mIsShortened = true;
        return true;
    }

    /** Sets how long each wait for a socket may take. */
    static void set(int socket, std::chrono::microseconds time) {
        const timeval value{time.count() / 1'000'000, time.count() % 1'000'000};
        setsockopt(socket, SOL_SOCKET, SO_SNDTIMEO, &value, sizeof(value));
        setsockopt(socket, SOL_SOCKET, SO_RCVTIMEO, &value, sizeof(value));
    }

  private:
    using Clock = std::chrono::steady_clock;

    const int mSocket;
    const std::chrono::milliseconds mLimit;
    Clock::time_point mEnd;
    bool mIsShortened = false;
};

}  // namespace android::hardware
