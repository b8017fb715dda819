// SPDX-License-Identifier: Apache-2.0
#include <unistd.h>

#include <cstdio>
#include <cstdlib>

namespace {

/** Says at the start what would otherwise look like a kernel without a driver. */
__attribute__((constructor)) void checkDirectory() {
    const char* directory = getenv("VIBRATOR_SIM_DIR");
    if (directory == nullptr) {
        dprintf(STDERR_FILENO,
                "libvibrator_sim: VIBRATOR_SIM_DIR is not set, nothing is simulated\n");
    } else if (access(directory, X_OK) != 0) {
        dprintf(STDERR_FILENO, "libvibrator_sim: VIBRATOR_SIM_DIR: %s: ", directory);
        perror(nullptr);
    }
}

}  // namespace
