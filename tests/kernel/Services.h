// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "kernel/RawBinder.h"
#include "support/Process.h"

#include <cstdlib>

/** The service manager and the daemon on the kernel's binder, as a device starts them. */
class Services {
  public:
    static constexpr uid_t kSystem = 1000;
    static constexpr char kDaemonLog[] = "/tmp/daemon.log";

    Services() { setenv("HWBINDER_DEVICE", "/dev/hwbinder", 1); }
    /** @return whether it answers in the end. */
    bool startManager() {
        // The driver lets go of the last one a moment after its death.
        return eventually([this] {
            if (!manager.isAlive()) {
                manager.kill();
                manager.startProgram({"/bin/hwservicemanager"}, "/tmp/manager.log", {}, kSystem);
            }
            return RawBinder().call(0, raw::kPing, RawParcel(raw::kBase)).isOk();
        });
    }
    void startDaemon() {
        daemon.startProgram({"/bin/vendor.velmora.hardware.vibrator@2.1-service"}, kDaemonLog, {},
                            kSystem);
    }

    ChildProcess manager;
    ChildProcess daemon;
};
