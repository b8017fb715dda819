// SPDX-License-Identifier: Apache-2.0
#include "Serve.h"

#include "Session.h"
#include "SimulatedDriver.h"

#include <fcntl.h>
#include <poll.h>
#include <sched.h>
#include <sys/mount.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>
#include <iostream>
#include <system_error>
#include <thread>

namespace driver {
namespace {

constexpr char kClasses[] = "/sys/class";
/** Where a process that serves nodes has the descriptor for them, so that another finds it. */
constexpr int kServedFile = 100;
constexpr char kBanner[] =
        "The service on a motor. Try:\n"
        "  vibratorctl click\n"
        "  vibratorctl pattern play 4\n"
        "  vibratorctl plot                  # draws what the driver was told\n";

/** Throws what errno says. */
[[noreturn]] void fail(const std::string& what) {
    throw std::system_error(errno, std::generic_category(), what);
}

/** @return a descriptor over which the kernel asks for the files of a file system. */
int openFileSystem() {
    const int file = open("/dev/fuse", O_RDWR | O_NONBLOCK | O_CLOEXEC);
    if (file < 0) fail("this user needs access to /dev/fuse, of the kernel's module fuse");
    return file;
}

/** Mounts a file system that is served over a descriptor; makes the directory. */
void mountFileSystem(int file, const std::string& directory) {
    simulator::Folder::make(directory);
    const std::string options = "fd=" + std::to_string(file) +
                                ",user_id=" + std::to_string(geteuid()) +
                                ",group_id=" + std::to_string(getegid()) +
                                ",rootmode=40000,default_permissions,allow_other";
    constexpr unsigned long kFlags = MS_NOSUID | MS_NODEV | MS_NOEXEC;
    if (mount("vibrator-driver", directory.c_str(), "fuse", kFlags, options.c_str()) != 0)
        fail(directory);
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

}  // namespace

void serveMounted(Setup setup) {
    const int file = dup2(openFileSystem(), kServedFile);
    // The kernel says nothing when it is mounted.
    for (pollfd each{file, POLLIN, 0}; poll(&each, 1, -1) >= 0 && (each.revents & POLLERR) != 0;)
        usleep(10'000);
    Nodes(std::move(setup), file, "").serve();
}

void mountNodes(pid_t process, const std::string& directory) {
    // The service's user looks for the nodes there.
    umask(0022);
    const auto handle = static_cast<int>(syscall(SYS_pidfd_open, process, 0));
    // A process that has just begun has not opened it yet: five seconds.
    for (int attempt = 0; attempt < 250; ++attempt) {
        const auto file = static_cast<int>(syscall(SYS_pidfd_getfd, handle, kServedFile, 0));
        if (file >= 0) return mountFileSystem(file, directory);
        if (handle < 0 || errno != EBADF) break;
        usleep(20'000);
    }
    fail("process " + std::to_string(process) + " serves no nodes");
}

int runSession(Setup setup, const std::vector<std::string>& command) {
    // Its helper removes the directory, and must see it without what is mounted there.
    session::Session session;
    const std::string directory = session / "driver";
    simulator::claimDirectory(simulator::Folder::make(directory));
    const std::string nodes = model::sysfsDirectory(setup.layout);
    leaveMounts();
    const int file = openFileSystem();
    mountFileSystem(file, directory + nodes);
    if (mount((directory + kClasses).c_str(), kClasses, nullptr, MS_BIND | MS_REC, nullptr) != 0)
        fail(kClasses);
    const bool isLed = setup.layout == model::Layout::kLedTrigger;
    // Never destroyed: it serves until this process ends.
    std::thread(&Nodes::serve, new Nodes(std::move(setup), file, directory)).detach();
    const auto stop = [&] {
        writeFile(nodes + (isLed ? "activate" : "enable"), "0\n");
        std::cerr << "vibrator-driver: the service has ended" << std::endl;
    };
    return session.run({directory, [] {}, stop, kBanner}, command);
}

}  // namespace driver
