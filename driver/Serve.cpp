// SPDX-License-Identifier: Apache-2.0
#include "Serve.h"

#include "MotorState.h"
#include "Nodes.h"
#include "Session.h"
#include "SimulatedDriver.h"

#include <fcntl.h>
#include <poll.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <stdexcept>

namespace driver {
namespace {

namespace fs = std::filesystem;

constexpr char kClasses[] = "/sys/class";
/** Where a process that serves nodes has the descriptor for them, so that another finds it. */
constexpr int kServedFile = 100;
constexpr char kBanner[] =
        "The service on a motor. Try:\n"
        "  vibratorctl click\n"
        "  vibratorctl pattern play 4\n"
        "  vibratorctl plot                  # draws what the driver was told\n";

[[noreturn]] void fail(const std::string& what) {
    throw std::runtime_error(what + ": " + strerror(errno));
}

void writeFile(const std::string& path, const std::string& text) {
    if (!(std::ofstream(path) << text << std::flush)) fail(path);
}

/** Gives this process mounts of its own; one that is not root becomes able to mount by that. */
void leaveMounts() {
    const std::string user = std::to_string(geteuid());
    const std::string group = std::to_string(getegid());
    const bool isRoot = geteuid() == 0;
    if (unshare(isRoot ? CLONE_NEWNS : CLONE_NEWNS | CLONE_NEWUSER) != 0) {
        fail("this system lets only root do that, as it has no user namespaces for others "
             "(sysctl user.max_user_namespaces, kernel.unprivileged_userns_clone)");
    }
    if (!isRoot) {
        writeFile("/proc/self/setgroups", "deny");
        writeFile("/proc/self/uid_map", user + " " + user + " 1");
        writeFile("/proc/self/gid_map", group + " " + group + " 1");
    }
    if (mount("none", "/", nullptr, MS_REC | MS_PRIVATE, nullptr) != 0) fail("mount");
}

/** @return the descriptor over which another process serves files, as one of this process. */
int takeFileSystem(pid_t process) {
    const std::string inWords = "process " + std::to_string(process);
    const auto handle = static_cast<int>(syscall(SYS_pidfd_open, process, 0));
    if (handle < 0) fail(inWords);
    // A process that has just begun has not opened it yet: five seconds.
    for (int attempt = 0; attempt < 250; ++attempt) {
        const auto file = static_cast<int>(syscall(SYS_pidfd_getfd, handle, kServedFile, 0));
        if (file >= 0) return file;
        if (errno != EBADF) break;
        usleep(20'000);
    }
    fail(inWords + " serves no nodes");
}

/** Serves nodes until they are unmounted. @param trace directory of the trace; empty for none. */
void serve(const Setup& setup, int file, const std::string& trace) {
    model::Features features;
    for (const std::string& name : model::featureNames())
        features.names.insert(name);
    features.waves = static_cast<int>(setup.patterns.size());
    Player player(setup.device);
    MotorState state(player, setup.patterns);
    Nodes nodes(file, setup.layout, state, trace);
    for (const model::Attribute& attribute : model::attributes()) {
        if (!attribute.isIn(setup.layout, features)) continue;
        state.setText(attribute.leaf, attribute.initialText(features));
        nodes.add(attribute.leaf, attribute.mode);
    }
    // Not of the kernel's drivers: says through what the motor is reached.
    state.setText("input_device", setup.device.path + " " + setup.device.name + "\n");
    nodes.add("input_device", 0444);
    nodes.serve(player.timer(), [&player] { player.advance(); });
}

}  // namespace

void serveMounted(const Setup& setup) {
    const int file = dup2(openFileSystem(), kServedFile);
    // The kernel says nothing when it is mounted.
    for (pollfd each{file, POLLIN, 0}; poll(&each, 1, -1) >= 0 && (each.revents & POLLERR) != 0;)
        usleep(10'000);
    serve(setup, file, "");
}

void mountNodes(pid_t process, const std::string& directory) {
    fs::create_directories(directory);
    mountFileSystem(takeFileSystem(process), directory);
}

int runSession(const Setup& setup, const std::vector<std::string>& command) {
    // Its helper removes the directory, and must see it without what is mounted there.
    session::Session session;
    const std::string directory = session / "driver";
    simulator::claimDirectory(directory);
    const std::string nodes = directory + kClasses;
    fs::create_directories(nodes);
    leaveMounts();
    const int file = openFileSystem();
    mountFileSystem(file, kClasses);
    if (mount(kClasses, nodes.c_str(), nullptr, MS_BIND, nullptr) != 0) fail(nodes);
    const session::Child server({"vibrator-driver"}, [&] {
        // Not reached by the terminal's signals, and not outliving this process.
        setpgid(0, 0);
        prctl(PR_SET_PDEATHSIG, SIGKILL);
        prctl(PR_SET_NAME, "vibrator-motor");
        try {
            serve(setup, file, directory);
        } catch (const std::exception& error) {
            std::cerr << "vibrator-driver: run: " << error.what() << std::endl;
        }
        _exit(1);
    });
    // Without the server the nodes are gone.
    close(file);
    const auto stop = [&] {
        const bool isLed = setup.layout == model::Layout::kLedTrigger;
        std::ofstream(model::sysfsDirectory(setup.layout) +
                      std::string(isLed ? "activate" : "enable"))
                << "0\n";
        std::cerr << "vibrator-driver: the service has ended" << std::endl;
    };
    return session.run({directory, [] {}, stop, kBanner}, command);
}

}  // namespace driver
