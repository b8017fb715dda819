// SPDX-License-Identifier: Apache-2.0
#include "support/Steps.h"

#include "Faults.h"
#include "support/Operations.h"

#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <regex>
#include <sstream>
#include <tuple>

namespace tests {
namespace {

using model::Layout;

std::string replaced(std::string text, const std::string& part, const std::string& other) {
    for (size_t at = 0; (at = text.find(part, at)) != std::string::npos; at += other.size())
        text.replace(at, part.size(), other);
    return text;
}

/** What a step that depends on the layout stands for. */
std::string expanded(Layout layout, const std::string& step) {
    const bool isTimed = layout == Layout::kTimedOutput;
    if (step == "off")
        return isTimed ? "enable=0" : "activate=0; !E THE_DEVICE_ACTIVATE is impossible";
    if (step == "running?") return isTimed ? R"(~enable:7="0\n")" : R"(~duration:7="0\n")";
    const std::string mark = step[0] == '~' ? "~" : "";
    if (step.compare(mark.size(), strlen("on="), "on=") != 0) return step;
    const std::string number = step.substr(mark.size() + strlen("on="));
    if (isTimed) return mark + "enable=" + number;
    return mark + "(on; state=1; !E THE_DEVICE_STATE is impossible; duration=" + number +
           "; !E THE_DEVICE_DURATION is impossible; activate=1; "
           "!E THE_DEVICE_ACTIVATE is impossible; )";
}

Step parseAccess(const std::string& text) {
    // The text is taken out first: the pattern would need stack for each of its characters.
    const size_t first = text.find('"');
    const size_t last = text.rfind('"');
    std::string quoted;
    std::string rest = text;
    if (first != last) {
        quoted = text.substr(first + 1, last - first - 1);
        rest.erase(first + 1, quoted.size());
    }
    // The node, a fault of its opening, the kind, a read's size, its mode, the number or the text's
    // marks, and a fault of the transfer.
    static const std::regex pattern(
            R"re((\w+)(?:!(\w+))?(\?r?|=|:(\d+)(r?)=)(-?\d+)?("")?(?:!(\w+))?)re");
    std::smatch parts;
    if (!std::regex_match(rest, parts, pattern)) {
        std::cerr << "\"" << text << "\" is no step\n";
        abort();
    }
    const char kind = parts.str(3)[0];
    Step step;
    step.kind = kind == '?' ? Step::kProbe : kind == '=' ? Step::kWrite : Step::kRead;
    step.leaf = parts[1];
    step.size = kind == ':' ? std::stoul(parts[4]) : 0;
    step.isPrimitive = kind == '?' || (kind == '=' ? !parts[7].matched : step.size == 7);
    step.readsOnly = parts[3] == "?r" || parts[5] == "r" || step.size == 7;
    step.text = parts[7].matched ? quoted : parts.str(6) + "\\n";
    if (parts[2].matched) step.faults["open"] = parts[2];
    if (parts[8].matched) {
        const std::string fault = parts[8];
        step.faults[kind == '?' ? "open" : step.transfer()] =
                fault[0] == 'E' ? fault : "short=" + fault;
    }
    step.isOptional = !step.faults.empty();
    return step;
}

Step parseStep(const std::string& text) {
    if (text[0] == '=') return {Step::kAnswer, text.substr(1)};
    if (text[0] == '(') return {Step::kBracket, text.substr(1)};
    if (text == "@") return {Step::kGate, ""};
    if (text.compare(0, 2, "D ") == 0 || text.compare(0, 2, "E ") == 0) return {Step::kLine, text};
    return parseAccess(text);
}

/** @return the steps up to the end, or up to the bracket's that they are in. */
Steps parse(std::istream& lines) {
    Steps steps;
    for (std::string line; std::getline(lines >> std::ws, line) && line[0] != ')';) {
        const char mark = line[0];
        Step step = parseStep(line.substr(mark == '!' || mark == '~' ? 1 : 0));
        if (mark == '~') step.isOptional = true;
        if (step.kind == Step::kBracket) step.children = parse(lines);
        (mark == '!' ? steps.back().afterFailure : steps).push_back(step);
    }
    return steps;
}

/** Makes the steps of one call. */
class Player {
  public:
    Player(Layout layout, const Operation& operation, uid_t caller)
        : mLayout(layout), mName(operation.call.name), mCaller(caller) {}

