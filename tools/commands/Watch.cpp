// SPDX-License-Identifier: Apache-2.0
#include "Watch.h"

#include "Commands.h"
#include "Traffic.h"

void addWatch(Client& client) {
    cli::Command& command = client.program().command(
            kTools, "watch", "show the service's node traffic as it comes", "--all --once");
    const auto file = command.file("FILE",
                                   "trace of the simulated driver (default: the one in "
                                   "VIBRATOR_SIM_DIR), - for standard input",
                                   "");
    const auto isLog = command.flag("--log", "FILE is the daemon's log, as on a device");
    const auto fromStart = command.flag("--all", "show what is there already, too");
    const auto once = command.flag("--once", "end instead of waiting for more");
    command.note(
            "Calls that the service refuses leave no trace in the driver: only its log, with "
            "--log, tells of them.");
    command.withoutJson().run([=] {
        watch({trafficFile(*file, *isLog), *isLog, *fromStart, *once});
        return kSuccess;
    });
}
