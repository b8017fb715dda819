// SPDX-License-Identifier: Apache-2.0
#include "ServiceManager.h"
#include "libhwbinder/Driver.h"

#include <hidl/HidlTransportSupport.h>
#include <hidl/Host.h>
#include <hwbinder/ProcessState.h>

#include <cerrno>
#include <cstdio>
#include <cstring>

using namespace ::android::hardware;

int main(int argc, char** argv) {
    if (argc > 1) {
        fprintf(stderr,
                "hwservicemanager: \"%s\": there are no arguments; see hwservicemanager(8)\n",
                argv[1]);
        return 2;
    }
    const ::android::sp<ServiceManager> manager = new ServiceManager;
    // One thread: what is known of services is not touched by two calls at once.
    configureRpcThreadpool(1, true);
    const ::android::sp<IBinder> binder = getOrCreateCachedBinder(manager.get());
    const ::android::status_t status =
            ProcessState::self()->driver().becomeContextManager(binder->localBinder());
    if (status != ::android::OK) {
        const char* reason = status == -EBUSY ? "there is a service manager already"
                             : status == ::android::INVALID_OPERATION
                                     ? "only the kernel's binder driver has one"
                                     : strerror(-status);
        fprintf(stderr, "hwservicemanager: %s (calls go over %s)\n", reason,
                host::transport().inWords().c_str());
        return 1;
    }
    joinRpcThreadpool();
    return 1;
}
