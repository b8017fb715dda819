// SPDX-License-Identifier: Apache-2.0
#include "traffic/AccessReader.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <utility>

namespace vibratorctl {

namespace {

/** @return the name of the errno that a text gives. */
std::string errorName(const std::string& number) {
    const char* name = strerrorname_np(atoi(number.c_str()));
    return name == nullptr ? number : name;
}

/** @return what follows a mark in a text, without trailing blanks; nothing where it is not there.
 */
std::optional<std::string_view> after(std::string_view text, std::string_view mark) {
    const size_t start = text.find(mark);
    if (start == std::string_view::npos) return std::nullopt;
    text.remove_prefix(start + mark.size());
    while (!text.empty() && (text.back() == ' ' || text.back() == '\r'))
        text.remove_suffix(1);
    return text;
}

/**
 * Finds the time at the beginning of a log's line: a date and a time of day, or seconds.
 *
 * @param clock set to the time as it stands there; empty where there is none.
 * @return it in s.
 */
double readClock(const std::string& line, std::string* clock) {
    constexpr const char* kForms[] = {"%Y-%m-%d%n%H:%M:%S", "%Y-%m-%dT%H:%M:%S", "%m-%d%n%H:%M:%S",
                                      "%b%n%d%n%H:%M:%S"};
    const char* start = line.c_str() + std::min(line.find_first_not_of(" ["), line.size());
    for (const char* form : kForms) {
        // A leap year, for logs that do not name the year.
        tm date{};
        date.tm_year = 100;
        const char* rest = strptime(start, form, &date);
        if (rest == nullptr) continue;
        char* end = nullptr;
        const double fraction = *rest == '.' ? strtod(rest, &end) : 0;
        *clock = std::string(start, *rest == '.' ? end : rest);
        return static_cast<double>(timegm(&date)) + fraction;
    }
    const std::string word(start, strspn(start, "0123456789."));
    const bool isTime = word.find('.') < word.size() - 1 && word.find('.') > 0;
    *clock = isTime ? word : "";
    return isTime ? strtod(word.c_str(), nullptr) : 0;
}

/** @return a path as the trace names its node: "leds/state". */
std::string nodeName(std::string_view path) {
    constexpr std::string_view kClass = "/sys/class/";
    if (path.substr(0, kClass.size()) == kClass) path.remove_prefix(kClass.size());
    std::string name(path.substr(0, path.find('/')));
    return name.append(path.substr(std::min(path.rfind('/'), path.size())));
}

/** What a line of the log means. */
enum Step {
    kNothing,
    kRefusal,
    /** An access of the node that follows begins. */
    kProbe,
    kRead,
    kWrite,
    kEnd,
    kProbeEnd,
    /** A text that was read follows, whole. */
    kTextRead,
    /** The write of the text that follows begins. */
    kText,
    kTextEnd,
};

/** The error of a line that has an errno behind its mark. */
constexpr const char* kErrnoFollows = nullptr;

/** The lines of the log that mean accesses. The first whose mark is in a line applies. */
constexpr struct {
    const char* mark;
    Step step;
    /** Of kTextRead and kText: the leaf of the text's node. Of the others: the error, if any. */
    const char* detail;
} kLogLines[] = {
        {"Pemission denied (", kRefusal, "not permitted to this uid"},
        {" is abnormal ", kRefusal, "out of range"},
        {" BAD_VALUE", kRefusal, "out of range"},
        {" packet size is exceed", kRefusal, "too many packets"},
        {" while vibrating. Not supported", kRefusal, "the motor counts as running"},
        {" is impossible because of intensity", kRefusal, "no control of the strength"},
        {" unsupports", kRefusal, "the driver has none"},
        {"perform_1_", kRefusal, "no such effect"},
        {"perform start effect : 0,", kNothing, ""},
        {"perform start effect : ", kRefusal, "no such effect"},
        {"daxSupportsFolderStatusSetting string : ", kTextRead, "event_cmd"},
        {"daxSupportsEnhancedVelmoraHapticPattern string : ", kTextRead, "motor_type"},
        {"getMotorIndex string : ", kTextRead, "motor_type"},
        {"daxPerformHapticEngine : ", kText, "haptic_engine"},
        {"daxPerformPrebakedHapticPattern : ", kText, "cp_trigger_queue"},
        {": FOLDER_", kText, "event_cmd"},
        {" is fail: ", kTextEnd, kErrnoFollows},
        {"repeat error", kTextEnd, "not taken"},
        {"daxSetFolderStatus error", kTextEnd, "not taken"},
        {"daxPerformHapticEngine UNKNOWN_ERROR", kTextEnd, "not taken"},
        {"daxSetFolderStatus end", kTextEnd, ""},
        {"isNodeExist node:", kProbe, ""},
        {"isNodeExistForRead node:", kProbe, ""},
        {">> readNode node:", kRead, ""},
        {">> writeNode node:", kWrite, ""},
        {"failed. errno: ", kEnd, kErrnoFollows},
        {"<< readNode done", kEnd, ""},
        {"<< writeNode node OK", kEnd, ""},
        {"<< writeNode node UNKNOWN_ERROR", kEnd, "not taken"},
        {": true", kProbeEnd, ""},
        {": false", kProbeEnd, "cannot be opened"},
};

}  // namespace

void LogReader::begin(std::string_view path, NodeAccess::Kind kind, const std::string& text) {
    mNumber = {nodeName(path), kind, text};
    mDirectory = mNumber->node.substr(0, mNumber->node.find('/'));
}

std::optional<NodeAccess> LogReader::beginWrite(const std::string& text) {
    constexpr std::string_view kValue = " val:";
    const size_t value = std::min(text.rfind(kValue), text.size());
    const std::string path = text.substr(0, value);
    // The success of these texts shows by the motor's start.
    const bool isStart = !mNumber && path.find("/cp_trigger_index") == std::string::npos;
    std::optional<NodeAccess> done;
    if (isStart && mText && mText->leaf() != "event_cmd") done = std::exchange(mText, std::nullopt);
    if (value < text.size()) {
        begin(path, NodeAccess::kWrite, text.substr(value + kValue.size()) + "\\n");
    }
    return done;
}

std::optional<NodeAccess> LogReader::read(std::string_view line) {
    const size_t tag = std::min(line.find("QorVibrator"), line.size());
    std::optional<NodeAccess> done = readStep(line);
    if (!done) return done;
    if (done->kind == NodeAccess::kRefusal) {
        done->text = after(line.substr(tag), ": ").value_or(line);
        done->node = done->text.substr(0, done->text.find(' '));
        if (done->node == "Pemission") done->node.clear();
    }
    if (tag < line.size()) done->time = readClock(std::string(line.substr(0, tag)), &done->clock);
    return done;
}

std::optional<NodeAccess> LogReader::readStep(std::string_view line) {
    std::optional<std::string_view> rest;
    const auto* row = std::find_if(std::begin(kLogLines), std::end(kLogLines),
                                   [&](const auto& each) { return rest = after(line, each.mark); });
    if (!rest) return std::nullopt;
    const std::string text(*rest);
    const auto end = [&](std::optional<NodeAccess>* access) {
        if (*access)
            (*access)->error = row->detail == kErrnoFollows ? errorName(text) : row->detail;
        return std::exchange(*access, std::nullopt);
    };
    switch (row->step) {
        case kNothing:
            break;
        case kRefusal:
            return NodeAccess{"", NodeAccess::kRefusal, "", row->detail};
        case kProbe:
        case kRead:
            begin(text, row->step == kRead ? NodeAccess::kRead : NodeAccess::kProbe, "");
            break;
        case kWrite:
            return beginWrite(text);
        case kProbeEnd:
            if (mNumber && mNumber->kind == NodeAccess::kProbe) return end(&mNumber);
            break;
        case kEnd:
            return end(&mNumber);
        case kTextRead:
            return NodeAccess{mDirectory + '/' + row->detail, NodeAccess::kRead, text};
        case kText:
            mText = {mDirectory + '/' + row->detail, NodeAccess::kWrite,
                     text.substr(0, text.rfind(" , "))};
            if (mText->leaf() == "event_cmd") mText->text.insert(0, "FOLDER_");
            break;
        case kTextEnd:
            return end(&mText);
    }
    return std::nullopt;
}

}  // namespace vibratorctl
