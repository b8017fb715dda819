// SPDX-License-Identifier: Apache-2.0
#include "support/Steps.h"

#include "Faults.h"

#include <regex.h>

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <iterator>
#include <map>

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
    if (step == "running?") return isTimed ? R"(enable:7="0\n"~)" : R"(duration:7="0\n"~)";
    if (step.compare(0, 3, "on=") != 0) return step;
    if (isTimed) return "enable=" + step.substr(3);
    const size_t end = std::min(step.find('~'), step.size());
    return "(; state=1; !E THE_DEVICE_STATE is impossible; duration=" + step.substr(3, end - 3) +
           "; !E THE_DEVICE_DURATION is impossible; activate=1; "
           "!E THE_DEVICE_ACTIVATE is impossible; )" +
           step.substr(end);
}

/** The parts of a step that accesses a node; none if the text is no such step. */
std::map<std::string, std::string> partsOfAccess(const std::string& text) {
    static const char* const kGroups[] = {"",     "leaf",  "",       "open fault", "access", "size",
                                          "read", "value", "quoted", "",           "fault",  "end"};
    // Not std::regex, which takes the compiler seconds.
    static const regex_t access = [] {
        regex_t pattern;
        if (regcomp(&pattern,
                    R"re(^(\w+)(!(\w+))?(\?r?|=|:([0-9]+)(r?)=)(-?[0-9]+|"([^"]*)")?(!(\w+))?(~?)$)re",
                    REG_EXTENDED) != 0)
            abort();
        return pattern;
    }();
    regmatch_t found[std::size(kGroups)];
    std::map<std::string, std::string> parts;
    if (regexec(&access, text.c_str(), std::size(found), found, 0) != 0) return parts;
    for (size_t i = 1; i < std::size(found); ++i) {
        if (found[i].rm_so < 0) continue;
        parts[kGroups[i]] = text.substr(static_cast<size_t>(found[i].rm_so),
                                        static_cast<size_t>(found[i].rm_eo - found[i].rm_so));
    }
    return parts;
}

Step parseStep(std::string text) {
    Step step;
    if (text[0] == '!') {
        step.isAfterFailure = true;
        text.erase(0, 1);
    }
    if (text.compare(0, 2, "D ") == 0 || text.compare(0, 2, "E ") == 0) {
        step.text = text;
    } else if (text[0] == '=') {
        step.kind = Step::kAnswer;
        step.text = text.substr(1);
    } else if (text == "@") {
        step.kind = Step::kGate;
    } else if (text == "(") {
        step.kind = Step::kBegin;
    } else if (text == ")" || text == ")~") {
        step.kind = Step::kEnd;
        step.isOptional = text.size() > 1;
    } else if (auto parts = partsOfAccess(text); !parts.empty()) {
        const char kind = parts["access"][0];
        const bool isQuoted = parts.count("quoted") > 0;
        step.kind = kind == '?' ? Step::kProbe : kind == '=' ? Step::kWrite : Step::kRead;
        step.leaf = parts["leaf"];
        step.size = kind == ':' ? std::stoul(parts["size"]) : 0;
        step.isPrimitive = kind == '?' || (kind == '=' ? !isQuoted : step.size == 7);
        step.readsOnly =
                parts["access"] == "?r" || parts["read"] == "r" || (kind == ':' && step.size == 7);
        step.text = isQuoted ? parts["quoted"] : parts["value"] + "\\n";
        if (const std::string& fault = parts["open fault"]; !fault.empty())
            step.faults["open"] = fault;
        if (const std::string& fault = parts["fault"]; !fault.empty())
            step.faults[step.kind == Step::kProbe ? "open" : step.transfer()] =
                    fault[0] == 'E' ? fault : "short=" + fault;
        step.isFaultTold = !step.faults.empty();
        step.isOptional = !parts["end"].empty();
    } else {
        std::cerr << "\"" << text << "\" is no step\n";
        abort();
    }
    return step;
}

/** Follows the steps of one call. */
class Play {
  public:
    Play(Layout layout, const std::vector<Step>& steps, const Circumstances& circumstances)
        : mLayout(layout), mSteps(steps), mCircumstances(circumstances) {}

