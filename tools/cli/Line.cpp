// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "text/Text.h"

#include <getopt.h>

#include <algorithm>
#include <iostream>

namespace cli {

/** Reads the words of a command line, or of a step of a script, and sets the arguments. */
class Line {
  public:
    explicit Line(Program& program) : mProgram(&program) { begin(nullptr); }
    explicit Line(Command& step) { begin(&step); }

    /** @return the command that was recognised, or nullptr; and its words, as far as they go. */
    Command* command() const { return mCommand; }
    const std::string& typed() const { return mTyped; }

    /** Reads words, as far as they make sense. */
    void read(const std::vector<std::string>& words) {
        // getopt_long() changes no word, and their order only if it is told to.
        std::vector<char*> argv = {nullptr};
        for (const std::string& word : words)
            argv.push_back(const_cast<char*>(word.c_str()));
        const auto count = static_cast<int>(argv.size());
        argv.push_back(nullptr);
        opterr = 0;
        optind = 0;
        int code = 0;
        while (mTaking == nullptr && code != -1) {
            code = getopt_long(count, argv.data(), mLetters.c_str(), mTable.data(), nullptr);
            // In the middle of several letters it stands at the word itself.
            mIndex = static_cast<size_t>(std::max(optind, 2)) - 2;
            if (code != -1) take(code, optarg == nullptr ? "" : optarg, words[mIndex]);
        }
        mHaveOptionsEnded = code == -1 && optind > 1 && words[mIndex] == "--";
        for (mIndex = static_cast<size_t>(optind) - 1; mIndex < words.size(); ++mIndex)
            takeWord(words[mIndex]);
    }

    /** Checks that there is no mistake, and that nothing is missing. @throw UsageError */
    void finish() {
        if (mTaking != nullptr && mTaking->isOption()) {
            complain(mTaking->name + ": the value is missing");
        } else if (mCommand == nullptr) {
            const std::string known = join(valuesOf(mProgram->commandsAfter(mTyped)), ", ", " or ");
            complain(mTyped.empty()
                             ? "no command; " + inQuotes(mProgram->mName + " help") + " lists them"
                             : mTyped + ": no command; " + known);
        } else {
            for (const Argument& each : mCommand->mArguments) {
                if (each.isGiven || !(each.isRequired || (isStep() && each.isMany))) continue;
                complain(each.name + " is missing: " + each.help);
            }
        }
        if (mProblem) throw UsageError(*mProblem);
    }

    /**
     * @return what a further word may be; alone, ":files" for the name of a file, or ":command N"
     *     for a part of a command that begins with the word N.
     */
    std::vector<Choice> answers(const std::string& word) const {
        if (mProblem) return {};
        const Argument* next = mTaking;
        // Choices replace what stands behind "--name=", or behind a comma.
        size_t start = 0;
        if (next == nullptr && !mHaveOptionsEnded && word[0] == '-') {
            start = word.find('=') + 1;
            std::vector<Choice> list;
            for (const Argument* each : mOptions) {
                if (start > 0 && word.substr(0, start - 1) == each->name) next = each;
                list.push_back({each->name, each->help});
            }
            if (start == 0) return list;
        } else if (next == nullptr) {
            if (mCommand == nullptr) return mProgram->commandsAfter(mTyped);
            if (mTyped == "help") return mProgram->commandsAfter(join(*mProgram->mTopic, " ", " "));
            next = argumentFor(word);
        }
        if (next == nullptr) return {};
        if (next->isFile) return {{":files", ""}};
        if (next->takesOptions)
            return {{":command " + std::to_string(mRest.value_or(mIndex) + 1), ""}};
        start = std::max(start, word.rfind(',') + 1);
        std::vector<Choice> list = next->choices;
        for (Choice& each : list)
            each.value.insert(0, word, 0, start);
        return list;
    }

  private:
    bool isStep() const { return mProgram == nullptr; }

    /** Goes on with the options of a command; of nullptr, with those that stand before it. */
    void begin(Command* command) {
        for (Argument& each : (command != nullptr ? *command : mProgram->mShared).mArguments) {
            each.reset();
            each.isGiven = false;
        }
        mCommand = command;
        mOptions.clear();
        mTable.clear();
        // Words come in their order; and -5 is one, too.
        mLetters = "-:0::1::2::3::4::5::6::7::8::9::";
        if (mCommand != nullptr) addOptionsOf(*mCommand);
        if (!isStep()) addOptionsOf(mProgram->mShared);
        if (!isStep()) addSecondNames();
        mTable.push_back({});
    }

    void addOptionsOf(Command& command) {
        constexpr int kBehindLetters = 256;
        for (Argument& each : command.mArguments) {
            if (!each.isOption() || (isStep() && each.isFile)) continue;
            const int number = kBehindLetters + static_cast<int>(mOptions.size());
            const int takes = each.isFlag ? no_argument : required_argument;
            mTable.push_back({each.name.c_str() + 2, takes, nullptr,
                              each.letter != 0 ? each.letter : number});
            mOptions.push_back(&each);
            if (each.letter != 0) mLetters += each.letter + std::string(each.isFlag ? "" : ":");
        }
    }

    void addSecondNames() {
        for (const auto& [second, first] : mProgram->mSecondNames) {
            for (size_t i = 0; i < mOptions.size(); ++i) {
                if (mOptions[i]->name != first) continue;
                mTable.push_back(mTable[i]);
                mTable.back().name = second.c_str() + 2;
            }
        }
    }

