// SPDX-License-Identifier: Apache-2.0
#include "NodeAccess.h"

#include <algorithm>
#include <charconv>
#include <cstdlib>
#include <cstring>
#include <ctime>

namespace {

/** Takes the next word, up to a blank, off the front of a text. */
std::string_view takeWord(std::string_view* text) {
    const size_t end = text->find(' ');
    const std::string_view word = text->substr(0, end);
    text->remove_prefix(end == std::string_view::npos ? text->size() : end + 1);
    return word;
}

/** @return the bytes that stand between quotation marks, escaped as in C. */
std::string unquote(std::string_view text) {
    const size_t first = text.find('"');
    const size_t last = text.rfind('"');
    std::string bytes;
    for (size_t i = first + 1; first != last && i < last; ++i) {
        if (text[i] != '\\' || i + 1 == last) {
            bytes += text[i];
            continue;
        }
        const char escaped = text[++i];
        if (escaped == 'x' && i + 2 < last) {
            unsigned byte = 0;
            std::from_chars(text.data() + i + 1, text.data() + i + 3, byte, 16);
            bytes += static_cast<char>(byte);
            i += 2;
        } else {
            bytes += escaped == 'n' ? '\n' : escaped == '0' ? '\0' : escaped;
        }
    }
    return bytes;
}

/** @return the name of an errno. */
std::string errorName(int error) {
    const char* name = strerrorname_np(error);
    return name == nullptr ? std::to_string(error) : name;
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
        // A leap year, for logs that do not say which.
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
    const size_t directory = path.find('/');
    const size_t leaf = path.rfind('/');
    if (directory == std::string_view::npos) return std::string(path);
    return std::string(path.substr(0, directory)) + std::string(path.substr(leaf));
}

}  // namespace

std::optional<NodeAccess> TraceReader::read(std::string_view line) {
    constexpr double kLatest = 1e12;
    const std::string clock(takeWord(&line));
    const double time = strtod(clock.c_str(), nullptr);
    const std::string node(takeWord(&line));
    const std::string_view call = takeWord(&line);
    if (!(time >= 0 && time < kLatest)) return std::nullopt;
    const size_t equals = line.rfind(" = ");
    // A close has nothing between the call and the result.
    const std::string_view result = line.substr(0, 2) == "= "          ? line.substr(2)
                                    : equals == std::string_view::npos ? std::string_view()
                                                                       : line.substr(equals + 3);
    if (result.empty()) return std::nullopt;
    const bool failed = result.substr(0, 2) == "-1";
    const std::string error(failed && result.size() > 3 ? result.substr(3) : "");

    NodeAccess& access = mOpen[node];
    if (call == "open") {
        // Interrupted, it is tried again.
        if (error == "EINTR") return std::nullopt;
        access = {};
        access.node = node;
        access.error = error;
    } else if (call == "read" || call == "write") {
        if (error == "EINTR") return std::nullopt;
        access.kind = call == "read" ? NodeAccess::kRead : NodeAccess::kWrite;
        access.bytes = unquote(line);
        access.error = error;
        if (!failed && call == "write" &&
            strtoul(std::string(result).c_str(), nullptr, 10) != access.bytes.size()) {
            access.error = "cut short";
        }
        return std::nullopt;
    } else if (call != "close") {
        mOpen.erase(node);
        return std::nullopt;
    }
    if (call == "open" && access.error.empty()) return std::nullopt;
    access.time = time;
    access.clock = clock;
    access.node = node;
    NodeAccess done = std::move(access);
    mOpen.erase(node);
    return done;
}

void LogReader::begin(NodeAccess::Kind kind, std::string_view path, const std::string& bytes) {
    mCurrent = NodeAccess{0, nodeName(path), kind, bytes, "", ""};
    mDirectory = mCurrent->node.substr(0, mCurrent->node.find('/'));
}

std::optional<NodeAccess> LogReader::read(std::string_view line) {
    auto done = readMessage(line);
    if (done) {
        const size_t tag = line.find("QorVibrator");
        if (tag != std::string_view::npos)
            done->time = readClock(std::string(line.substr(0, tag)), &done->clock);
    }
    return done;
}

std::optional<NodeAccess> LogReader::readMessage(std::string_view line) {
    if (auto refusal = readRefusal(line)) return refusal;
    if (auto done = readText(line)) return done;
    return readNumber(line);
}

