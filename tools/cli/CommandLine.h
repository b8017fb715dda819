// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "text/Numbers.h"

#include <cstdint>
#include <deque>
#include <functional>
#include <map>
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

/** What an argument may be; a command is one of another program, with all further words. */
enum Kind { kFlag, kText, kNumber, kChoice, kFile, kCommand };

/** An argument or an option: what it may be, and what was given for it. */
struct Argument {
    /**
     * As it stands in a call: "MS"; "[FILE]", which may be left out; "[PACKET...]", any number of
     * them; "--once", a flag; "--wait SECONDS" or "-o, --output FILE", an option with a value.
     */
    std::string title;
    Kind kind;
    std::string about;
    /** What stands for it where it is left out; empty for 0, or no text. */
    std::string initial;
    /** "MS", or "--output". */
    std::string name = {};
    /** "-o", if the option has a letter. */
    std::string letter = {};
    Numbers numbers = {};
    /** All that it may be. Of a text, what completions offer, behind a comma again. */
    std::vector<Choice> choices = {};
    /** Throws a UsageError for a wrong word. */
    std::function<void(const std::string& word)> check = {};
    /** The words that were given for it. */
    std::vector<std::string> given = {};

    bool isOption() const { return title[0] == '-'; }
    bool isRequired() const { return !isOption() && title[0] != '['; }
    bool isMany() const { return title.find("...") != std::string::npos; }
    bool isGiven() const { return !given.empty(); }
    std::string text() const { return isGiven() ? given.back() : initial; }
    /** @return a number, a time in ms, or the index of a choice. */
    uint32_t number() const { return text().empty() ? 0 : parse(text()); }

    /** @return the range in words; empty for what has none. */
    std::string range() const;
    /** @return what it is about, the range, and what stands for it. */
    std::string inHelp() const;
    /** Takes a word that was given for it. @throw UsageError */
    void take(const std::string& word);

  private:
    /** @return the number that a word stands for. @throw UsageError */
    uint32_t parse(const std::string& word) const;
};

/** A command with its arguments and options. */
struct Command {
    std::string group = {};
    /** The words that call it, like "pattern play". */
    std::string name = {};
    std::string help = {};
    /** Arguments that make sense. */
    std::string example = {};
    /** What its help says besides. */
    std::vector<std::string> notes = {};
    /** Whether its output may be JSON. */
    bool hasJson = true;
    std::deque<Argument> arguments = {};
    /** Does what the command does, with what was given last. @return the exit code. */
    std::function<int()> perform = {};

    /** Adds an argument: its title, what it may be, what it is about, and what stands for it. */
    Argument* add(const std::string& title, Kind kind, const std::string& about,
                  const std::string& initial = "");
    Argument* add(const std::string& title, const Numbers& numbers, const std::string& about,
                  const std::string& initial = "");
    Argument* add(const std::string& title, const std::vector<Choice>& choices,
                  const std::string& about, const std::string& initial = "", Kind kind = kChoice);

    /** Says more in the command's help. */
    Command& note(const std::string& text) { return notes.push_back(text), *this; }
    /** Says what the command does; it returns the exit code. */
    void run(std::function<int()> action) { perform = std::move(action); }

    /**
     * Reads a step of a script. Options may also be given without their names, in the order in
     * which they were added, and flags without their dashes. There are no files in it.
     *
     * @throw UsageError with the index of the word
     */
    void readStep(const std::vector<std::string>& words);
};

/** A program of many commands: reads its command line, helps, and completes for shells. */
class Program {
  public:
    /** @param about what the program does, like the help of a command. */
    Program(std::string name, std::string version, const std::string& about);
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
    /** Says something on standard error. */
    virtual void warn(const std::string& text) const;

    /** Names that no help shows, each for the first word of a command. */
    std::map<std::string, std::string> secondNames;

  protected:
    /** Runs a command whose arguments have been read. @return the exit code. */
    virtual int perform(const Command& command) { return command.perform(); }
    /** Says why the command was not done. @param status like "USAGE". */
    virtual void complain(const std::string& status, const std::string& reason) const;

    /** The words of the command, as far as they were recognised. */
    std::string mCurrent;

  private:
    friend class Line;

    void addHelp();
    /** Does what a command line asks for. */
    int obey(const std::vector<std::string>& words);
    /** Prints what the last of the words behind "--complete" may be, and what that means. */
    int complete(const std::vector<std::string>& words);
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
    Argument* mWantsHelp;
    Argument* mWantsVersion;
    std::deque<Command> mCommands;
};

}  // namespace cli
