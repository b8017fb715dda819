// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "text/Text.h"

#include <algorithm>
#include <cctype>
#include <iostream>

namespace cli {

/** Reads the words of a command line, or of a step of a script, and sets the arguments. */
class Line {
  public:
    explicit Line(Program& program) : mProgram(&program) { begin(program.mShared); }
    explicit Line(Command& step) : mCommand(&step) { begin(step); }

    /** @return the command that was recognised, or nullptr; and its words, as far as they go. */
    Command* command() const { return mCommand; }
    const std::string& typed() const { return mTyped; }

    /** Reads words, as far as they make sense; keeps the first mistake. */
    void read(const std::vector<std::string>& words) {
        for (; mIndex < words.size(); ++mIndex) {
            try {
                take(words[mIndex]);
            } catch (const UsageError& error) {
                if (!mProblem) mProblem.emplace(error.what(), mIndex);
            }
        }
    }

    /** @throw UsageError for the first mistake */
    void check() const {
        if (mProblem) throw UsageError(*mProblem);
    }

    /** Checks that there is no mistake, and that nothing is missing. @throw UsageError */
    void finish() const {
        check();
        if (mTaking != nullptr) throw UsageError(mTaking->name + ": the value is missing", mIndex);
        if (mCommand == nullptr) {
            const std::string all = inQuotes(mProgram->mName + " help") + " lists them";
            const auto next = valuesOf(mProgram->commandsAfter(mTyped));
            throw UsageError("no command; " + (mTyped.empty() ? all : join(next, ", ", " or ")));
        }
        for (const Argument* each : mArguments) {
            if (each->isRequired() && !each->isGiven())
                throw UsageError(each->name + " is missing: " + each->inHelp(), mIndex);
        }
    }

    /**
     * @return what a further word may be; alone, ":files" for the name of a file, or ":command"
     *     for a part of a command that begins with the word of the number that it means.
     */
    std::vector<Choice> answers(const std::string& word) const {
        if (mProblem) return {};
        const Argument* next = mTaking;
        // Choices replace what stands behind "--name=", or behind a comma.
        size_t start = 0;
        if (next == nullptr && !mHaveOptionsEnded && word[0] == '-') {
            start = word.find('=') + 1;
            if (start == 0) return options();
            next = optionOf(word.substr(0, start - 1));
        } else if (next == nullptr) {
            if (mCommand == nullptr) return mProgram->commandsAfter(mTyped);
            next = argumentFor(word);
            if (mTyped == "help") return mProgram->commandsAfter(join(next->given, " ", " "));
        }
        if (next == nullptr) return {};
        if (next->kind == kFile) return {{":files", ""}};
        if (next->kind == kCommand)
            return {{":command", std::to_string(mIndex + 1 - next->given.size())}};
        start = std::max(start, word.rfind(',') + 1);
        std::vector<Choice> list = next->choices;
        for (Choice& each : list)
            each.value.insert(0, word, 0, start);
        return list;
    }

  private:
    bool isStep() const { return mProgram == nullptr; }

    /** Takes the arguments of a command from now on, too. */
    void begin(Command& command) {
        auto place = mArguments.begin();
        for (Argument& each : command.arguments) {
            each.given.clear();
            if (!isStep() || each.kind != kFile) place = mArguments.insert(place, &each) + 1;
        }
    }

    void take(const std::string& word) {
        // A number like -5 is no option, and - stands for a file.
        const bool isOption = !mHaveOptionsEnded && word.size() > 1 && word[0] == '-' &&
                              isdigit(static_cast<unsigned char>(word[1])) == 0;
        if (mTaking != nullptr) {
            std::exchange(mTaking, nullptr)->take(word);
        } else if (isOption && word == "--") {
            mHaveOptionsEnded = true;
        } else if (isOption) {
            takeOption(word);
        } else if (mCommand == nullptr) {
            takeName(word);
        } else if (Argument* argument = argumentFor(word)) {
            mHaveOptionsEnded |= argument->kind == kCommand;
            argument->take(word);
        } else {
            throw UsageError(inQuotes(word) + " is one argument too many");
        }
    }

