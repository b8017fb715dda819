// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "text/Numbers.h"

#include <cstdint>
#include <deque>
#include <functional>
#include <map>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <utility>
#include <vector>

namespace cli {

enum ExitCode {
    kSuccess = 0,
    /** The command has failed, or the output could not be written. */
    kFailed = 1,
    /**
     * The command line, or a file that it names, has a mistake: also a number that is outside the
     * range in the help, whether or not somebody else would have refused it, too.
     */
    kUsage = 2,
};

/** A mistake in the command line, or in a file that it names; what() says it in one line. */
class UsageError : public std::runtime_error {
  public:
    explicit UsageError(const std::string& what, std::optional<size_t> word = {})
        : runtime_error(what), index(word) {}
    /** Index of the word with the mistake; how many words there are, where one is missing. */
    const std::optional<size_t> index;
};

struct Choice {
    std::string value;
    std::string meaning;
};

/** @return the values alone. */
std::vector<std::string> valuesOf(const std::vector<Choice>& choices);

/** What was given for an argument; there from the moment on that the command runs. */
template <typename T>
using Value = std::shared_ptr<const T>;

/** An argument or an option. */
struct Argument {
    /** As helps show it: "MS", or "-o, --output FILE" for an option. */
    std::string title;
    /** "MS", or "--output". */
    std::string name;
    /** "-o", if the option has a letter. */
    std::string letter;
    bool isFlag = false;
    std::string help;
    std::vector<Choice> choices;
    bool isFile = false;
    bool isRequired = false;
    /** Whether it takes any number of words, and whether options among them. */
    bool isMany = false;
    bool takesOptions = false;
    /** The index of the first word that was given for it. */
    std::optional<size_t> given;
    /** Goes back to the initial value. */
    std::function<void()> reset;
    /** Reads a word. @throw UsageError */
    std::function<void(const std::string& word)> read;

    bool isOption() const { return name[0] == '-'; }
};

/**
 * A command with its arguments and options. An argument's name is in capitals, an option's begins
 * with dashes and is followed by what stands for its value: "MS", "--wait SECONDS",
 * "-o, --output FILE". An argument without an initial value must be given; an option without one
 * has the value 0, or no text.
 */
struct Command {
    std::string group = {};
    /** The words that call it, like "pattern play". */
    std::string name = {};
    std::string help = {};
    /** Arguments that make sense. */
    std::string example = {};
    /** What its help says besides. */
    std::vector<std::string> notes = {};
    bool hasJson = true;
    std::deque<Argument> arguments = {};
    /** Does what the command does, with what was read last. @return the exit code. */
    std::function<int()> perform = {};

    /** A number, a time or a strength. @param initial in the unit of a number alone. */
    Value<uint32_t> number(const std::string& title, const Numbers& numbers,
                           const std::string& about, std::optional<uint32_t> initial = {});
    /** @return the index of what was chosen. */
    Value<size_t> choice(const std::string& title, const std::vector<Choice>& choices,
                         const std::string& about, std::optional<size_t> initial = {});
    /** @param offered what completions offer, behind a comma again. */
    Value<std::string> text(const std::string& title, const std::string& about,
                            const std::optional<std::string>& initial = {},
                            std::vector<Choice> offered = {});
    /** Like text, for the name of a file. */
    Value<std::string> file(const std::string& title, const std::string& about,
                            const std::optional<std::string>& initial = {}) {
        auto value = text(title, about, initial);
        arguments.back().isFile = true;
        return value;
    }
    /** Any number of words. @param check throws a UsageError for a wrong one. */
    Value<std::vector<std::string>> words(const std::string& title, const std::string& about,
                                          std::function<void(const std::string&)> check = {});
    /** All that stands behind the options, options of another command included. */
    Value<std::vector<std::string>> rest(const std::string& title, const std::string& about) {
        auto value = words(title, about);
        arguments.back().takesOptions = true;
        return value;
    }
    Value<bool> flag(const std::string& title, const std::string& about);

    /** Says more in the command's help. */
    Command& note(const std::string& text) { return notes.push_back(text), *this; }
    /** For a command whose output is no answer that could be JSON. */
    Command& withoutJson() { return hasJson = false, *this; }
    /** Says what the command does; it returns the exit code. */
    void run(std::function<int()> action) { perform = std::move(action); }

    /**
     * Reads a step of a script. Options may also be given without their names, in the order in
     * which they were added, and flags without their dashes. There are no files in it.
     *
     * @throw UsageError with the index of the word
     */
    void readStep(const std::vector<std::string>& words);

  private:
    /** @param read makes a value of a word, or adds the word to it. */
    template <typename T, typename Read>
    Value<T> add(const std::string& title, const std::string& about,
                 const std::optional<T>& initial, const Read& read);
};

/** A program of many commands: reads its command line, helps, and completes for shells. */
class Program {
  public:
    Program(std::string name, std::string version, const std::string& about);
    Program(const Program&) = delete;
    Program& operator=(const Program&) = delete;
    virtual ~Program() = default;

    /** What stands before all commands: the options that they share, and the help's notes. */
    Command& shared() { return mShared; }
    /**
     * Adds a command.
     *
     * @param name one word, or two for a command of a group of its own.
     * @param example arguments that make sense.
     */
    Command& command(const std::string& group, const std::string& name, const std::string& help,
                     const std::string& example) {
        mCommands.push_back({group, name, help, example});
        return mCommands.back();
    }
    /** Runs the command that a command line asks for. @return the program's exit code. */
    int run(int argc, char** argv);
    /** Says something on standard error, unless answers are JSON. */
    void warn(const std::string& text) const;

    /** Names that no help shows, each for the first word of a command. */
    std::map<std::string, std::string> secondNames;

  protected:
    /** @return the words of the command that was recognised; empty where none was. */
    std::string current() const { return mCurrent == nullptr ? "" : mCurrent->name; }
    /** @return whether answers must be JSON; also of a line with a mistake in it. */
    virtual bool isJson() const { return false; }
    /** Runs a command whose arguments have been read. @return the exit code. */
    virtual int perform(const Command& command) { return command.perform(); }
    /** Says why the command was not done. @param status like "USAGE". */
    virtual void complain(const std::string& status, const std::string& reason) const;

  private:
    friend class Line;

    void addHelp();
    /** Does what a command line asks for. */
    int obey(const std::vector<std::string>& words);
    /** @return the command with a name, or all whose names begin with its words. */
    std::vector<Command*> named(const std::string& name);
    /** @return the words that may follow those of a command, with what they mean. */
    std::vector<Choice> commandsAfter(const std::string& typed) const;
    /** Prints the help of the commands with a name, or of the program. */
    void help(const std::string& name);
    void help(const Command& command) const;
    void printCommands() const;

    std::string mName;
    std::string mVersion;
    Command mShared;
    Value<bool> mWantsHelp;
    Value<bool> mWantsVersion;
    /** The words behind "help". */
    Value<std::vector<std::string>> mTopic;
    std::deque<Command> mCommands;
    const Command* mCurrent = nullptr;
};

}  // namespace cli
