// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Alarm.h"
#include "KernelDriver.h"

#include <linux/android/binder.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace android::hardware {

/** A thread's exchange with the kernel's driver: commands go there, returns come back. */
class KernelThread {
  public:
    /** @return the state of the current thread, in its exchange with the driver of this process. */
    static KernelThread& self();

    status_t transact(uint32_t handle, uint32_t code, const Parcel& data, Parcel* reply,
                      uint32_t flags);
    void serve();

    /** Adds a command, which goes to the kernel with the next exchange. */
    template <typename T>
    void queue(uint32_t command, const T& argument) {
        if (mOutSize + sizeof(command) + sizeof(argument) > sizeof(mOut)) flush();
        memcpy(mOut + mOutSize, &command, sizeof(command));
        memcpy(mOut + mOutSize + sizeof(command), &argument, sizeof(argument));
        mOutSize += sizeof(command) + sizeof(argument);
    }
    /** Sends the commands now. */
    status_t flush();

  private:
    KernelThread();
    ~KernelThread();

    /** What waitFor is waiting for. */
    enum class Until { kReply, kCompletion, kForEver };

    /** Sends the commands. @return OK; TIMED_OUT when the alarm's time is up before. */
    status_t exchange(bool receive);
    status_t waitFor(Until until, Parcel* reply);
    template <typename T>
    T argument();
    void queueTransaction(uint32_t command, uint32_t handle, uint32_t code, const Parcel& data,
                          uint32_t flags);
    void handle(uint32_t command);
    void serveCall(const binder_transaction_data& received);

    KernelDriver& mDriver;
    /** Outside calls. */
    const Alarm mNoAlarm{0};
    /** Of the call that is being waited for. */
    const Alarm* mAlarm = &mNoAlarm;
    // A command of the kernel's own never measures more than some 80 bytes.
    alignas(8) uint8_t mOut[512];
    size_t mOutSize = 0;
    alignas(8) uint8_t mIn[512];
    size_t mInSize = 0;
    size_t mInPosition = 0;
};

}  // namespace android::hardware
