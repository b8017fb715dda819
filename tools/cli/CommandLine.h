// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <optional>
#include <stdexcept>
#include <string>
#include <vector>

namespace CLI {
class App;
class Option;
}  // namespace CLI

namespace cli {

/** A mistake in the command line, or in a file that it names; what() says it in one line. */
class UsageError : public std::runtime_error {
  public:
    using runtime_error::runtime_error;
};

/** The whole decimal numbers that an argument may be. */
struct Numbers {
    /** In words, with the article: "a time in ms". */
    const char* what;
    uint32_t least;
    uint32_t most;
    /** The greatest that is passed on, where somebody else judges; 0: most. */
    uint32_t passed = 0;
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

/** An argument or an option, as helps and completions show it. */
struct Argument {
    /** "MS", or "--strength" for an option. */
    std::string name;
    /** "-v, --verbose": all names that it has. */
    std::string names;
    /** What stands for the option's value; empty for a flag. */
    std::string placeholder;
    std::string help;
    std::vector<Choice> choices;
    bool isFile = false;
    bool isRequired = false;
    bool isMany = false;
    /** Where the parser puts what was given; nullptr for all that it leaves over. */
    const CLI::Option* option = nullptr;
    /** Takes over what was given, of which there is some; throws a UsageError. */
    std::function<void(const std::vector<std::string>& given)> read;

    bool isOption() const { return name[0] == '-'; }
};

/**
 * A command with its arguments and options. An argument's name is in capitals, an option's begins
 * with dashes and is followed by what stands for its value: "MS", "--wait SECONDS". Without an
 * initial value it must be given.
 */
class Command {
  public:
    Value<uint32_t> number(const std::string& name, const Numbers& numbers, const std::string& help,
                           std::optional<uint32_t> initial = {});
    /** @return the index of what was chosen. */
    Value<size_t> choice(const std::string& name, std::vector<Choice> choices,
                         const std::string& help, std::optional<size_t> initial = {});
    Value<std::string> text(const std::string& name, const std::string& help,
                            std::optional<std::string> initial = {});
    /** Like text, for the name of a file. */
    Value<std::string> file(const std::string& name, const std::string& help,
                            std::optional<std::string> initial = {});
    /** Any number of words. */
    Value<std::vector<std::string>> words(const std::string& name, const std::string& help);
    /** All that stands behind the options, options of another command included. */
    Value<std::vector<std::string>> rest(const std::string& name, const std::string& help);
    Value<bool> flag(const std::string& name, const std::string& help);

    /** Says more in the command's help. */
    Command& note(const std::string& text);
    /** For a command whose output is no answer that could be JSON. */
    Command& withoutJson();
    /** Says what the command does; it returns the exit code. */
    void run(std::function<int()> action) { mAction = std::move(action); }

    /** The words that call it, like "prebaked play". */
    const std::string& name() const { return mName; }

  private:
    friend class Program;

    Argument& add(const std::string& name, const std::string& help, bool isRequired);

    CLI::App* mApp = nullptr;
    std::string mName;
    std::string mGroup;
    std::string mHelp;
    std::string mExample;
    std::vector<std::string> mNotes;
    bool mHasJson = true;
    std::deque<Argument> mArguments;
    std::function<int()> mAction;
};

/** A program of many commands: reads its command line, helps, and completes for shells. */
class Program {
  public:
    Program(const std::string& name, std::string version, const std::string& about);
    Program(const Program&) = delete;
    Program& operator=(const Program&) = delete;
    ~Program();

    /** What stands before all commands: the options that they share, and the help's notes. */
    Command& shared() { return mRoot; }
    /**
     * Adds a command.
     *
     * @param name one word, or two for a command of a group of its own.
     * @param example arguments that make sense.
     */
    Command& command(const std::string& group, const std::string& name, const std::string& help,
                     const std::string& example);
    /** Adds the command that prints the scripts of shells. */
    void addCompletion(const std::string& group);

    /**
     * Runs the command that a command line asks for.
     *
     * @param isJson whether the answer must be JSON; asked when the command line has been read.
     * @return the exit code of the command.
     */
    int run(int argc, char** argv, const std::function<bool()>& isJson);
    /** @return the command that was recognised, for messages; nullptr where none was. */
    const Command* current() const { return mCurrent; }

  private:
    /** Prints the help of the commands with a name, or of the program. */
    void help(const std::string& name) const;
    void helpProgram() const;
    void helpCommand(const Command& command) const;
    /** Prints what the last of some words may become: each a word, a tabulator and its meaning. */
    void complete(const std::vector<std::string>& words) const;
    /** @return the options of a command, if there is one, and of the program. */
    std::vector<Choice> optionsOf(const Command* command) const;
    /** @return the argument at a place among those that are no options; nullptr for none. */
    static const Argument* plainArgument(const Command& command, size_t position);
    /** @return what may stand in the place of the last word; ":files" for a file's name. */
    std::vector<Choice> answersFor(const std::vector<std::string>& words) const;
    const Argument* findOption(const Command* command, const std::string& name) const;

    /** @return the words of the command that was recognised, as far as they go. */
    std::string parse(int argc, char** argv);
    void read(const Command& command) const;
    [[noreturn]] void complainOf(const std::string& word, const std::string& typed) const;
    /** @return the words that may follow those of a command, with what they mean. */
    std::vector<Choice> commandsAfter(const std::string& typed) const;
    const Command* find(const std::string& name) const;

    std::unique_ptr<CLI::App> mApp;
    std::string mVersion;
    Command mRoot;
    std::deque<Command> mCommands;
    const Command* mCurrent = nullptr;
};

}  // namespace cli
