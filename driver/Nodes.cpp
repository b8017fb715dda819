// SPDX-License-Identifier: Apache-2.0
#include "Nodes.h"

#include "TraceFile.h"
#include "TraceLine.h"

#define FUSE_USE_VERSION 35
#include <fcntl.h>
#include <fuse3/fuse.h>
#include <fuse3/fuse_lowlevel.h>
#include <poll.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <stdexcept>

namespace driver {
namespace {

struct stat describe(mode_t mode) {
    struct stat info {};
    info.st_mode = mode;
    info.st_nlink = 1;
    info.st_uid = geteuid();
    info.st_gid = getegid();
    info.st_size = S_ISREG(mode) ? model::kPageSize : 0;
    return info;
}

}  // namespace

/** What the kernel asks for. Each returns 0 or a negative errno. */
struct Nodes::Requests {
    static Nodes& nodes() { return *static_cast<Nodes*>(fuse_get_context()->private_data); }
    static int trace(const char* path, const std::string& access, ssize_t result,
                     const std::string& shown = {}) {
        simulator::trace(nodes().mTrace, nodes().mDirectory + (path + 1), access, result, shown);
        return static_cast<int>(result);
    }

    static void* begin(fuse_conn_info* /* connection */, fuse_config* config) {
        // No file appears later, and only the kernel changes owners and modes: it may remember all.
        config->entry_timeout = config->attr_timeout = config->negative_timeout = 86400;
        config->direct_io = 1;
        return &nodes();
    }

    static int getAttributes(const char* path, struct stat* info, fuse_file_info* /* file */) {
        const auto found = nodes().mFiles.find(path);
        if (found == nodes().mFiles.end()) return -ENOENT;
        *info = found->second;
        return 0;
    }
    static int setOwner(const char* path, uid_t owner, gid_t group, fuse_file_info* /* file */) {
        struct stat& info = nodes().mFiles[path];
        if (owner != static_cast<uid_t>(-1)) info.st_uid = owner;
        if (group != static_cast<gid_t>(-1)) info.st_gid = group;
        return 0;
    }
    static int list(const char* /* path */, void* names, fuse_fill_dir_t add, off_t /* offset */,
                    fuse_file_info* /* file */, fuse_readdir_flags /* flags */) {
        for (const auto& [path, info] : nodes().mFiles) {
            if (S_ISREG(info.st_mode)) add(names, &path[1], nullptr, 0, fuse_fill_dir_flags{});
        }
        return 0;
    }

    static int openFile(const char* path, fuse_file_info* file) {
        return trace(path, "open " + model::accessMode(file->flags),
                     model::checkAccess(nodes().mFiles[path].st_mode, file->flags));
    }
    static int readFile(const char* path, char* buffer, size_t size, off_t offset,
                        fuse_file_info* /* file */) {
        const std::string text = model::show(nodes().mPlayer, path + 1);
        const auto start = std::min(static_cast<size_t>(offset), text.size());
        const size_t length = text.copy(buffer, size, start);
        return trace(path, "read " + std::to_string(size), static_cast<ssize_t>(length),
                     model::quote({buffer, length}));
    }
    static int writeFile(const char* path, const char* buffer, size_t size, off_t /* offset */,
                         fuse_file_info* /* file */) {
        const ssize_t taken = model::store(nodes().mPlayer, path + 1, {buffer, size});
        return trace(path, "write " + model::quote({buffer, size}), taken);
    }
    static int closeFile(const char* path, fuse_file_info* /* file */) {
        return trace(path, "close", 0);
    }
};

Nodes::Nodes(Setup setup, int file, const std::string& trace)
    : mPlayer(std::move(setup.motor), setup.patterns),
      mFiles{{"/", describe(S_IFDIR | 0755)}},
      mDirectory(model::sysfsDirectory(setup.layout)),
      mTrace(trace) {
    model::Features features;
    features.waves = static_cast<int>(setup.patterns.size());
    for (const model::Attribute& each : model::attributes()) {
        if (each.isIn(setup.layout, features))
            add(each.leaf, each.mode, each.initialText(features));
    }
    // Not of the kernel's drivers: says through what the motor is reached.
    add("input_device", 0444, mPlayer.device() + "\n");
    fuse_operations requests{};
    requests.init = Requests::begin;
    requests.getattr = Requests::getAttributes;
    requests.chown = Requests::setOwner;
    requests.readdir = Requests::list;
    requests.open = Requests::openFile;
    requests.read = Requests::readFile;
    requests.write = Requests::writeFile;
    requests.release = Requests::closeFile;
    fuse_args options = FUSE_ARGS_INIT(0, nullptr);
    fuse_opt_add_arg(&options, "vibrator-driver");
    mFuse = fuse_new(&options, &requests, sizeof(requests), this);
    // The library's name for a file system that somebody else mounts.
    const std::string mounted = "/dev/fd/" + std::to_string(file);
    if (mFuse == nullptr || fuse_mount(mFuse, mounted.c_str()) != 0) {
        throw std::runtime_error("the file system of the nodes cannot be served");
    }
}

void Nodes::add(const std::string& leaf, mode_t mode, const std::string& text) {
    mFiles["/" + leaf] = describe(S_IFREG | mode);
    mPlayer.setText(leaf, text);
}

void Nodes::serve() {
    fuse_session* const session = fuse_get_session(mFuse);
    fuse_buf request{};
    pollfd waiting[] = {{fuse_session_fd(session), POLLIN, 0}, {mPlayer.timer(), POLLIN, 0}};
    while (fuse_session_exited(session) == 0 && poll(waiting, 2, -1) > 0) {
        if (waiting[1].revents != 0) mPlayer.advance();
        if (waiting[0].revents != 0 && fuse_session_receive_buf(session, &request) > 0)
            fuse_session_process_buf(session, &request);
    }
}

}  // namespace driver
