// SPDX-License-Identifier: Apache-2.0
#include "Attributes.h"

#include "Amplitude.h"
#include "NodePathTable.h"

#include <fcntl.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstdio>
#include <cstdlib>
#include <sstream>

namespace model {
namespace {

namespace product = ::vendor::velmora::hardware::vibrator::V2_1::implementation;

/** The full strength of the driver's scales. */
constexpr int kFull = product::kMaxAmplitude;

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

/** Does what an accepted text asks for, and has its attribute show it. */
int accept(State& state, const std::string& leaf, std::string_view text, const Action& action) {
    const int error = state.perform(action);
    return error != 0 ? error : state.setText(leaf, text);
}

/** Makes no action of a number. */
std::monostate onlyShow(int /* number */) {
    return {};
}

template <typename Made>
Made make(int number) {
    return {number};
}

SetExternalControl switchControl(int number) {
    return {number != 0};
}

/** Takes a number, whose range the driver checks. */
template <int least, int most, auto action = onlyShow>
int storeNumber(State& state, const std::string& leaf, std::string_view text) {
    int number = 0;
    const int error = parseKernelNumber(text, &number);
    if (error != 0) return error;
    if (number < least || number > most) return -EINVAL;
    return accept(state, leaf, std::to_string(number) + "\n", action(number));
}

/** The timed-output class: a number of ms starts the motor, 0 or less stops it. */
int storeEnable(State& state, const std::string& /* leaf */, std::string_view text) {
    int milliseconds = 0;
    if (sscanf(std::string(text).c_str(), "%d", &milliseconds) != 1) return -EINVAL;
    return state.perform(RunMotor{static_cast<uint64_t>(std::max(milliseconds, 0))});
}

std::string showEnable(const State& state) {
    return std::to_string(state.timeLeft()) + "\n";
}

/** The transient LED trigger: 1 starts the timer unless it runs, 0 cancels it. */
int storeActivate(State& state, const std::string& /* leaf */, std::string_view text) {
    unsigned long isActive = 0;
    const int error = parseKernelNumber(text, &isActive);
    if (error != 0) return error;
    if (isActive > 1) return -EINVAL;
    if (isActive == 0) return state.perform(RunMotor{0});
    if (state.timeLeft() > 0) return 0;
    return state.perform(RunMotor{strtoull(state.text("duration").c_str(), nullptr, 10)});
}

std::string showActivate(const State& state) {
    return state.timeLeft() > 0 ? "1\n" : "0\n";
}

/** The transient LED trigger: kept for the next start; a running timer goes on as it is. */
int storeDuration(State& state, const std::string& leaf, std::string_view text) {
    unsigned long milliseconds = 0;
    const int error = parseKernelNumber(text, &milliseconds);
    return error != 0 ? error : state.setText(leaf, std::to_string(milliseconds) + "\n");
}

/** @return the numbers of a line with single blanks between them; none for any other text. */
std::vector<int> parseLine(std::string_view text) {
    std::istringstream words{std::string(text)};
    words >> std::noskipws;
    std::vector<int> numbers;
    char end = ' ';
    for (int number = 0; end == ' ' && words.peek() != '+' && words >> number; words >> end)
        numbers.push_back(number);
    if (end != '\n' || words.peek() != EOF) numbers.clear();
    return numbers;
}

/** "COUNT v v v v ...\n": COUNT values follow, four a packet, one blank before each. */
int storeHapticEngine(State& state, const std::string& leaf, std::string_view text) {
    const std::vector<int> numbers = parseLine(text);
    if (numbers.size() % 4 != 1 || numbers[0] != static_cast<int>(numbers.size() - 1)) {
        return -EINVAL;
    }
    SetPackets action;
    for (size_t i = 1; i < numbers.size(); i += 4)
        action.packets.push_back({numbers[i], numbers[i + 1], numbers[i + 2], numbers[i + 3]});
    return accept(state, leaf, text, action);
}

/** "PATTERN.PERCENT, REPEATS, DELAY~" and a zero byte. */
int storeQueue(State& state, const std::string& leaf, std::string_view text) {
    SetQueue queue{};
    int end = 0;
    sscanf(std::string(text).c_str(), "%d.%d, %d, %d~%n", &queue.pattern, &queue.percent,
           &queue.repeats, &queue.delay, &end);
    const bool isWhole =
            end > 0 && text.substr(static_cast<size_t>(end)) == std::string_view("\0", 1);
    return isWhole ? accept(state, leaf, text, queue) : -EINVAL;
}

int storeEventCommand(State& state, const std::string& leaf, std::string_view text) {
    const bool isKnown = text == "FOLDER_OPEN\n" || text == "FOLDER_CLOSE\n";
    return isKnown ? accept(state, leaf, text, {}) : -EINVAL;
}

/** A read-only attribute. */
int storeNothing(State& /* state */, const std::string& /* leaf */, std::string_view /* text */) {
    return -EIO;
}

const Attribute* findAttribute(const std::string& leaf) {
    const auto& all = attributes();
    const auto found = std::find_if(all.begin(), all.end(),
                                    [&](const auto& each) { return leaf == each.leaf; });
    return found == all.end() ? nullptr : &*found;
}

}  // namespace

const char* sysfsDirectory(Layout layout) {
    return product::kNodeDirectories[layout == Layout::kLedTrigger ? product::kLedTriggerMode
                                                                   : product::kTimedOutputMode];
}

const std::vector<Attribute>& attributes() {
    // Never destroyed: a program may use its nodes until the very end.
    static const auto& all = *new std::vector<Attribute>{
            {"enable", Layout::kTimedOutput, 0644, "0\n", storeEnable, showEnable},
            {"activate", Layout::kLedTrigger, 0644, "0\n", storeActivate, showActivate},
            {"duration", Layout::kLedTrigger, 0644, "0\n", storeDuration},
            {"state", Layout::kLedTrigger, 0644, "0\n", storeNumber<0, 1>},
            {"intensity", "intensity", 0644, "10000\n", storeNumber<0, kFull, make<SetIntensity>>},
            {"force_touch_intensity", "force-touch", 0644, "10000\n", storeNumber<0, kFull>},
            {"multi_freq", "frequency", 0644, "0\n", storeNumber<0, 4>},
            {"haptic_engine", "haptic-engine", 0644, "0\n", storeHapticEngine},
            {"pattern_length", "haptic-engine", 0444, "1356\n", storeNothing},
            {"cp_trigger_index", "pattern", 0644, "0\n", storeNumber<0, 65535, make<SetPattern>>},
            {"cp_trigger_queue", "pattern", 0644, "\n", storeQueue},
            {"num_waves", "pattern", 0444, nullptr, storeNothing},
            {"motor_type", "motor-name", 0644, nullptr, storeNothing},
            {"event_cmd", "fold", 0644, "FOLDER_OPEN\n", storeEventCommand},
            {"ext_control", "external-control", 0644, "0\n", storeNumber<0, 1, switchControl>},
    };
    return all;
}

std::vector<std::string> featureNames() {
    std::vector<std::string> names;
    for (const Attribute& attribute : attributes()) {
        const auto* name = std::get_if<std::string_view>(&attribute.origin);
        if (name != nullptr && std::find(names.begin(), names.end(), *name) == names.end()) {
            names.emplace_back(*name);
        }
    }
    return names;
}

bool Attribute::isIn(Layout layout, const Features& features) const {
    if (const auto* own = std::get_if<Layout>(&origin)) return *own == layout;
    const auto name = std::get<std::string_view>(origin);
    return std::find(features.names.begin(), features.names.end(), name) != features.names.end();
}

std::string Attribute::initialText(const Features& features) const {
    if (initial != nullptr) return initial;
    return (leaf == std::string_view("num_waves") ? std::to_string(features.waves)
                                                  : features.motor) +
           "\n";
}

int checkAccess(mode_t mode, int flags) {
    const bool reads = (flags & O_ACCMODE) != O_WRONLY;
    const bool writes = (flags & O_ACCMODE) != O_RDONLY;
    return (reads && (mode & 0444) == 0) || (writes && (mode & 0222) == 0) ? -EACCES : 0;
}

std::string show(const State& state, const std::string& leaf) {
    const Attribute* attribute = findAttribute(leaf);
    const bool isMade = attribute != nullptr && attribute->show != nullptr;
    return isMade ? attribute->show(state) : state.text(leaf);
}

ssize_t store(State& state, const std::string& leaf, std::string_view bytes) {
    // The kernel does not call the driver for an empty write.
    if (bytes.empty()) return 0;
    const std::string_view taken = bytes.substr(0, kPageSize);
    const Attribute* attribute = findAttribute(leaf);
    const int error = attribute == nullptr ? state.setText(leaf, taken)
                                           : attribute->store(state, leaf, taken);
    return error != 0 ? error : static_cast<ssize_t>(taken.size());
}

}  // namespace model