    /** @return whether the steps come to their end. */
    bool play(const Steps& steps) {
        for (const Step& step : steps) {
            if (make(step) || step.isOptional) continue;
            // A text that cannot be opened has said so already.
            const bool isSaid = step.isAccess() && !step.isPrimitive && !mIsOpen;
            for (const Step& next : step.afterFailure) {
                if (next.kind != Step::kLine || !isSaid) make(next);
            }
            return false;
        }
        return true;
    }

    Behaviour mShown;

  private:
    /** @return whether it goes well. */
    bool make(const Step& step) {
        switch (step.kind) {
            case Step::kLine:
                log(replaced(replaced(replaced(step.text, "{name}", mName), "{result}", mResult),
                             "{error}", "(" + std::to_string(mError) + "): " + strerror(mError)));
                return true;
            case Step::kAnswer:
                mShown.answer = step.text;
                return true;
            case Step::kGate:
                if (mCaller == 0 || mCaller == 1000) return true;
                log("E Pemission denied (" + std::to_string(static_cast<int>(mCaller)) + ")");
                return false;
            case Step::kBracket: {
                const std::string caller = mName;
                mName = step.text;
                const bool isDone = play(step.children);
                mName = caller;
                return isDone;
            }
            default:
                return access(step);
        }
    }

    bool access(const Step& step) {
        setNode(step.leaf);
        if (step.isPrimitive) logBegin(step);
        bool isDone = call(step, "open", step.readsOnly ? " O_RDONLY" : " O_RDWR", "0");
        mIsOpen = isDone;
        const std::string text = " \"" + step.text + "\"";
        const std::string size = std::to_string(step.bytes().size());
        if (mIsOpen && step.kind == Step::kRead)
            isDone = call(step, "read", " " + std::to_string(step.size), size, text);
        if (mIsOpen && step.kind == Step::kWrite) isDone = call(step, "write", text, size);
        logEnd(step, isDone);
        const auto last = std::pair(mResult, mError);
        if (mIsOpen) call(step, "close", "", "0");
        std::tie(mResult, mError) = last;
        return isDone;
    }

    void setNode(const std::string& leaf) {
        const bool isLeds = leaf == "activate" || leaf == "duration" || leaf == "state";
        const bool isTimed = leaf == "enable" || (!isLeds && mLayout == Layout::kTimedOutput);
        mNode = (isTimed ? "timed_output/" : "leds/") + leaf;
        mPath = sysfsDirectory(isTimed ? Layout::kTimedOutput : Layout::kLedTrigger) + leaf;
    }

    /** Makes a system call. @return whether it does all that it should. */
    bool call(const Step& step, const std::string& name, const std::string& arguments,
              const std::string& result, const std::string& shown = {}) {
        const auto entry = step.faults.find(name);
        std::string fault = entry == step.faults.end() ? "" : entry->second;
        for (unsigned i = 0; fault == "EINTR" && name != "close" && i < step.times; ++i)
            trace(name + arguments, "-1 EINTR");
        if (fault == "EINTR" && name != "close") fault.clear();

        mError = fault.empty() ? 0 : simulator::parseFault(fault)->error;
        mResult = fault.empty() ? result : mError != 0 ? "-1" : fault.substr(strlen("short="));
        trace(name + arguments,
              mError != 0 ? "-1 " + fault
                          : mResult + (fault.empty() || shown.empty() ? shown : " \"\""));
        return fault.empty();
    }

    void logBegin(const Step& step) {
        const std::string node = " node:" + mPath + " ";
        if (step.kind == Step::kProbe) {
            log((step.readsOnly ? "D isNodeExistForRead" : "D isNodeExist") + node);
        } else if (step.kind == Step::kRead) {
            log("D >> readNode" + node);
        } else {
            log("D >> writeNode" + node + "val:" + replaced(step.text, "\\n", ""));
        }
    }

