// SPDX-License-Identifier: Apache-2.0
#include "Driver.h"

#include "Faults.h"
#include "Folder.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <filesystem>
#include <string_view>

namespace simulator {
namespace {

/** The most that sysfs takes in one write. */
constexpr size_t kPageSize = 4096;

constexpr std::string_view kTimedOutputDirectory = "/sys/class/timed_output/vibrator/";
constexpr std::string_view kLedTriggerDirectory = "/sys/class/leds/vibrator/";

/** Marks a folder as one that may be written to. */
constexpr char kMarkFile[] = ".vibrator-sim";

/** Holds, beside the nodes, when the motor stops: nanoseconds of the monotonic clock. */
constexpr char kDeadlineFile[] = ".deadline";

std::string_view folderOf(Layout layout) {
    return layout == Layout::kTimedOutput ? kTimedOutputDirectory : kLedTriggerDirectory;
}

/** @return the folder of a sysfs directory, whose path begins and ends with a slash. */
Folder openBelow(const std::string& directory, std::string_view path, bool create = false) {
    return {Folder(directory), std::string(path.substr(1, path.size() - 2)), create};
}

/** @return the folder that a node's file lies in. */
Folder folderOf(const Node& node) {
    return openBelow(node.directory, node.path.substr(0, node.path.rfind('/') + 1));
}

int64_t now() {
    timespec time{};
    clock_gettime(CLOCK_MONOTONIC, &time);
    return int64_t{time.tv_sec} * 1'000'000'000 + time.tv_nsec;
}

/** The motor's one-shot timer, beside the given node's file. */
class Timer {
  public:
    explicit Timer(const Node& node) : mFolder(folderOf(node)) {}

    /** @return 0, or a negative errno. */
    int start(uint64_t milliseconds) const {
        constexpr uint64_t kMost = 1'000'000'000'000;
        const auto time = static_cast<int64_t>(std::min(milliseconds, kMost));
        return set(now() + time * 1'000'000);
    }
    int stop() const { return set(0); }