std::optional<NodeAccess> LogReader::readRefusal(std::string_view line) {
    constexpr struct {
        const char* mark;
        const char* reason;
    } kRefusals[] = {
            {"Pemission denied (", "not permitted to this uid"},
            {" is abnormal ", "out of range"},
            {" BAD_VALUE", "out of range"},
            {" packet size is exceed", "too many packets"},
            {" while vibrating. Not supported", "the motor counts as running"},
            {" is impossible because of intensity", "no control of the strength"},
            {" unsupports", "the driver has none"},
            {"perform_1_", "no such effect"},
    };
    const auto effect = after(line, "perform start effect : ");
    for (const auto& [mark, reason] : kRefusals) {
        const bool isUnknownEffect = effect && effect->substr(0, 2) != "0,";
        if (!after(line, mark) && !isUnknownEffect) continue;
        const size_t tag = std::min(line.find("QorVibrator"), line.size());
        const std::string message(after(line.substr(tag), ": ").value_or(line));
        const std::string word = message.substr(0, message.find(' '));
        return NodeAccess{0,
                          word == "Pemission" ? "" : word,
                          NodeAccess::kRefusal,
                          message,
                          isUnknownEffect ? "no such effect" : reason,
                          ""};
    }
    return std::nullopt;
}

std::optional<NodeAccess> LogReader::readText(std::string_view line) {
    // A text that was read is all in one line.
    const std::pair<const char*, const char*> reads[] = {
            {"daxSupportsFolderStatusSetting string : ", "/event_cmd"},
            {"daxSupportsEnhancedVelmoraHapticPattern string : ", "/motor_type"},
            {"getMotorIndex string : ", "/motor_type"}};
    for (const auto& [mark, leaf] : reads) {
        if (const auto text = after(line, mark)) {
            return NodeAccess{0, mDirectory + leaf, NodeAccess::kRead, std::string(*text), "", ""};
        }
    }
    const std::pair<const char*, const char*> writes[] = {
            {"daxPerformHapticEngine : ", "/haptic_engine"},
            {"daxPerformPrebakedHapticPattern : ", "/cp_trigger_queue"},
            {": FOLDER_", "/event_cmd"}};
    for (const auto& [mark, leaf] : writes) {
        if (const auto text = after(line, mark)) {
            std::string bytes(text->substr(0, text->rfind(" , ")));
            // The log escapes the newline at the end.
            if (const size_t newline = bytes.find("\\n"); newline != std::string::npos)
                bytes.replace(newline, 2, "\n");
            if (*leaf == '/' && leaf[1] == 'e') bytes.insert(0, "FOLDER_");
            mText = NodeAccess{0, mDirectory + leaf, NodeAccess::kWrite, bytes, "", ""};
            return std::nullopt;
        }
    }
    if (!mText) return std::nullopt;
    if (const auto error = after(line, " is fail: ")) {
        mText->error = errorName(atoi(std::string(*error).c_str()));
    } else if (after(line, "repeat error") || after(line, "daxSetFolderStatus error") ||
               after(line, "daxPerformHapticEngine UNKNOWN_ERROR")) {
        mText->error = "not taken";
    } else if (!after(line, "daxSetFolderStatus end") &&
               !(mText->leaf() != "event_cmd" && !mCurrent && after(line, ">> writeNode node:") &&
                 !after(line, "/cp_trigger_index val:"))) {
        // Its success shows by what comes next: for two of the three, that the motor is started.
        return std::nullopt;
    }
    std::optional<NodeAccess> done;
    done.swap(mText);
    readNumber(line);
    return done;
}

std::optional<NodeAccess> LogReader::readNumber(std::string_view line) {
    if (const auto written = after(line, ">> writeNode node:")) {
        const size_t value = written->rfind(" val:");
        if (value == std::string_view::npos) return std::nullopt;
        begin(NodeAccess::kWrite, written->substr(0, value),
              std::string(written->substr(value + strlen(" val:"))) + "\n");
        return std::nullopt;
    }
    if (const auto node = after(line, ">> readNode node:")) {
        begin(NodeAccess::kRead, *node, "");
        return std::nullopt;
    }
    for (const char* mark : {"isNodeExist node:", "isNodeExistForRead node:"}) {
        if (const auto node = after(line, mark)) {
            begin(NodeAccess::kProbe, *node, "");
            return std::nullopt;
        }
    }
    if (!mCurrent) return std::nullopt;
    const bool probes = mCurrent->kind == NodeAccess::kProbe;
    if (const auto error = after(line, "failed. errno: ")) {
        mCurrent->error = errorName(atoi(std::string(*error).c_str()));
    } else if (after(line, "<< writeNode node UNKNOWN_ERROR")) {
        mCurrent->error = "not taken";
    } else if (probes && after(line, ": false")) {
        mCurrent->error = "cannot be opened";
    } else if (!after(line, "<< writeNode node OK") && !after(line, "<< readNode done") &&
               !(probes && after(line, ": true"))) {
        return std::nullopt;
    }
    std::optional<NodeAccess> done;
    done.swap(mCurrent);
    return done;
}