    Behaviour run(const std::string& answer, const std::string& answerFailed) {
        mBehaviour.answer = answer;
        for (size_t i = 0; i < mSteps.size(); ++i) {
            if (mSteps[i].isAfterFailure || make(i)) continue;
            while (!mSteps[i].isOptional) {
                const size_t failed = i;
                while (i + 1 < mSteps.size() && mSteps[i + 1].isAfterFailure) {
                    if (mSteps[++i].kind == Step::kAnswer) {
                        mBehaviour.answer = mSteps[i].text;
                        return mBehaviour;
                    }
                    if (!mIsSaid || mSteps[i].kind != Step::kLine) make(i);
                }
                mIsSaid = false;
                i = endOfBracket(failed);
                if (i == mSteps.size()) {
                    mBehaviour.answer = answerFailed;
                    return mBehaviour;
                }
            }
        }
        return mBehaviour;
    }

  private:
    /** @return the bracket's end that comes after a step. */
    size_t endOfBracket(size_t i) const {
        int depth = 1;
        while (++i < mSteps.size() && depth > 0) {
            if (mSteps[i].kind == Step::kBegin) ++depth;
            if (mSteps[i].kind == Step::kEnd && --depth == 0) return i;
        }
        return mSteps.size();
    }

    void log(const std::string& line) { mBehaviour.log.push_back(line); }

    void trace(const std::string& call, const std::string& result) {
        if (!mPath.empty()) mBehaviour.trace.push_back(mNode + " " + call + " = " + result);
    }

    /** @return whether the steps that come next are what comes next. */
    bool make(size_t i) {
        const Step& step = mSteps[i];
        if (step.kind == Step::kGate && mCircumstances.refused) {
            const auto uid = static_cast<int>(*mCircumstances.refused);
            log("E Pemission denied (" + std::to_string(uid) + ")");
            return false;
        }
        if (step.kind == Step::kLine) {
            log(replaced(replaced(step.text, "{result}", mResult), "{error}",
                         "(" + std::to_string(mError) + "): " + strerror(mError)));
        }
        return !step.isAccess() || access(step) || step.isFaultTold;
    }

    /** The name that the log lines of a text begin with. */
    static std::string ownerOf(const Step& step) {
        if (step.leaf == "haptic_engine") return "daxPerformHapticEngine";
        if (step.leaf == "cp_trigger_queue") return "daxPerformPrebakedHapticPattern";
        if (step.leaf == "motor_type")
            return step.readsOnly ? "daxSupportsEnhancedVelmoraHapticPattern" : "getMotorIndex";
        return step.kind == Step::kRead ? "daxSupportsFolderStatusSetting" : "daxSetFolderStatus";
    }

    void setNode(const std::string& leaf) {
        const bool isEnable = leaf == "enable";
        const bool isLeds = leaf == "activate" || leaf == "duration" || leaf == "state";
        const bool isTimed = isEnable || (!isLeds && mLayout == Layout::kTimedOutput);
        mNode = (isTimed ? "timed_output/" : "leds/") + leaf;
        mPath = sysfsDirectory(isTimed ? Layout::kTimedOutput : Layout::kLedTrigger) + leaf;
        if (mCircumstances.isDriverAbsent && !isEnable && !isLeds) mPath.clear();
    }

    /** @return whether it goes well. */
    bool access(const Step& step) {
        setNode(step.leaf);
        if (step.isPrimitive) log(logBegin(step));
        const bool opens = call(step, "open", step.readsOnly ? " O_RDONLY" : " O_RDWR", "0");
        const bool goesWell = opens && (step.kind == Step::kProbe || transfer(step));
        if (goesWell) {
            logSuccess(step);
        } else {
            logFailure(step, opens);
        }
        // A text that cannot be opened has said so already.
        mIsSaid = !opens && !step.isPrimitive;
        const int error = mError;
        const std::string result = mResult;
        if (opens) call(step, "close", "", "0");
        mError = error;
        mResult = result;
        return goesWell;
    }

    bool transfer(const Step& step) {
        const bool reads = step.kind == Step::kRead;
        const std::string quoted = " \"" + step.text + "\"";
        const std::string size = std::to_string(step.bytes().size());
        return call(step, step.transfer(), reads ? " " + std::to_string(step.size) : quoted, size,
                    reads ? quoted : "");
    }

