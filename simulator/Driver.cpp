// SPDX-License-Identifier: Apache-2.0
#include "Driver.h"

#include "Faults.h"

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
#include <sstream>

namespace simulator {
namespace {

/** The most that sysfs takes in one write. */
constexpr size_t kPageSize = 4096;

constexpr std::string_view kDirectories[] = {"/sys/class/timed_output/vibrator/",
                                             "/sys/class/leds/vibrator/"};
/** Names of the layouts, in the order of their values. */
constexpr const char* kLayouts[] = {"timed output", "LED trigger"};

/** Marks a folder as a simulated driver's. */
constexpr char kMarkFile[] = ".vibrator-sim";

/** Holds the time at which the motor stops, in nanoseconds of the monotonic clock. */
constexpr char kDeadlineFile[] = ".deadline";

/** @return the folder of a sysfs directory, whose path begins and ends with a slash. */
Folder openBelow(const std::string& directory, std::string_view path, bool create = false) {
    return {Folder(directory), path.substr(1, path.size() - 2), create};
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

/** Starts the motor's one-shot timer, or stops it with 0. @return 0, or a negative errno. */
int setTimer(const Node& node, uint64_t milliseconds) {
    constexpr uint64_t kMost = 1'000'000'000'000;
    const auto time = static_cast<int64_t>(std::min(milliseconds, kMost));
    return -folderOf(node).replace(kDeadlineFile, std::to_string(now() + time * 1'000'000), 0644);
}

/** @return the time left in ms, rounded up; 0 when the motor does not run. */
int64_t remaining(const Node& node) {
    const int64_t deadline = strtoll(folderOf(node).read(kDeadlineFile).c_str(), nullptr, 10);
    return std::max<int64_t>(0, (deadline - now() + 999'999) / 1'000'000);
}

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

/** Takes a number, whose range the driver checks. */
template <int least, int most>
int storeNumber(const Node& node, std::string_view text) {
    int number = 0;
    int error = parseKernelNumber(text, &number);
    if (error == 0 && (number < least || number > most)) error = -EINVAL;
    return error != 0 ? error : storeText(node, std::to_string(number) + "\n");
}

/** The timed-output class: a number of ms starts the motor, 0 or less stops it. */
int storeEnable(const Node& node, std::string_view text) {
    int milliseconds = 0;
    if (sscanf(std::string(text).c_str(), "%d", &milliseconds) != 1) return -EINVAL;
    return setTimer(node, static_cast<uint64_t>(std::max(milliseconds, 0)));
}

std::string showEnable(const Node& node) {
    return std::to_string(remaining(node)) + "\n";
}

/** The transient LED trigger: 1 starts the timer unless it runs, 0 cancels it. */
int storeActivate(const Node& node, std::string_view text) {
    unsigned long state = 0;
    const int error = parseKernelNumber(text, &state);
    if (error != 0) return error;
    if (state > 1) return -EINVAL;
    if (state == 0) return setTimer(node, 0);
    if (remaining(node) > 0) return 0;
    return setTimer(node, strtoull(folderOf(node).read("duration").c_str(), nullptr, 10));
}

std::string showActivate(const Node& node) {
    return remaining(node) > 0 ? "1\n" : "0\n";
}

/** The transient LED trigger: kept for the next start; a running timer goes on as it is. */
int storeDuration(const Node& node, std::string_view text) {
    unsigned long milliseconds = 0;
    const int error = parseKernelNumber(text, &milliseconds);
    return error != 0 ? error : storeText(node, std::to_string(milliseconds) + "\n");
}

/** "COUNT v v v v ...\n": COUNT values follow, four a packet, one blank before each. */
int storeHapticEngine(const Node& node, std::string_view text) {
    std::istringstream words{std::string(text)};
    words >> std::noskipws;
    std::vector<int> numbers;
    char end = ' ';
    for (int number = 0; end == ' ' && words.peek() != '+' && words >> number; words >> end)
        numbers.push_back(number);
    const bool isWhole = end == '\n' && words.peek() == EOF && numbers.size() % 4 == 1 &&
                         numbers[0] == static_cast<int>(numbers.size() - 1);
    return isWhole ? storeText(node, text) : -EINVAL;
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

/** A read-only attribute. */
int storeNothing(const Node& /* node */, std::string_view /* text */) {
    return -EIO;
}

struct Attribute {
    const char* leaf;
    /** The feature, or else the layout, that it belongs to. */
    const char* feature;
    mode_t mode;
    const char* initial;
    int (*store)(const Node&, std::string_view);
    /** nullptr: shows what the file holds. */
    std::string (*show)(const Node&) = nullptr;
};

constexpr Attribute kAttributes[] = {
        {"enable", kLayouts[0], 0644, "0\n", storeEnable, showEnable},
        {"activate", kLayouts[1], 0644, "0\n", storeActivate, showActivate},
        {"duration", kLayouts[1], 0644, "0\n", storeDuration},
        {"state", kLayouts[1], 0644, "0\n", storeNumber<0, 1>},
        {"intensity", "intensity", 0644, "10000\n", storeNumber<0, 10000>},
        {"force_touch_intensity", "force-touch", 0644, "10000\n", storeNumber<0, 10000>},
        {"multi_freq", "frequency", 0644, "0\n", storeNumber<0, 4>},
        {"haptic_engine", "haptic-engine", 0644, "0\n", storeHapticEngine},
        {"pattern_length", "haptic-engine", 0444, "1356\n", storeNothing},
        {"cp_trigger_index", "prebaked", 0644, "0\n", storeNumber<0, 65535>},
        {"cp_trigger_queue", "prebaked", 0644, "\n", storeQueue},
        {"num_waves", "prebaked", 0444, "0\n", storeNothing},
        {"motor_type", "motor-name", 0644, "NONE\n", storeNothing},
        {"event_cmd", "fold", 0644, "FOLDER_OPEN\n", storeEventCommand},
        {"ext_control", "external-control", 0644, "0\n", storeNumber<0, 1>},
};

const Attribute* findAttribute(const std::string& leaf) {
    const auto* found = std::find_if(std::begin(kAttributes), std::end(kAttributes),
                                     [&](const auto& each) { return leaf == each.leaf; });
    return found == std::end(kAttributes) ? nullptr : found;
}

}  // namespace

std::string inheritedDirectory() {
    const char* directory = getenv("VIBRATOR_SIM_DIR");
    return directory == nullptr ? "" : directory;
}

std::string sysfsDirectory(Layout layout) {
    return std::string(kDirectories[static_cast<size_t>(layout)]);
}

std::vector<std::string> featureNames() {
    std::vector<std::string> names(std::begin(kLayouts), std::end(kLayouts));
    for (const Attribute& attribute : kAttributes) {
        if (std::find(names.begin(), names.end(), attribute.feature) == names.end()) {
            names.emplace_back(attribute.feature);
        }
    }
    names.erase(names.begin(), names.begin() + std::size(kLayouts));
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
    if (folder.error() == 0 && !folder.names().empty()) return ENOTEMPTY;
    return folder.replace(kMarkFile, "", 0644);
}

int createNodes(const std::string& directory, Layout layout, const Features& features) {
    const Folder nodes = openBelow(directory, sysfsDirectory(layout), true);
    // The driver that was there before may be running its motor.
    nodes.remove(kDeadlineFile);
    int error = nodes.error();
    for (const Attribute& attribute : kAttributes) {
        const std::string leaf = attribute.leaf;
        const bool isOfLayout = attribute.feature == kLayouts[static_cast<size_t>(layout)];
        if (!isOfLayout && features.names.count(attribute.feature) == 0) {
            nodes.remove(leaf);
            continue;
        }
        std::string initial = attribute.initial;
        if (leaf == "motor_type") initial = features.motor + "\n";
        if (leaf == "num_waves") initial = std::to_string(features.waves) + "\n";
        if (error == 0) error = nodes.replace(leaf, initial, attribute.mode);
    }
    return error;
}

int createDriver(const std::string& directory, Layout layout, const Features& features) {
    int error = claimDirectory(directory);
    if (error == 0) error = clearFaults(directory);
    return error != 0 ? error : createNodes(directory, layout, features);
}

std::string Node::name() const {
    constexpr size_t kStart = std::string_view("/sys/class/").size();
    return path.substr(kStart, path.find('/', kStart) - kStart) + "/" + leaf();
}

std::string Node::leaf() const {
    return path.substr(path.rfind('/') + 1);
}

bool findNode(const std::string& directory, const char* path, Node* node) {
    const bool isBelow = std::any_of(
            std::begin(kDirectories), std::end(kDirectories),
            [&](std::string_view each) { return strncmp(path, each.data(), each.size()) == 0; });
    if (isBelow) *node = {path, directory, directory + path};
    return isBelow;
}

std::vector<Node> listNodes(const std::string& directory) {
    std::vector<Node> nodes;
    for (const Layout layout : {Layout::kLedTrigger, Layout::kTimedOutput}) {
        const std::string place = sysfsDirectory(layout);
        for (const std::string& leaf : openBelow(directory, place).names()) {
            if (leaf[0] == '.') continue;
            nodes.push_back({place + leaf, directory, directory + place + leaf});
        }
    }
    return nodes;
}

int openNode(const Node& node, int flags) {
    const std::string leaf = node.leaf();
    const Folder folder = folderOf(node);
    // The attribute's mode binds root too, who may open any plain file.
    const mode_t mode = folder.mode(leaf);
    const bool reads = (flags & O_ACCMODE) != O_WRONLY;
    const bool writes = (flags & O_ACCMODE) != O_RDONLY;
    if (mode == 0 || leaf[0] == '.') return -ENOENT;
    if ((reads && (mode & 0444) == 0) || (writes && (mode & 0222) == 0)) return -EACCES;
    return folder.open(leaf, flags & O_ACCMODE);
}

std::string show(const Node& node) {
    const Attribute* attribute = findAttribute(node.leaf());
    if (attribute != nullptr && attribute->show != nullptr) return attribute->show(node);
    return folderOf(node).read(node.leaf());
}

ssize_t store(const Node& node, const std::string& bytes) {
    // The kernel does not call the driver for an empty write.
    if (bytes.empty()) return 0;
    const std::string_view taken = std::string_view(bytes).substr(0, kPageSize);
    const Attribute* attribute = findAttribute(node.leaf());
    const int error = attribute == nullptr ? storeText(node, taken) : attribute->store(node, taken);
    return error != 0 ? error : static_cast<ssize_t>(taken.size());
}

}  // namespace simulator
