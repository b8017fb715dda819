// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hidl/base/1.0/IBase.h>
#include <hwbinder/Transport.h>

#include <chrono>
#include <string>

/** What only this platform offers, for programs that are not built for a device's runtime. */
namespace android::hardware::host {

/** @return the transport of this process's calls; its path, where the last service was found. */
Transport transport();

/** Whether calls over the transport need a service manager, and whether one answers. */
enum class ManagerState { NOT_NEEDED, ANSWERS, SILENT };

/** @param whyNot set to why none answers, in words. @return the state of the service manager. */
ManagerState managerState(std::string* whyNot);

/**
 * Looks once for a service.
 *
 * @param service set to it.
 * @param whyNot set to why it is not there, in words.
 * @return OK; TIMED_OUT for one that is there and does not answer; or another negative status.
 */
status_t findService(const std::string& interface, const std::string& instance,
                     sp<::android::hidl::base::V1_0::IBase>* service, std::string* whyNot);

/**
 * Limits how long a call may take; one that takes longer fails with TIMED_OUT. Over sockets its
 * object then stays unusable.
 *
 * @param limit 0 for no limit, which is the default.
 */
void setCallTimeout(std::chrono::milliseconds limit);

}  // namespace android::hardware::host
