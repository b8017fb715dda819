// SPDX-License-Identifier: Apache-2.0
#include "KernelDriver.h"

#include "KernelThread.h"

#include <fcntl.h>
#include <linux/android/binder.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>

namespace android::hardware {
namespace {

/** What all requests and replies on their way to this process may measure together, in bytes. */
size_t mappingSize() {
    return size_t{1024} * 1024 - 2 * static_cast<size_t>(sysconf(_SC_PAGESIZE));
}

}  // namespace

/** An object that the kernel knows by a handle. */
class KernelDriver::Object : public RemoteObject {
  public:
    explicit Object(uint32_t handle) : mHandle(handle) {
        // Calls to the context manager need no reference, and the kernel silently refuses one, and
        // notices that need it, as long as there is none: it is taken when it has answered.
        if (handle != 0) acquire();
    }
    ~Object() override {
        if (!mIsAcquired) return;
        KernelThread::self().queue(BC_RELEASE, mHandle);
        KernelThread::self().flush();
    }

    status_t transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags) override {
        return KernelThread::self().transact(mHandle, code, data, reply, flags);
    }
    status_t requestDeathNotice() override {
        if (!mIsAcquired) acquire();
        KernelThread::self().queue(BC_REQUEST_DEATH_NOTIFICATION,
                                   binder_handle_cookie{mHandle, mHandle});
        return KernelThread::self().flush();
    }
    void clearDeathNotice() override {
        KernelThread::self().queue(BC_CLEAR_DEATH_NOTIFICATION,
                                   binder_handle_cookie{mHandle, mHandle});
        KernelThread::self().flush();
    }

  private:
    void acquire() {
        KernelThread::self().queue(BC_ACQUIRE, mHandle);
        mIsAcquired = true;
    }

    const uint32_t mHandle;
    bool mIsAcquired = false;
};

KernelDriver::KernelDriver(const std::string& device) {
    mDevice.reset(::open(device.c_str(), O_RDWR | O_CLOEXEC));
    if (!mDevice.isValid()) {
        mError = Error::ofErrno({device});
        return;
    }
    binder_version version{};
    uint32_t noFurtherThreads = 0;
    if (ioctl(mDevice.get(), BINDER_VERSION, &version) != 0) {
        mError = {NO_INIT, device + ": not a binder device"};
    } else if (version.protocol_version != BINDER_CURRENT_PROTOCOL_VERSION) {
        mError = {NO_INIT, device + ": speaks version " + std::to_string(version.protocol_version) +
                                   " of the protocol, not " +
                                   std::to_string(BINDER_CURRENT_PROTOCOL_VERSION)};
    } else if (ioctl(mDevice.get(), BINDER_SET_MAX_THREADS, &noFurtherThreads) != 0) {
        mError = Error::ofErrno({device});
    } else if (mmap(nullptr, mappingSize(), PROT_READ, MAP_PRIVATE | MAP_NORESERVE, mDevice.get(),
                    0) == MAP_FAILED) {
        mError = Error::ofErrno({device, ": mmap"});
    }
    if (!mError.isOk()) mDevice.reset();
}

std::unique_ptr<RemoteObject> KernelDriver::open(uint32_t handle) {
    return std::make_unique<Object>(handle);
}

void KernelDriver::serve() {
    KernelThread::self().serve();
}

status_t KernelDriver::becomeContextManager(const sp<BHwBinder>& object) {
    if (!mError.isOk()) return NO_INIT;
    mContextManager = object;
    // Without FLAT_BINDER_FLAG_ACCEPTS_FDS, as every object.
    flat_binder_object description{};
    description.hdr.type = BINDER_TYPE_BINDER;
    if (ioctl(mDevice.get(), BINDER_SET_CONTEXT_MGR_EXT, &description) == 0) return OK;
    return -errno;
}

}  // namespace android::hardware