    /** Takes "--name", "--name=value", "-n" or "-nvalue". */
    void takeOption(const std::string& word) {
        const bool isLong = word[1] == '-';
        const std::string name = word.substr(0, isLong ? word.find('=') : 2);
        Argument* const option = optionOf(name);
        if (option == nullptr) {
            throw UsageError("no option " + inQuotes(name) +
                             (mCommand == nullptr ? " before the command" : "") +
                             suggestion(name, valuesOf(options())));
        }
        const bool hasValue = name != word;
        if (option->kind == kFlag && hasValue) throw UsageError(option->name + ": takes no value");
        if (option->kind == kFlag || hasValue) {
            option->take(word.substr(name.size() + (isLong && hasValue ? 1 : 0)));
        } else {
            mTaking = option;
        }
    }

    void takeName(const std::string& word) {
        if (mProblem) return;
        const auto second = mProgram->secondNames.find(word);
        const std::string& first = second == mProgram->secondNames.end() ? word : second->second;
        const std::string name = mTyped.empty() ? first : mTyped + " " + word;
        const std::vector<Command*> found = mProgram->named(name);
        if (found.empty()) {
            throw UsageError("no command " + inQuotes(word) +
                             suggestion(word, valuesOf(mProgram->commandsAfter(mTyped))));
        }
        mTyped = name;
        if (found[0]->name != name) return;
        mCommand = found[0];
        begin(*mCommand);
    }

    std::vector<Choice> options() const {
        std::vector<Choice> list;
        for (const Argument* each : mArguments)
            if (each->isOption()) list.push_back({each->name, each->inHelp()});
        return list;
    }

    /** @return the option that has a name, or a letter like "-o"; or nullptr. */
    Argument* optionOf(const std::string& name) const {
        for (Argument* each : mArguments) {
            if (name == each->name || name == each->letter) return each;
        }
        return nullptr;
    }

    /** @return the argument that a word is for which is no option; nullptr for none. */
    Argument* argumentFor(const std::string& word) const {
        Argument* const flag = isStep() ? optionOf("--" + word) : nullptr;
        if (flag != nullptr && flag->kind == kFlag) return flag;
        for (Argument* each : mArguments) {
            const bool isNamed = isStep() ? each->kind == kFlag : each->isOption();
            if (!isNamed && (each->isMany() || !each->isGiven())) return each;
        }
        return nullptr;
    }

    Program* mProgram = nullptr;
    Command* mCommand = nullptr;
    std::string mTyped;
    /** An option without its value yet. */
    Argument* mTaking = nullptr;
    bool mHaveOptionsEnded = false;
    std::optional<UsageError> mProblem;
    /** The index of the word that is read. */
    size_t mIndex = 0;
    /** All that may be given, the command's own before those of all commands. */
    std::vector<Argument*> mArguments;
};

void Command::readStep(const std::vector<std::string>& words) {
    Line line(*this);
    line.read(words);
    line.finish();
}

int Program::obey(const std::vector<std::string>& words) {
    Line line(*this);
    line.read(words);
    mCurrent = line.typed();
    if (mWantsHelp->isGiven()) {
        // Where the command is known, another mistake may be why somebody wants its help.
        if (line.command() == nullptr) line.check();
        help(mCurrent);
    } else if (mWantsVersion->isGiven()) {
        std::cout << mName << ' ' << mVersion << '\n';
    } else {
        line.finish();
        return perform(*line.command());
    }
    return kSuccess;
}

int Program::complete(const std::vector<std::string>& words) {
    Line line(*this);
    const std::string& word = words.back();
    line.read({words.begin() + 1, words.end() - 1});
    for (const Choice& each : line.answers(word)) {
        if (each.value[0] == ':' || each.value.compare(0, word.size(), word) == 0)
            std::cout << each.value << '\t' << each.meaning << '\n';
    }
    return kSuccess;
}

}  // namespace cli