    /** Makes a system call. @return whether it does all that it should. */
    bool call(const Step& step, const std::string& name, const std::string& arguments,
              const std::string& result, const std::string& shown = {}) {
        const auto entry = step.faults.find(name);
        std::string fault = entry == step.faults.end() ? "" : entry->second;
        if (mCircumstances.isDriverAbsent) fault = "ENOENT";
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

    std::string logBegin(const Step& step) const {
        if (step.kind == Step::kRead) return "D >> readNode node:" + mPath + " ";
        if (step.kind == Step::kProbe) {
            return (step.readsOnly ? "D isNodeExistForRead node:" : "D isNodeExist node:") + mPath +
                   " ";
        }
        return "D >> writeNode node:" + mPath +
               " val:" + step.text.substr(0, step.text.size() - strlen("\\n"));
    }

    void logSuccess(const Step& step) {
        if (step.kind == Step::kProbe) log("D true");
        if (step.isPrimitive && step.kind == Step::kWrite) log("D << writeNode node OK");
        if (step.isPrimitive && step.kind == Step::kRead) log("D << readNode done");
        if (step.isPrimitive || step.kind == Step::kWrite) return;
        const std::string owner = ownerOf(step);
        std::string text = step.bytes();
        if (text.back() == '\n') {
            log("D " + owner + " str has new-line char at the last");
            text.pop_back();
        }
        text = text.substr(0, text.find('\0'));
        log("D " + owner + " string : " + replaced(text, "\n", "\\n") + " ");
        log("D " + owner + " string len : " + std::to_string(text.size()) + " ");
    }

    void logFailure(const Step& step, bool opens) {
        const std::string error = std::to_string(mError);
        if (step.kind == Step::kProbe) {
            log("D false");
        } else if (step.kind == Step::kWrite && opens) {
            if (step.isPrimitive) log("D << writeNode node UNKNOWN_ERROR");
        } else if (step.kind == Step::kWrite && !step.isPrimitive) {
            log("E " + ownerOf(step) + " is fail: " + error);
        } else if (opens && step.isPrimitive && mError == 0) {
            // Nothing at all was read, which is no number.
            log("D << readNode done");
        } else {
            log("E " + (step.isPrimitive ? "" : ownerOf(step) + " ") + "node: " + mPath +
                (opens ? " read" : " open") + " failed. errno: " + error);
        }
    }

    const Layout mLayout;
    const std::vector<Step>& mSteps;
    const Circumstances& mCircumstances;
    Behaviour mBehaviour;
    // Of the last access.
    std::string mNode;
    std::string mPath;
    std::string mResult;
    int mError = 0;
    bool mIsSaid = false;
};

}  // namespace

std::string Step::transfer() const {
    return kind == kRead ? "read" : kind == kWrite ? "write" : "";
}

std::string Step::bytes() const {
    return replaced(replaced(text, "\\n", "\n"), "\\0", std::string(1, '\0'));
}

std::vector<Step> parseSteps(Layout layout, const std::string& text) {
    const auto each = [](const std::string& all, const auto& function) {
        for (size_t at = 0; (at = all.find_first_not_of(" ;\n", at)) != std::string::npos;) {
            const size_t end = std::min(all.find_first_of(";\n", at), all.size());
            function(all.substr(at, end - at));
            at = end;
        }
    };
    std::vector<Step> steps;
    each(text, [&](const std::string& one) {
        each(expanded(layout, one),
             [&](const std::string& part) { steps.push_back(parseStep(part)); });
    });
    return steps;
}

Behaviour behaviourOf(Layout layout, const std::vector<Step>& steps, const std::string& answer,
                      const std::string& answerFailed, const Circumstances& circumstances) {
    return Play(layout, steps, circumstances).run(answer, answerFailed);
}

void prepareNodes(const std::string& directory, Layout layout, const std::vector<Step>& steps) {
    // How often each call on a node is made, and what goes wrong with some of them, all in a row.
    std::map<std::pair<std::string, std::string>, unsigned> made;
    std::map<std::pair<std::string, std::string>, simulator::Fault> faults;
    for (const Step& step : steps) {
        if (!step.isAccess() || step.isAfterFailure) continue;
        // What the timed output shows is the time that is left, whatever its file holds.
        if (step.kind == Step::kRead && step.leaf != "enable") {
            const std::string file = directory + sysfsDirectory(layout) + step.leaf;
            std::filesystem::remove(file);
            std::ofstream(file) << step.bytes();
        }
        for (const auto& [call, text] : step.faults) {
            const auto key = std::pair(step.leaf, call);
            const auto [entry, isNew] = faults.try_emplace(key, *simulator::parseFault(text));
            if (isNew) entry->second.after = made[key];
            entry->second.times += step.times;
        }
        for (const std::string& call : {std::string("open"), step.transfer(), std::string("close")})
            ++made[std::pair(step.leaf, call)];
    }
    for (const auto& [key, fault] : faults)
        simulator::setFault(directory, key.first, key.second, fault);
}