    /** @return the time left in ms, rounded up; 0 when the motor does not run. */
    int64_t remaining() const {
        int64_t deadline = 0;
        const std::string text = mFolder.read(kDeadlineFile);
        std::from_chars(text.data(), text.data() + text.size(), deadline);
        return std::max<int64_t>(0, (deadline - now() + 999'999) / 1'000'000);
    }

  private:
    int set(int64_t deadline) const {
        return -mFolder.replace(kDeadlineFile, std::to_string(deadline), 0644);
    }

    Folder mFolder;
};

/**
 * Parses a number as the kernel's kstrto functions do: the whole text, a sign, one final newline.
 *
 * @return 0, -EINVAL for what is no number of the type, -ERANGE for one beyond it.
 */
template <typename Number>
int parseKernelNumber(std::string_view text, Number* number) {
    text = text.substr(0, text.find('\0'));
    if (!text.empty() && text.back() == '\n') text.remove_suffix(1);
    if (!text.empty() && text.front() == '+') {
        text.remove_prefix(1);
        if (!text.empty() && text.front() == '-') return -EINVAL;
    }
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), *number);
    if (error == std::errc::invalid_argument || end != text.data() + text.size()) return -EINVAL;
    return error == std::errc() ? 0 : -ERANGE;
}

int storeText(const Node& node, std::string_view text) {
    const Folder folder = folderOf(node);
    return -folder.replace(node.leaf(), text, folder.mode(node.leaf()) & 07777);
}

template <typename Number>
int hold(const Node& node, Number number) {
    return storeText(node, std::to_string(number) + "\n");
}

/** Holds a number from a range that the driver checks. */
template <int least, int most>
int storeNumber(const Node& node, std::string_view text) {
    int number = 0;
    int error = parseKernelNumber(text, &number);
    if (error == 0 && (number < least || number > most)) error = -EINVAL;
    return error != 0 ? error : hold(node, number);
}

/** The timed-output class: a number of ms starts the motor, 0 or less stops it. */
int storeEnable(const Node& node, std::string_view text) {
    int milliseconds = 0;
    if (sscanf(std::string(text).c_str(), "%d", &milliseconds) != 1) return -EINVAL;
    const Timer timer(node);
    return milliseconds > 0 ? timer.start(static_cast<uint64_t>(milliseconds)) : timer.stop();
}

std::string showEnable(const Node& node) {
    return std::to_string(Timer(node).remaining()) + "\n";
}

/** The transient LED trigger: 1 starts the timer unless it runs or is 0 long, 0 cancels it. */
int storeActivate(const Node& node, std::string_view text) {
    unsigned long state = 0;
    const int error = parseKernelNumber(text, &state);
    if (error != 0) return error;
    if (state > 1) return -EINVAL;
    const Timer timer(node);
    if (state == 0) return timer.stop();
    if (timer.remaining() > 0) return 0;
    return timer.start(strtoull(folderOf(node).read("duration").c_str(), nullptr, 10));
}

std::string showActivate(const Node& node) {
    return Timer(node).remaining() > 0 ? "1\n" : "0\n";
}

/** The transient LED trigger: kept for the next start; a running timer goes on as it is. */
int storeDuration(const Node& node, std::string_view text) {
    unsigned long milliseconds = 0;
    const int error = parseKernelNumber(text, &milliseconds);
    return error != 0 ? error : hold(node, milliseconds);
}

/** "COUNT v v v v ...\n": COUNT values follow, four a packet. */
int storeHapticEngine(const Node& node, std::string_view text) {
    std::string_view rest = text;
    if (rest.empty() || rest.back() != '\n') return -EINVAL;
    rest.remove_suffix(1);
    int announced = -1;
    int count = 0;
    for (bool more = true; more;) {
        const size_t blank = rest.find(' ');
        more = blank != std::string_view::npos;
        int value = 0;
        const std::string_view word = rest.substr(0, blank);
        if (!word.empty() && word.back() == '\n') return -EINVAL;
        if (parseKernelNumber(word, &value) != 0) return -EINVAL;
        if (announced < 0) {
            announced = value;
            if (announced < 0 || announced % 4 != 0) return -EINVAL;
        } else {
            ++count;
        }
        if (more) rest.remove_prefix(blank + 1);
    }
    return count == announced ? storeText(node, text) : -EINVAL;
}

/** "PATTERN.PERCENT, REPEATS, DELAY~" and a zero byte. */
int storeQueue(const Node& node, std::string_view text) {
    const bool ends = text.size() > 1 && text.back() == '\0' && text[text.size() - 2] == '~';
    return ends ? storeText(node, text) : -EINVAL;
}

int storeEventCommand(const Node& node, std::string_view text) {
    const bool known = text == "FOLDER_OPEN\n" || text == "FOLDER_CLOSE\n";
    return known ? storeText(node, text) : -EINVAL;
}

/** An attribute that the driver only shows. */
int storeNothing(const Node& /* node */, std::string_view /* text */) {
    return -EIO;
}

struct Attribute {
    const char* leaf;
    /** The feature that it belongs to; nullptr for what every driver of its layout has. */
    const char* feature;
    mode_t mode;
    const char* initial;
    int (*store)(const Node&, std::string_view);
    /** nullptr: shows what the file holds. */
    std::string (*show)(const Node&);
};

constexpr Attribute kTimedOutputAttributes[] = {
        {"enable", nullptr, 0644, "0\n", storeEnable, showEnable},
};

constexpr Attribute kLedTriggerAttributes[] = {
        {"activate", nullptr, 0644, "0\n", storeActivate, showActivate},
        {"duration", nullptr, 0644, "0\n", storeDuration, nullptr},
        {"state", nullptr, 0644, "0\n", storeNumber<0, 1>, nullptr},
};

constexpr Attribute kCommonAttributes[] = {
        {"intensity", "intensity", 0644, "10000\n", storeNumber<0, 10000>, nullptr},
        {"force_touch_intensity", "force-touch", 0644, "10000\n", storeNumber<0, 10000>, nullptr},
        {"multi_freq", "frequency", 0644, "0\n", storeNumber<0, 4>, nullptr},
        {"haptic_engine", "haptic-engine", 0644, "0\n", storeHapticEngine, nullptr},
        {"pattern_length", "haptic-engine", 0444, "1356\n", storeNothing, nullptr},
        {"cp_trigger_index", "prebaked", 0644, "0\n", storeNumber<0, 65535>, nullptr},
        {"cp_trigger_queue", "prebaked", 0644, "\n", storeQueue, nullptr},
        {"num_waves", "prebaked", 0444, "0\n", storeNothing, nullptr},
        {"motor_type", "motor-name", 0644, "NONE\n", storeNothing, nullptr},
        {"event_cmd", "fold", 0644, "FOLDER_OPEN\n", storeEventCommand, nullptr},
        {"ext_control", "external-control", 0644, "0\n", storeNumber<0, 1>, nullptr},
};

template <size_t N>
const Attribute* find(const Attribute (&attributes)[N], const std::string& leaf) {
    const auto* found = std::find_if(std::begin(attributes), std::end(attributes),
                                     [&](const auto& each) { return leaf == each.leaf; });
    return found == std::end(attributes) ? nullptr : found;
}

const Attribute* findAttribute(const Node& node) {
    const std::string leaf = node.leaf();
    if (const Attribute* common = find(kCommonAttributes, leaf)) return common;
    const bool isLed = node.path.compare(0, kLedTriggerDirectory.size(), kLedTriggerDirectory) == 0;
    return isLed ? find(kLedTriggerAttributes, leaf) : find(kTimedOutputAttributes, leaf);
}

}  // namespace

std::string sysfsDirectory(Layout layout) {
    return std::string(folderOf(layout));
}

std::vector<std::string> featureNames() {
    std::vector<std::string> names;
    for (const Attribute& attribute : kCommonAttributes) {
        if (std::find(names.begin(), names.end(), attribute.feature) == names.end()) {
            names.emplace_back(attribute.feature);
        }
    }
    return names;
}

bool isMarked(const Folder& directory) {
    return S_ISREG(directory.mode(kMarkFile));
}

int claimDirectory(const std::string& directory) {
    std::error_code error;
    std::filesystem::create_directories(directory, error);
    if (error) return error.value();
    const Folder folder(directory);
    if (isMarked(folder)) return 0;
    if (!folder.isEmpty()) return folder.error() != 0 ? folder.error() : ENOTEMPTY;
    return folder.replace(kMarkFile, "", 0644);
}

int createNodes(const std::string& directory, Layout layout, const Features& features) {
    const Folder nodes = openBelow(directory, folderOf(layout), true);
    // The driver that was there before may be running its motor.
    nodes.remove(kDeadlineFile);
    int error = nodes.error();
    const auto createAll = [&](const auto& attributes) {
        for (const Attribute& attribute : attributes) {
            const std::string leaf = attribute.leaf;
            if (attribute.feature != nullptr && features.names.count(attribute.feature) == 0) {
                nodes.remove(leaf);
                continue;
            }
            std::string initial = attribute.initial;
            if (leaf == "motor_type") initial = features.motor + "\n";
            if (leaf == "num_waves") initial = std::to_string(features.waves) + "\n";
            if (error == 0) error = nodes.replace(leaf, initial, attribute.mode);
        }
    };
    createAll(kCommonAttributes);
    if (layout == Layout::kTimedOutput) {
        createAll(kTimedOutputAttributes);
    } else {
        createAll(kLedTriggerAttributes);
    }
    return error;
}

int createDriver(const std::string& directory, Layout layout, const Features& features) {
    int error = claimDirectory(directory);
    if (error == 0) error = clearFaults(directory);
    return error != 0 ? error : createNodes(directory, layout, features);
}

std::string Node::name() const {
    return path.substr(strlen("/sys/class/"), path.find("/vibrator/") - strlen("/sys/class/")) +
           "/" + leaf();
}

std::string Node::leaf() const {
    return path.substr(path.rfind('/') + 1);
}

bool findNode(const std::string& directory, const char* path, Node* node) {
    const auto liesIn = [&](std::string_view place) {
        return strncmp(path, place.data(), place.size()) == 0;
    };
    if (!liesIn(kTimedOutputDirectory) && !liesIn(kLedTriggerDirectory)) return false;
    *node = {path, directory, directory + path};
    return true;
}

std::vector<Node> listNodes(const std::string& directory) {
    std::vector<Node> nodes;
    for (const std::string_view place : {kLedTriggerDirectory, kTimedOutputDirectory}) {
        for (const std::string& leaf : openBelow(directory, place).names()) {
            const std::string path = std::string(place) + leaf;
            nodes.push_back({path, directory, directory + path});
        }
    }
    return nodes;
}

int openNode(const Node& node, int flags) {
    const std::string leaf = node.leaf();
    const Folder folder = folderOf(node);
    // The driver's own mode binds root too, who is let into any plain file.
    const mode_t mode = folder.mode(leaf);
    const bool reads = (flags & O_ACCMODE) != O_WRONLY;
    const bool writes = (flags & O_ACCMODE) != O_RDONLY;
    if (mode == 0 || leaf[0] == '.') return -ENOENT;
    if ((reads && (mode & 0444) == 0) || (writes && (mode & 0222) == 0)) return -EACCES;
    return folder.open(leaf, flags & O_ACCMODE);
}

std::string show(const Node& node) {
    const Attribute* attribute = findAttribute(node);
    if (attribute != nullptr && attribute->show != nullptr) return attribute->show(node);
    return folderOf(node).read(node.leaf());
}

ssize_t store(const Node& node, const std::string& bytes) {
    // The kernel does not trouble the driver with nothing.
    if (bytes.empty()) return 0;
    const std::string_view taken = std::string_view(bytes).substr(0, kPageSize);
    const Attribute* attribute = findAttribute(node);
    const int error = attribute == nullptr ? storeText(node, taken) : attribute->store(node, taken);
    return error != 0 ? error : static_cast<ssize_t>(taken.size());
}

}  // namespace simulator
