// SPDX-License-Identifier: Apache-2.0
#include "KernelThread.h"

#include <android/log.h>
#include <hwbinder/ProcessState.h>
#include <sys/ioctl.h>

#include <cerrno>
#include <utility>

namespace android::hardware {
namespace {

/**
 * BR_TRANSACTION_PENDING_FROZEN, which the headers lack before Linux 6.4: what stands in place of
 * BR_TRANSACTION_COMPLETE when a oneway call is kept for a process that is frozen.
 */
constexpr uint32_t kTransactionPendingFrozen = _IO('r', 20);

/** Gives a buffer of the mapping back to the kernel. Any thread may do that. */
void release(const uint8_t* data, void* /* owner */) {
    KernelThread::self().queue(BC_FREE_BUFFER, reinterpret_cast<binder_uintptr_t>(data));
}

/** Makes a parcel of what has been received, which gives it back in the end. */
void take(const binder_transaction_data& received, Parcel* parcel) {
    parcel->ipcSetDataReference(reinterpret_cast<const uint8_t*>(received.data.ptr.buffer),
                                received.data_size,
                                reinterpret_cast<const binder_size_t*>(received.data.ptr.offsets),
                                received.offsets_size / sizeof(binder_size_t), release, nullptr);
}

}  // namespace

// A process has one driver, and calls reach this one only where it is that.
KernelThread::KernelThread()
    : mDriver(static_cast<KernelDriver&>(ProcessState::self()->driver())) {}

KernelThread& KernelThread::self() {
    static thread_local KernelThread thread;
    return thread;
}

KernelThread::~KernelThread() {
    flush();
    ioctl(mDriver.mDevice.get(), BINDER_THREAD_EXIT, 0);
}

status_t KernelThread::exchange(bool receive) {
    if (!mDriver.mDevice.isValid()) {
        mOutSize = 0;
        return NO_INIT;
    }
    binder_write_read exchange{};
    exchange.write_buffer = reinterpret_cast<binder_uintptr_t>(mOut);
    exchange.write_size = mOutSize;
    if (receive) {
        exchange.read_buffer = reinterpret_cast<binder_uintptr_t>(mIn);
        exchange.read_size = sizeof(mIn);
    }
    const int result = mAlarm->uninterrupted(
            [&] { return ioctl(mDriver.mDevice.get(), BINDER_WRITE_READ, &exchange); });
    // Commands that the kernel has not taken are dropped: it did not understand one of them.
    mOutSize = 0;
    if (result != 0) {
        if (errno != ETIMEDOUT) return -errno;
        // Makes the kernel forget this thread, and the call with it. With the next command it
        // gets to know the thread anew.
        ioctl(mDriver.mDevice.get(), BINDER_THREAD_EXIT, 0);
        return TIMED_OUT;
    }
    if (receive) {
        mInSize = exchange.read_consumed;
        mInPosition = 0;
    }
    return OK;
}

status_t KernelThread::flush() {
    return mOutSize == 0 ? OK : exchange(false);
}

template <typename T>
T KernelThread::argument() {
    T value;
    memcpy(&value, mIn + mInPosition, sizeof(value));
    mInPosition += sizeof(value);
    return value;
}

void KernelThread::queueTransaction(uint32_t command, uint32_t handle, uint32_t code,
                                    const Parcel& data, uint32_t flags) {
    binder_transaction_data_sg outgoing{};
    binder_transaction_data& call = outgoing.transaction_data;
    call.target.handle = handle;
    call.code = code;
    call.flags = flags;
    call.data_size = data.dataSize();
    call.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(data.data());
    call.offsets_size = data.offsetCount() * sizeof(binder_size_t);
    call.data.ptr.offsets = reinterpret_cast<binder_uintptr_t>(data.offsets());
    outgoing.buffers_size = data.buffersSize();
    queue(command, outgoing);
}

status_t KernelThread::transact(uint32_t handle, uint32_t code, const Parcel& data, Parcel* reply,
                                uint32_t flags) {
    // No TF_ACCEPT_FDS: a reply with descriptors is refused by the kernel.
    queueTransaction(BC_TRANSACTION_SG, handle, code, data, flags);
    const bool oneway = (flags & IBinder::FLAG_ONEWAY) != 0;
    const Alarm alarm(callTimeout);
    const Alarm* const before = std::exchange(mAlarm, &alarm);
    const status_t status = waitFor(oneway ? Until::kCompletion : Until::kReply, reply);
    mAlarm = before;
    return status;
}

status_t KernelThread::waitFor(Until until, Parcel* reply) {
    for (;;) {
        while (mInPosition == mInSize) {
            const status_t status = exchange(true);
            if (status != OK) return status;
        }
        const auto command = argument<uint32_t>();
        switch (command) {
            case BR_TRANSACTION_COMPLETE:
            case BR_ONEWAY_SPAM_SUSPECT:
            case kTransactionPendingFrozen:
                if (until == Until::kCompletion) return OK;
                break;
            case BR_DEAD_REPLY:
                if (until != Until::kForEver) return DEAD_OBJECT;
                break;
            case BR_FAILED_REPLY:
            case BR_FROZEN_REPLY:
                if (until != Until::kForEver) return FAILED_TRANSACTION;
                break;
            case BR_REPLY: {
                const auto received = argument<binder_transaction_data>();
                take(received, reply);
                return statusOf(*reply, received.flags);
            }
            default:
                handle(command);
        }
    }
}

void KernelThread::handle(uint32_t command) {
    switch (command) {
        case BR_TRANSACTION:
            serveCall(argument<binder_transaction_data>());
            break;
        case BR_INCREFS:
        case BR_ACQUIRE: {
            // Both keep the object alive, also while only the kernel refers to it.
            const auto reference = argument<binder_ptr_cookie>();
            reinterpret_cast<BHwBinder*>(reference.cookie)->incStrong(this);
            queue(command == BR_INCREFS ? BC_INCREFS_DONE : BC_ACQUIRE_DONE, reference);
            break;
        }
        case BR_RELEASE:
        case BR_DECREFS:
            reinterpret_cast<BHwBinder*>(argument<binder_ptr_cookie>().cookie)->decStrong(this);
            break;
        case BR_DEAD_BINDER: {
            const auto handle = argument<binder_uintptr_t>();
            ProcessState::self()->sendObituary(static_cast<uint32_t>(handle));
            queue(BC_DEAD_BINDER_DONE, handle);
            break;
        }
        case BR_CLEAR_DEATH_NOTIFICATION_DONE:
            argument<binder_uintptr_t>();
            break;
        case BR_ERROR:
            argument<int32_t>();
            break;
        default:
            // BR_NOOP, BR_OK, BR_SPAWN_LOOPER, BR_FINISHED: nothing to do.
            break;
    }
}

void KernelThread::serveCall(const binder_transaction_data& received) {
    Parcel arguments;
    take(received, &arguments);
    const sp<BHwBinder> object =
            received.target.ptr == 0 ? mDriver.mContextManager
                                     : sp<BHwBinder>(reinterpret_cast<BHwBinder*>(received.cookie));
    const CallerIdentity caller(received.sender_euid, received.sender_pid);
    Parcel results;
    answerCall(*object, received.code, arguments, received.flags, &results,
               [this](const Parcel& reply, uint32_t flags) {
                   queueTransaction(BC_REPLY_SG, 0, 0, reply, flags);
                   waitFor(Until::kCompletion, nullptr);
               });
}

void KernelThread::serve() {
    flush();
    const uint32_t enter = BC_ENTER_LOOPER;
    memcpy(mOut + mOutSize, &enter, sizeof(enter));
    mOutSize += sizeof(enter);
    const status_t status = waitFor(Until::kForEver, nullptr);
    __android_log_print(ANDROID_LOG_ERROR, kLogTag, "%s serves no more: %s",
                        ProcessState::self()->transport().path.c_str(), strerror(-status));
}

}  // namespace android::hardware