    /** @return the option for which getopt_long() has a code, or nullptr. */
    Argument* optionOf(int code) const {
        for (size_t i = 0; i < mOptions.size(); ++i) {
            if (mTable[i].val == code) return mOptions[i];
        }
        return nullptr;
    }

    /** Takes what getopt_long() has found. */
    void take(int code, const std::string& value, const std::string& word) {
        if (code == 1) {
            takeWord(value);
        } else if (code >= '0' && code <= '9') {
            takeWord(std::string{'-', static_cast<char>(code)} + value);
        } else if (code == ':') {
            mTaking = optionOf(optopt);
        } else if (code != '?') {
            give(*optionOf(code), value);
        } else if (const Argument* flag = optionOf(optopt)) {
            complain(flag->name + ": takes no value");
        } else if (optopt != 0) {
            refuse(std::string{'-', static_cast<char>(optopt)});
        } else {
            refuse(word.substr(0, word.find('=')));
        }
    }

    /** Says what is wrong with an option that is not known here. */
    void refuse(const std::string& name) {
        std::vector<std::string> known;
        for (const Argument* each : mOptions)
            known.push_back(each->name);
        if (mCommand == nullptr) {
            for (const Command& command : mProgram->mCommands) {
                for (const Argument& each : command.mArguments)
                    known.push_back(each.name);
            }
        }
        const bool isKnown = std::find(known.begin(), known.end(), name) != known.end();
        complain(isKnown ? inQuotes(name) + " stands behind the command that it is for"
                         : "no option " + inQuotes(name) + suggestion(name, known));
    }

    void takeWord(const std::string& word) {
        if (mProblem) return;
        if (mCommand == nullptr) return takeName(word);
        Argument* argument = argumentFor(word);
        if (argument == nullptr) return complain(inQuotes(word) + " is one argument too many");
        if (argument->takesOptions) {
            mTaking = argument;
            if (!mRest) mRest = mIndex;
        }
        give(*argument, word);
    }

    void takeName(const std::string& given) {
        const auto second = mProgram->mSecondNames.find(mTyped.empty() ? given : "");
        const std::string word = second == mProgram->mSecondNames.end() ? given : second->second;
        const std::string name = mTyped + (mTyped.empty() ? "" : " ") + word;
        const std::vector<Command*> found = mProgram->named(name);
        if (found.empty()) {
            return complain("no command " + inQuotes(name) +
                            suggestion(word, valuesOf(mProgram->commandsAfter(mTyped))));
        }
        mTyped = name;
        if (found[0]->name() == name) begin(found[0]);
    }

    /** @return the argument that a word is for which is no option; nullptr for none. */
    Argument* argumentFor(const std::string& word) const {
        Argument* found = nullptr;
        for (Argument& each : mCommand->mArguments) {
            if (isStep() && each.isFlag && each.name == "--" + word) return &each;
            const bool isNamed = isStep() ? each.isFlag || each.isFile : each.isOption();
            if (found == nullptr && !isNamed && (each.isMany || !each.isGiven)) found = &each;
        }
        return found;
    }

    void give(Argument& argument, const std::string& word) {
        argument.isGiven = true;
        try {
            argument.read(word);
        } catch (const UsageError& error) {
            const bool isNamed = argument.isOption() && !isStep();
            complain((isNamed ? argument.name + ": " : "") + error.what());
        }
    }

    /** Keeps the first mistake. */
    void complain(const std::string& what) {
        if (!mProblem) mProblem.emplace(what, mIndex);
    }

    Program* mProgram = nullptr;
    Command* mCommand = nullptr;
    std::string mTyped;
    /** What takes the next word, whatever it is: an option without its value yet, or a rest. */
    Argument* mTaking = nullptr;
    /** The index of the first word of a rest. */
    std::optional<size_t> mRest;
    bool mHaveOptionsEnded = false;
    std::optional<UsageError> mProblem;
    /** The index of the word that is read. */
    size_t mIndex = 0;
    /** The options that may follow, those of the command first; and as getopt_long() wants them. */
    std::vector<Argument*> mOptions;
    std::vector<option> mTable;
    std::string mLetters;
};

void Command::readStep(const std::vector<std::string>& words) {
    Line line(*this);
    line.read(words);
    line.finish();
}

int Program::obey(const std::vector<std::string>& words) {
    Line line(*this);
    if (words.size() > 1 && words[0] == "--complete") {
        const std::string& word = words.back();
        line.read({words.begin() + 1, words.end() - 1});
        for (const Choice& each : line.answers(word)) {
            if (each.value[0] == ':') {
                std::cout << each.value << '\n';
            } else if (each.value.compare(0, word.size(), word) == 0) {
                std::cout << each.value << '\t' << each.meaning << '\n';
            }
        }
        return kSuccess;
    }
    line.read(words);
    mCurrent = line.command();
    if (*mWantsHelp) {
        help(line.typed());
    } else if (*mWantsVersion) {
        std::cout << mName << ' ' << mVersion << '\n';
    } else {
        line.finish();
        if (!isJson() || mCurrent->mHasJson) return perform(*mCurrent);
        throw UsageError("has no JSON answer; leave out --json");
    }
    return kSuccess;
}

}  // namespace cli