    void logEnd(const Step& step, bool isDone) {
        const std::string owner = step.isPrimitive ? "" : mName + " ";
        const bool isRead = step.kind == Step::kRead;
        if (step.kind == Step::kProbe) {
            log(isDone ? "D true" : "D false");
        } else if (!mIsOpen && step.kind == Step::kWrite && !step.isPrimitive) {
            log("E " + owner + "is fail: " + std::to_string(mError));
        } else if (!mIsOpen || (isRead && !isDone && (mError != 0 || !step.isPrimitive))) {
            log("E " + owner + "node: " + mPath + (mIsOpen ? " read" : " open") +
                " failed. errno: " + std::to_string(mError));
        } else if (step.isPrimitive) {
            log(isRead   ? "D << readNode done"
                : isDone ? "D << writeNode node OK"
                         : "D << writeNode node UNKNOWN_ERROR");
        } else if (isRead) {
            logText(step.bytes());
        }
    }

    /** Logs a text that was read. */
    void logText(std::string text) {
        if (text.back() == '\n') {
            log("D " + mName + " str has new-line char at the last");
            text.pop_back();
        }
        text = text.substr(0, text.find('\0'));
        log("D " + mName + " string : " + replaced(text, "\n", "\\n") + " ");
        log("D " + mName + " string len : " + std::to_string(text.size()) + " ");
    }

    void log(const std::string& line) { mShown.log += line + "\n"; }
    void trace(const std::string& call, const std::string& result) {
        mShown.trace += mNode + " " + call + " = " + result + "\n";
    }

    const Layout mLayout;
    /** Of what is called: the operation, or one that it calls. */
    std::string mName;
    const uid_t mCaller;
    // Of the last access.
    std::string mNode;
    std::string mPath;
    bool mIsOpen = false;
    std::string mResult;
    int mError = 0;
};

}  // namespace

std::string Step::transfer() const {
    return kind == kRead ? "read" : kind == kWrite ? "write" : "";
}

std::string Step::bytes() const {
    return replaced(replaced(text, "\\n", "\n"), "\\0", std::string(1, '\0'));
}

Steps parseSteps(Layout layout, const std::string& text) {
    std::istringstream steps(replaced(text, ";", "\n"));
    std::stringstream lines;
    for (std::string step; std::getline(steps >> std::ws, step);)
        lines << replaced(expanded(layout, step), ";", "\n") << '\n';
    return parse(lines);
}

std::vector<Step*> accessesOf(Steps& steps) {
    std::vector<Step*> accesses;
    for (Step& step : steps) {
        if (step.isAccess()) accesses.push_back(&step);
        const std::vector<Step*> inner = accessesOf(step.children);
        accesses.insert(accesses.end(), inner.begin(), inner.end());
    }
    return accesses;
}

Behaviour behaviourOf(Layout layout, const Operation& operation, const Steps& steps, uid_t caller) {
    Player player(layout, operation, caller);
    player.mShown.answer = operation.answerFailed;
    if (player.play(steps)) player.mShown.answer = operation.answer;
    return player.mShown;
}

void prepareNodes(const std::string& directory, Layout layout, Steps steps) {
    // How often each call on a node is made, and what goes wrong with some of them, all in a row.
    std::map<std::pair<std::string, std::string>, unsigned> made;
    std::map<std::pair<std::string, std::string>, simulator::Fault> faults;
    for (const Step* step : accessesOf(steps)) {
        // What the timed output shows is the time that is left, whatever its file holds.
        if (step->kind == Step::kRead && step->leaf != "enable") {
            const std::string file = directory + sysfsDirectory(layout) + step->leaf;
            std::filesystem::remove(file);
            std::ofstream(file) << step->bytes();
        }
        for (const auto& [call, text] : step->faults) {
            const auto key = std::pair(step->leaf, call);
            const auto [entry, isNew] = faults.try_emplace(key, *simulator::parseFault(text));
            if (isNew) entry->second.after = made[key];
            entry->second.times += step->times;
        }
        for (const std::string& call :
             {std::string("open"), step->transfer(), std::string("close")})
            ++made[std::pair(step->leaf, call)];
    }
    for (const auto& [key, fault] : faults)
        simulator::setFault(directory, key.first, key.second, fault);
}

}  // namespace tests
