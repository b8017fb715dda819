// SPDX-License-Identifier: Apache-2.0
#include "SimulatedDriver.h"

#include "Faults.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <ctime>

namespace simulator {
namespace {

/** Marks a folder as a simulated driver's. */
constexpr char kMarkFile[] = ".vibrator-sim";

/** Holds the time at which the motor stops, in nanoseconds of the monotonic clock. */
constexpr char kDeadlineFile[] = ".deadline";

/** @return the folder of a sysfs directory, whose path begins and ends with a slash. */
Folder openBelow(const Folder& directory, std::string_view path, bool create = false) {
    return {directory, path.substr(1, path.size() - 2), create};
}

/** @return the folder that a node's file lies in. */
Folder folderOf(const Node& node) {
    return openBelow(*node.directory, node.path.substr(0, node.path.rfind('/') + 1));
}

int64_t now() {
    timespec time{};
    clock_gettime(CLOCK_MONOTONIC, &time);
    return int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

/** The model's state: a file for each attribute, and one for the time at which the motor stops. */
class FolderState : public model::State {
  public:
    explicit FolderState(const Node& node) : mFolder(folderOf(node)) {}

    std::string text(const std::string& leaf) const override { return mFolder.read(leaf); }
    int setText(const std::string& leaf, std::string_view text) override {
        return -mFolder.replace(leaf, text, mFolder.mode(leaf) & 07777);
    }
    uint64_t timeLeft() const override {
        const int64_t deadline = strtoll(mFolder.read(kDeadlineFile).c_str(), nullptr, 10);
        return static_cast<uint64_t>(std::max<int64_t>(0, deadline - now() + 999'999)) / 1'000'000;
    }
    int perform(const model::Action& action) override {
        const auto* run = std::get_if<model::RunMotor>(&action);
        if (run == nullptr) return 0;
        constexpr uint64_t kMax = 1'000'000'000'000;
        const auto time = static_cast<int64_t>(std::min(run->milliseconds, kMax)) * 1'000'000;
        return -mFolder.replace(kDeadlineFile, std::to_string(now() + time), 0644);
    }

  private:
    Folder mFolder;
};

}  // namespace

std::string inheritedDirectory() {
    const char* directory = getenv("VIBRATOR_SIM_DIR");
    return directory == nullptr ? "" : directory;
}

bool isMarked(const Folder& directory) {
    return S_ISREG(directory.mode(kMarkFile));
}

int claimDirectory(const Folder& directory) {
    if (isMarked(directory)) return 0;
    if (directory.error() == 0 && !directory.names().empty()) return ENOTEMPTY;
    return directory.replace(kMarkFile, "", 0644);
}

int createNodes(const Folder& directory, Layout layout, const Features& features) {
    const Folder nodes = openBelow(directory, model::sysfsDirectory(layout), true);
    // The driver that was there before may be running its motor.
    nodes.remove(kDeadlineFile);
    int error = nodes.error();
    for (const model::Attribute& attribute : model::attributes()) {
        if (!attribute.isIn(layout, features)) {
            nodes.remove(attribute.leaf);
        } else if (error == 0) {
            error = nodes.replace(attribute.leaf, attribute.initialText(features), attribute.mode);
        }
    }
    return error;
}

int createDriver(const Folder& directory, Layout layout, const Features& features) {
    int error = claimDirectory(directory);
    if (error == 0) error = clearFaults(directory);
    return error != 0 ? error : createNodes(directory, layout, features);
}

std::string Node::leaf() const {
    return path.substr(path.rfind('/') + 1);
}

bool findNode(const std::string& directory, const char* path, Node* node) {
    const bool isBelow = std::any_of(
            std::begin(model::kLayouts), std::end(model::kLayouts), [path](Layout layout) {
                const std::string_view place = model::sysfsDirectory(layout);
                return strncmp(path, place.data(), place.size()) == 0;
            });
    if (isBelow) *node = {path, std::make_shared<const Folder>(directory)};
    return isBelow;
}

std::vector<Node> listNodes(const std::string& directory) {
    const auto folder = std::make_shared<const Folder>(directory);
    std::vector<Node> nodes;
    for (const Layout layout : model::kLayouts) {
        const std::string place(model::sysfsDirectory(layout));
        for (const std::string& leaf : openBelow(*folder, place).names()) {
            if (leaf[0] == '.') continue;
            nodes.push_back({place + leaf, folder});
        }
    }
    return nodes;
}

int openNode(const Node& node, int flags) {
    const std::string leaf = node.leaf();
    const Folder folder = folderOf(node);
    const mode_t mode = folder.mode(leaf);
    if (mode == 0 || leaf[0] == '.') return -ENOENT;
    if (const int error = model::checkAccess(mode, flags); error != 0) return error;
    UniqueFd file = folder.open(leaf, flags & O_ACCMODE);
    return file.isValid() ? file.release() : -errno;
}

std::string show(const Node& node) {
    return model::show(FolderState(node), node.leaf());
}

ssize_t store(const Node& node, std::string_view bytes) {
    FolderState state(node);
    return model::store(state, node.leaf(), bytes);
}

}  // namespace simulator
