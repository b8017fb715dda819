// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhwbinder/Driver.h"

#include <utils/UniqueFd.h>

#include <cstddef>
#include <cstdint>
#include <string>

namespace android::hardware {

/** The kernel's binder driver, through its device. Lives as long as its process. */
class KernelDriver : public Driver {
  public:
    explicit KernelDriver(const std::string& device);

    std::unique_ptr<RemoteObject> open(uint32_t handle) override;
    void serve() override;
    status_t becomeContextManager(const sp<BHwBinder>& object) override;
    /** @return why the device could not be opened: "/dev/hwbinder: No such file or directory". */
    Error check() const override { return mError; }

  private:
    class Object;
    friend class KernelThread;

    UniqueFd mDevice;
    Error mError;
    sp<BHwBinder> mContextManager;
};

}  // namespace android::hardware
