// SPDX-License-Identifier: Apache-2.0
#include "Run.h"

#include "Session.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <stdexcept>

namespace simulator {

namespace fs = std::filesystem;

namespace {

constexpr char kBanner[] =
        "A simulated vibrator driver, and the service on it. Try:\n"
        "  vibratorctl click\n"
        "  vibratorctl plot                  # draws what the driver was told\n"
        "  vibrator-sim fault intensity write EIO --times 1; vibratorctl amplitude 128\n";

}  // namespace

void makeDriver(const std::string& directory, Layout layout, const Features& features) {
    const int error = createDriver(Folder::make(directory), layout, features);
    if (error == ENOTEMPTY) {
        throw std::runtime_error("\"" + directory +
                                 "\" is neither empty nor a driver's; name a new directory");
    }
    if (error != 0) throw std::runtime_error("\"" + directory + "\": " + strerror(error));
}

int runSession(const std::string& directory, Layout layout, const Features& features,
               const std::vector<std::string>& command) {
    session::Session session;
    const std::string library =
            session::findProgram("libvibrator_sim.so", {".", "../" LIBRARY_DIRECTORY});
    const std::string driver =
            directory.empty() ? session / "driver" : fs::absolute(directory).string();
    makeDriver(driver, layout, features);
    // A link, since a path in LD_PRELOAD may have no blanks or colons.
    const std::string preload = session / "libvibrator_sim.so";
    fs::create_symlink(library, preload);
    return session.run({driver,
                        [&] {
                            const char* others = getenv("LD_PRELOAD");
                            const std::string rest =
                                    others == nullptr ? "" : std::string(":") + others;
                            setenv("LD_PRELOAD", (preload + rest).c_str(), 1);
                        },
                        [] {}, kBanner},
                       command);
}

}  // namespace simulator
