// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "Driver.h"

#include <cstddef>
#include <cstdint>
#include <string>

namespace android::hardware {

/** The kernel's binder driver, through its device. */
class KernelDriver : public Driver {
  public:
    explicit KernelDriver(const std::string& device);
    ~KernelDriver() override;

    bool isOpen() const { return mDevice >= 0; }
    /** @return why the device could not be opened: "/dev/hwbinder: No such file or directory". */
    const std::string& error() const { return mError; }

    status_t transact(uint32_t handle, void* link, uint32_t code, const Parcel& data, Parcel* reply,
                      uint32_t flags) override;
    void serve() override;
    void* acquire(uint32_t handle) override;
    void release(uint32_t handle) override;
    status_t requestDeathNotice(uint32_t handle) override;
    void clearDeathNotice(uint32_t handle) override;
    sp<::android::hidl::manager::V1_2::IServiceManager> serviceManager(
            std::string* whyNot) override;
    bool hasServiceManager() const override { return true; }
    status_t becomeContextManager(const sp<BHwBinder>& object) override;
    bool isUsable() const override { return isOpen(); }
    std::string name() const override { return mName; }

  private:
    friend class KernelThread;

    const std::string mName;
    int mDevice = -1;
    void* mMapping = nullptr;
    std::string mError;
    sp<BHwBinder> mContextManager;
};

}  // namespace android::hardware
