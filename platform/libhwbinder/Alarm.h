// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <ctime>

namespace android::hardware {

/**
 * Interrupts this thread's system calls when a time is up, and then again every 10 ms, since the
 * first signal may come before one begins to wait. Polling a binder device with a timeout would do
 * it, too, but then the kernel waits for tens of milliseconds when the thread ends.
 */
class Alarm {
  public:
    /** Begins to count. @param milliseconds 0 for no limit. */
    explicit Alarm(int milliseconds) : mIsSet(milliseconds > 0) {
        if (!mIsSet) return;
        struct sigaction action {};
        action.sa_handler = [](int) {};
        sigaction(signalNumber(), &action, nullptr);
        sigevent event{};
        event.sigev_notify = SIGEV_THREAD_ID;
        event.sigev_signo = signalNumber();
        event._sigev_un._tid = gettid();
        mIsSet = timer_create(CLOCK_MONOTONIC, &event, &mTimer) == 0;
        const itimerspec times{{0, 10'000'000},
                               {milliseconds / 1000, milliseconds % 1000 * 1'000'000L}};
        if (mIsSet) timer_settime(mTimer, 0, &times, nullptr);
        clock_gettime(CLOCK_MONOTONIC, &mEnd);
        mEnd.tv_sec += times.it_value.tv_sec;
        mEnd.tv_nsec += times.it_value.tv_nsec;
    }
    ~Alarm() {
        if (mIsSet) timer_delete(mTimer);
    }
    Alarm(const Alarm&) = delete;
    Alarm& operator=(const Alarm&) = delete;

    /**
     * Makes a system call, and makes it again when another signal has interrupted it.
     *
     * @return the call's result; -1 with ETIMEDOUT when the time is up.
     */
    template <typename Call>
    auto uninterrupted(Call call) const {
        for (;;) {
            const auto result = call();
            if (result >= 0 || errno != EINTR) return result;
            if (isOver()) {
                errno = ETIMEDOUT;
                return result;
            }
        }
    }

  private:
    static int signalNumber() { return SIGRTMIN; }
    bool isOver() const {
        timespec now{};
        clock_gettime(CLOCK_MONOTONIC, &now);
        return mIsSet && (now.tv_sec - mEnd.tv_sec) * 1'000'000'000 + now.tv_nsec >= mEnd.tv_nsec;
    }

    bool mIsSet;
    timer_t mTimer{};
    timespec mEnd{};
};

}  // namespace android::hardware
