// SPDX-License-Identifier: Apache-2.0
#include "KernelDriver.h"

#include "KernelThread.h"

#include <android/hidl/manager/1.2/BpHwServiceManager.h>
#include <fcntl.h>
#include <hwbinder/ProcessState.h>
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

KernelDriver::KernelDriver(const std::string& device) : mName(device) {
    mDevice = open(device.c_str(), O_RDWR | O_CLOEXEC);
    if (mDevice < 0) {
        mError = device + ": " + strerror(errno);
        return;
    }
    binder_version version{};
    uint32_t noFurtherThreads = 0;
    if (ioctl(mDevice, BINDER_VERSION, &version) != 0) {
        mError = device + ": not a binder device";
    } else if (version.protocol_version != BINDER_CURRENT_PROTOCOL_VERSION) {
        mError = device + ": speaks version " + std::to_string(version.protocol_version) +
                 " of the protocol, not " + std::to_string(BINDER_CURRENT_PROTOCOL_VERSION);
    } else if (ioctl(mDevice, BINDER_SET_MAX_THREADS, &noFurtherThreads) != 0) {
        mError = device + ": " + strerror(errno);
    } else {
        void* mapping =
                mmap(nullptr, mappingSize(), PROT_READ, MAP_PRIVATE | MAP_NORESERVE, mDevice, 0);
        if (mapping != MAP_FAILED) {
            mMapping = mapping;
            return;
        }
        mError = device + ": mmap: " + strerror(errno);
    }
    close(mDevice);
    mDevice = -1;
}

KernelDriver::~KernelDriver() {
    if (mMapping != nullptr) munmap(mMapping, mappingSize());
    if (mDevice >= 0) close(mDevice);
}

status_t KernelDriver::transact(uint32_t handle, void* /* link */, uint32_t code,
                                const Parcel& data, Parcel* reply, uint32_t flags) {
    return KernelThread::self(*this).transact(handle, code, data, reply, flags);
}

void KernelDriver::serve() {
    KernelThread::self(*this).serve();
}

void* KernelDriver::acquire(uint32_t handle) {
    KernelThread::self(*this).queue(BC_ACQUIRE, handle);
    return nullptr;
}

void KernelDriver::release(uint32_t handle) {
    KernelThread::self(*this).queue(BC_RELEASE, handle);
    KernelThread::self(*this).flush();
}

status_t KernelDriver::requestDeathNotice(uint32_t handle) {
    const binder_handle_cookie notice{handle, handle};
    KernelThread::self(*this).queue(BC_REQUEST_DEATH_NOTIFICATION, notice);
    return KernelThread::self(*this).flush();
}

void KernelDriver::clearDeathNotice(uint32_t handle) {
    const binder_handle_cookie notice{handle, handle};
    KernelThread::self(*this).queue(BC_CLEAR_DEATH_NOTIFICATION, notice);
    KernelThread::self(*this).flush();
}

sp<::android::hidl::manager::V1_2::IServiceManager> KernelDriver::serviceManager(
        std::string* whyNot) {
    if (!isOpen()) {
        *whyNot = mError;
        return nullptr;
    }
    sp<::android::hidl::manager::V1_2::IServiceManager> manager =
            new ::android::hidl::manager::V1_2::BpHwServiceManager(
                    ProcessState::self()->getStrongProxyForHandle(0));
    if (manager->ping().isOk()) return manager;
    *whyNot = mName + ": no service manager answers";
    return nullptr;
}

status_t KernelDriver::becomeContextManager(const sp<BHwBinder>& object) {
    if (!isOpen()) return NO_INIT;
    mContextManager = object;
    // Without FLAT_BINDER_FLAG_ACCEPTS_FDS, as every object.
    flat_binder_object description{};
    description.hdr.type = BINDER_TYPE_BINDER;
    if (ioctl(mDevice, BINDER_SET_CONTEXT_MGR_EXT, &description) == 0) return OK;
    return -errno;
}

}  // namespace android::hardware
