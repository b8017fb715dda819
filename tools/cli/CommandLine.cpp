// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"

#include "Text.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <iostream>
#include <utility>

namespace cli {
namespace {

using Given = std::vector<std::string>;

std::string rangeInWords(const Numbers& numbers) {
    return std::to_string(numbers.least) + " to " + std::to_string(numbers.most);
}

/** @throw UsageError that names the option; an argument is plain without its name. */
[[noreturn]] void complain(const Argument& argument, const std::string& what) {
    throw UsageError((argument.isOption() ? argument.name + ": " : "") + what);
}

/** @return what stands in brackets behind a help: "1 to 255; default: 7". */
std::string bracketed(const std::string& range, const std::string& initial) {
    const std::string between = range.empty() || initial.empty() ? "" : "; ";
    const std::string all = range + between + (initial.empty() ? "" : "default: " + initial);
    return all.empty() ? "" : " (" + all + ")";
}

/** @return what a command has not taken; behind "--" the parser leaves it to the program. */
Given leftOver(const CLI::App& program, const CLI::App& command) {
    const Given words = command.remaining();
    return words.empty() ? program.remaining() : words;
}

}  // namespace

std::vector<std::string> valuesOf(const std::vector<Choice>& choices) {
    std::vector<std::string> values;
    values.reserve(choices.size());
    for (const Choice& choice : choices)
        values.push_back(choice.value);
    return values;
}

Argument& Command::add(const std::string& name, const std::string& help, bool isRequired) {
    const size_t blank = name.find(' ');
    const std::string names = name.substr(0, blank);
    Argument& argument = mArguments.emplace_back();
    // "-v,--verbose"; without a comma npos + 1 is 0.
    const size_t comma = names.find(',');
    argument.name = names.substr(comma + 1);
    argument.names =
            (comma == std::string::npos ? "" : names.substr(0, comma) + ", ") + argument.name;
    argument.placeholder = blank == std::string::npos ? "" : name.substr(blank + 1);
    argument.help = help;
    argument.isRequired = isRequired;
    argument.option = argument.isOption() && argument.placeholder.empty() ? mApp->add_flag(names)
                                                                          : mApp->add_option(names);
    mApp->get_option(argument.name)->multi_option_policy(CLI::MultiOptionPolicy::TakeAll);
    return argument;
}

Value<uint32_t> Command::number(const std::string& name, const Numbers& numbers,
                                const std::string& help, std::optional<uint32_t> initial) {
    auto value = std::make_shared<uint32_t>(initial.value_or(0));
    const std::string shown = initial ? std::to_string(*initial) : "";
    Argument& argument = add(name, help + bracketed(rangeInWords(numbers), shown), !initial);
    argument.read = [=, &argument](const Given& given) {
        const uint32_t least = numbers.passed != 0 ? 0 : numbers.least;
        const uint32_t most = std::max(numbers.most, numbers.passed);
        const auto number = parseNumber(given.back(), least, most);
        if (!number) {
            complain(argument, inQuotes(given.back()) + " is not " + numbers.what + " (" +
                                       rangeInWords(numbers) + ")");
        }
        *value = *number;
    };
    return value;
}

Value<size_t> Command::choice(const std::string& name, std::vector<Choice> choices,
                              const std::string& help, std::optional<size_t> initial) {
    auto value = std::make_shared<size_t>(initial.value_or(0));
    const std::vector<std::string> values = valuesOf(choices);
    const std::string shown = initial ? values[*initial] : "";
    const std::string list = join(values, ", ", " or ");
    Argument& argument = add(name, help + bracketed(list, shown), !initial);
    argument.choices = std::move(choices);
    argument.read = [=, &argument](const Given& given) {
        const auto found = std::find(values.begin(), values.end(), given.back());
        if (found == values.end()) {
            complain(argument,
                     inQuotes(given.back()) + " is not " + list + suggestion(given.back(), values));
        }
        *value = static_cast<size_t>(found - values.begin());
    };
    return value;
}

Value<std::string> Command::text(const std::string& name, const std::string& help,
                                 std::optional<std::string> initial) {
    auto value = std::make_shared<std::string>(initial.value_or(""));
    add(name, help + bracketed("", initial.value_or("")), !initial).read =
            [value](const Given& given) { *value = given.back(); };
    return value;
}

Value<std::string> Command::file(const std::string& name, const std::string& help,
                                 std::optional<std::string> initial) {
    auto value = text(name, help, std::move(initial));
    mArguments.back().isFile = true;
    return value;
}

Value<std::vector<std::string>> Command::words(const std::string& name, const std::string& help) {
    auto value = std::make_shared<std::vector<std::string>>();
    Argument& argument = add(name, help, false);
    argument.isMany = true;
    argument.read = [value](const Given& given) { *value = given; };
    mApp->get_option(name)->expected(-1);
    return value;
}

Value<std::vector<std::string>> Command::rest(const std::string& name, const std::string& help) {
    auto value = words(name, help);
    mApp->remove_option(mApp->get_option(name));
    mArguments.back().option = nullptr;
    mApp->fallthrough(false)->prefix_command();
    return value;
}

Value<bool> Command::flag(const std::string& name, const std::string& help) {
    auto value = std::make_shared<bool>(false);
    Argument& argument = add(name, help, false);
    argument.read = [=, &argument](const Given& given) {
        if (given.back() != "true") complain(argument, "takes no value");
        *value = true;
    };
    return value;
}

Command& Command::note(const std::string& text) {
    mNotes.push_back(text);
    return *this;
}

Command& Command::withoutJson() {
    mHasJson = false;
    return *this;
}

Program::Program(const std::string& name, std::string version, const std::string& about)
    : mApp(std::make_unique<CLI::App>(about, name)), mVersion(std::move(version)) {
    mApp->set_help_flag();
    mApp->allow_extras()->require_subcommand(0, 1);
    mRoot.mApp = mApp.get();
    mRoot.mHelp = about;
    mRoot.flag("-h,--help", "print the help of the command, or this one");
    mRoot.flag("--version", "print the version");
    Command& helpCommand = command("Help", "help", "print the help of a command", "prebaked play");
    const auto words = helpCommand.words("COMMAND", "a command, in one or two words");
    helpCommand.withoutJson().run([this, words] {
        help(join(*words, " ", " "));
        return 0;
    });
}

Program::~Program() = default;

Command& Program::command(const std::string& group, const std::string& name,
                          const std::string& help, const std::string& example) {
    const size_t blank = name.find(' ');
    CLI::App* parent = mApp.get();
    if (blank != std::string::npos) {
        const std::string first = name.substr(0, blank);
        parent = commandsAfter(first).empty() ? mApp->add_subcommand(first)
                                              : mApp->get_subcommand(first);
        parent->fallthrough()->require_subcommand(0, 1);
    }
    Command& added = mCommands.emplace_back();
    added.mName = name;
    added.mGroup = group;
    added.mHelp = help;
    added.mExample = example;
    // In a name of one word there is no blank, and npos + 1 is 0.
    added.mApp = parent->add_subcommand(name.substr(blank + 1))->fallthrough();
    return added;
}

std::string Program::parse(int argc, char** argv) {
    std::string problem;
    try {
        mApp->parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        // The library says "--option: what it thinks".
        const std::string what = error.what();
        problem = what.substr(0, what.find(':')) + ": the value is missing";
    }
    std::string typed;
    for (const CLI::App* app = mApp.get(); !app->get_subcommands().empty();) {
        app = app->get_subcommands()[0];
        typed += (typed.empty() ? "" : " ") + app->get_name();
    }
    mCurrent = find(typed);
    if (!problem.empty()) throw UsageError(problem);
    return typed;
}

const Command* Program::find(const std::string& name) const {
    const auto found = std::find_if(mCommands.begin(), mCommands.end(),
                                    [&](const Command& each) { return each.mName == name; });
    return found == mCommands.end() ? nullptr : &*found;
}

std::vector<Choice> Program::commandsAfter(const std::string& typed) const {
    std::vector<Choice> words;
    const std::string start = typed.empty() ? "" : typed + " ";
    for (const Command& each : mCommands) {
        if (each.mName.compare(0, start.size(), start) != 0) continue;
        const std::string word = each.mName.substr(start.size());
        const size_t blank = word.find(' ');
        if (blank == std::string::npos) {
            words.push_back({word, each.mHelp});
            continue;
        }
        // One entry for a group of commands.
        const std::string group = word.substr(0, blank);
        if (!words.empty() && words.back().value == group) continue;
        words.push_back({group, join(valuesOf(commandsAfter(group)), ", ", " or ")});
    }
    return words;
}

void Program::complainOf(const std::string& word, const std::string& typed) const {
    if (word.size() > 1 && word[0] == '-') {
        std::vector<std::string> options;
        for (const Command* command : {&mRoot, mCurrent}) {
            if (command == nullptr) continue;
            for (const Argument& each : command->mArguments) {
                if (each.isOption()) options.push_back(each.name);
            }
        }
        const std::string name = word.substr(0, word.find('='));
        throw UsageError("no option " + inQuotes(name) + suggestion(name, options));
    }
    if (mCurrent != nullptr) throw UsageError(inQuotes(word) + " is one argument too many");
    const std::string start = typed.empty() ? "" : typed + " ";
    throw UsageError("no command " + inQuotes(start + word) +
                     suggestion(word, valuesOf(commandsAfter(typed))));
}

void Program::read(const Command& command) const {
    for (const Argument& argument : command.mArguments) {
        const Given given = argument.option != nullptr ? argument.option->results()
                                                       : leftOver(*mApp, *command.mApp);
        if (!given.empty()) {
            argument.read(given);
        } else if (argument.isRequired) {
            throw UsageError(argument.name + " is missing: " + argument.help);
        }
    }
}

int Program::run(int argc, char** argv, const std::function<bool()>& isJson) {
    const Given words(argv + std::min(argc, 1), argv + argc);
    if (words.size() > 1 && words[0] == "--complete") {
        complete({words.begin() + 1, words.end()});
        return 0;
    }
    const std::string typed = parse(argc, argv);
    const Argument& helpFlag = mRoot.mArguments[0];
    const Argument& versionFlag = mRoot.mArguments[1];
    const bool takesRest = mCurrent != nullptr && !mCurrent->mArguments.empty() &&
                           mCurrent->mArguments.back().option == nullptr;
    Given unknown = takesRest ? leftOver(*mApp, *mCurrent->mApp) : mApp->remaining(true);
    // The parser leaves the mark of the options' end over.
    unknown.erase(std::remove(unknown.begin(), unknown.end(), "--"), unknown.end());
    // A command that leaves options over leaves this one over, too.
    const bool isLeft =
            takesRest && !unknown.empty() && (unknown[0] == "-h" || unknown[0] == helpFlag.name);
    if (isLeft || helpFlag.option->count() > 0) {
        help(typed);
        return 0;
    }
    if (versionFlag.option->count() > 0) {
        std::cout << mApp->get_name() << ' ' << mVersion << '\n';
        return 0;
    }
    if (!unknown.empty() && (!takesRest || unknown[0][0] == '-')) complainOf(unknown[0], typed);
    if (mCurrent == nullptr) {
        const std::string list = join(valuesOf(commandsAfter(typed)), ", ", " or ");
        throw UsageError(typed.empty() ? "no command; " + inQuotes(mApp->get_name() + " help") +
                                                 " lists them"
                                       : typed + ": no command; " + list);
    }
    const Command& command = *std::exchange(mCurrent, nullptr);
    read(mRoot);
    mCurrent = &command;
    read(command);
    if (isJson() && !command.mHasJson) throw UsageError("has no JSON answer; leave out --json");
    return command.mAction();
}

}  // namespace cli
