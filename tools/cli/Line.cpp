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

    /** Checks that there is no mistake, and that nothing is missing. @throw UsageError */
    void finish() const {
        if (mProblem) throw UsageError(*mProblem);
        if (mTaking != nullptr) throw UsageError(mTaking->name + ": the value is missing", mIndex);
        if (mCommand == nullptr && mTyped.empty())
            throw UsageError("no command; " + inQuotes(mProgram->mName + " help") + " lists them");
        if (mCommand == nullptr) {
            throw UsageError(mTyped + ": no command; " +
                             join(valuesOf(mProgram->commandsAfter(mTyped)), ", ", " or "));
        }
        for (const Argument& each : mCommand->arguments) {
            if (each.given || !(each.isRequired || (isStep() && each.isMany))) continue;
            throw UsageError(each.name + " is missing: " + each.help, mIndex);
        }
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
            if (start == 0) return optionsInWords();
            next = optionOf(word.substr(0, start - 1));
        } else if (next == nullptr) {
            if (mCommand == nullptr) return mProgram->commandsAfter(mTyped);
            if (mTyped == "help") return mProgram->commandsAfter(join(*mProgram->mTopic, " ", " "));
            next = argumentFor(word);
        }
        if (next == nullptr) return {};
        if (next->isFile) return {{":files", ""}};
        if (next->takesOptions)
            return {{":command " + std::to_string(next->given.value_or(mIndex) + 1), ""}};
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
        std::vector<Argument*> options;
        for (Argument& each : command.arguments) {
            each.reset();
            each.given.reset();
            if (each.isOption() && !(isStep() && each.isFile)) options.push_back(&each);
        }
        mOptions.insert(mOptions.begin(), options.begin(), options.end());
    }

    void take(const std::string& word) {
        // A number like -5 is no option, and - stands for a file.
        const bool isOption = !mHaveOptionsEnded && word.size() > 1 && word[0] == '-' &&
                              isdigit(static_cast<unsigned char>(word[1])) == 0;
        if (mTaking != nullptr) {
            give(*std::exchange(mTaking, nullptr), word);
        } else if (isOption && word == "--") {
            mHaveOptionsEnded = true;
        } else if (isOption) {
            takeOption(word);
        } else if (mCommand == nullptr) {
            takeName(word);
        } else if (Argument* argument = argumentFor(word)) {
            mHaveOptionsEnded |= argument->takesOptions;
            give(*argument, word);
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
                             suggestion(name, valuesOf(optionsInWords())));
        }
        const bool hasValue = name != word;
        if (option->isFlag && hasValue) throw UsageError(option->name + ": takes no value");
        if (hasValue) {
            give(*option, word.substr(name.size() + (isLong ? 1 : 0)));
        } else if (option->isFlag) {
            give(*option, "");
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
            throw UsageError("no command " + inQuotes(name) +
                             suggestion(word, valuesOf(mProgram->commandsAfter(mTyped))));
        }
        mTyped = name;
        if (found[0]->name != name) return;
        mCommand = found[0];
        begin(*mCommand);
    }

    std::vector<Choice> optionsInWords() const {
        std::vector<Choice> list;
        for (const Argument* each : mOptions)
            list.push_back({each->name, each->help});
        return list;
    }

    /** @return the option that has a name, or a letter like "-o"; or nullptr. */
    Argument* optionOf(const std::string& name) const {
        for (Argument* each : mOptions) {
            if (name == each->name || name == each->letter) return each;
        }
        return nullptr;
    }

    /** @return the argument that a word is for which is no option; nullptr for none. */
    Argument* argumentFor(const std::string& word) const {
        Argument* found = nullptr;
        for (Argument& each : mCommand->arguments) {
            if (isStep() && each.isFlag && each.name == "--" + word) return &each;
            const bool isNamed = isStep() ? each.isFlag || each.isFile : each.isOption();
            if (found == nullptr && !isNamed && (each.isMany || !each.given)) found = &each;
        }
        return found;
    }

    void give(Argument& argument, const std::string& word) const {
        if (!argument.given) argument.given = mIndex;
        try {
            argument.read(word);
        } catch (const UsageError& error) {
            const bool isNamed = argument.isOption() && !isStep();
            throw UsageError((isNamed ? argument.name + ": " : "") + error.what());
        }
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
    /** The options that may follow, those of the command first. */
    std::vector<Argument*> mOptions;
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
        if (!isJson() || mCurrent->hasJson) return perform(*mCurrent);
        throw UsageError("has no JSON answer; leave out --json");
    }
    return kSuccess;
}

}  // namespace cli
