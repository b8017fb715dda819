// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"

#include "Text.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iostream>
#include <map>

namespace cli {
namespace {

/** @return what stands in brackets behind a help: "1 to 255; default: 7". */
std::string bracketed(const std::string& range, const std::string& initial) {
    const std::string between = range.empty() || initial.empty() ? "" : "; ";
    const std::string all = range + between + (initial.empty() ? "" : "default: " + initial);
    return all.empty() ? "" : " (" + all + ")";
}

constexpr char kTooMany[] = " is one argument too many";

std::string afterBlank(const std::string& text) {
    return text.empty() ? "" : text + " ";
}

using Options = std::map<const CLI::Option*, const Argument*>;

/** Tells the parser of options; it leaves the other words in their order. */
void define(CLI::App* app, const std::deque<Argument>& arguments, Options* options) {
    constexpr auto kAll = CLI::MultiOptionPolicy::TakeAll;
    // A list without a limit would take "[a,b]" for two words.
    constexpr int kAnyNumber = CLI::detail::expected_max_vector_size - 1;
    app->add_option("WORDS")->expected(kAnyNumber)->multi_option_policy(kAll);
    for (const Argument& each : arguments) {
        // No options behind the first word.
        if (each.takesOptions) app->positionals_at_end();
        if (!each.isOption()) continue;
        const std::string names = (each.letter.empty() ? "" : each.letter + ",") + each.name;
        CLI::Option* option = each.isFlag() ? app->add_flag(names) : app->add_option(names);
        options->emplace(option->multi_option_policy(kAll), &each);
    }
}

}  // namespace

std::string Numbers::range() const {
    return std::to_string(least) + " to " + std::to_string(most);
}

std::vector<std::string> valuesOf(const std::vector<Choice>& choices) {
    std::vector<std::string> values;
    values.reserve(choices.size());
    for (const Choice& choice : choices)
        values.push_back(choice.value);
    return values;
}

template <typename T, typename Read>
Value<T> Command::add(const std::string& name, const std::string& help,
                      const std::optional<T>& initial, Read read) {
    const T first = initial.value_or(T());
    auto value = std::make_shared<T>(first);
    Argument& argument = mArguments.emplace_back();
    const size_t blank = std::min(name.find(' '), name.size());
    // "-v,--verbose"; without a comma npos + 1 is 0.
    const size_t start = name.find(',') + 1;
    argument.name = name.substr(start, blank - start);
    argument.letter = name.substr(0, start == 0 ? 0 : start - 1);
    argument.placeholder = name.substr(std::min(blank + 1, name.size()));
    argument.help = help;
    argument.isRequired = !initial;
    argument.reset = [=] { *value = first; };
    argument.read = [=](const std::string& word, bool isStrict) {
        read(value.get(), word, isStrict);
    };
    return value;
}

Value<uint32_t> Command::number(const std::string& name, const Numbers& numbers,
                                const std::string& help, std::optional<uint32_t> initial) {
    const std::string shown = initial ? std::to_string(*initial) : "";
    return add(name, help + bracketed(numbers.range(), shown), initial,
               [numbers](uint32_t* value, const std::string& word, bool isStrict) {
                   const bool passes = numbers.passed != 0 && !isStrict;
                   const auto number = parseNumber(word, passes ? 0 : numbers.least,
                                                   passes ? numbers.passed : numbers.most);
                   if (!number) {
                       throw UsageError(inQuotes(word) + " is not " + numbers.what + " (" +
                                        numbers.range() + ")");
                   }
                   *value = *number;
               });
}

Value<size_t> Command::choice(const std::string& name, std::vector<Choice> choices,
                              const std::string& help, std::optional<size_t> initial) {
    const std::vector<std::string> values = valuesOf(choices);
    const std::string list = join(values, ", ", " or ");
    auto value = add(
            name, help + bracketed(list, initial ? values[*initial] : ""), initial,
            [=](size_t* index, const std::string& word, bool /* isStrict */) {
                const auto found = std::find(values.begin(), values.end(), word);
                if (found == values.end()) {
                    throw UsageError(inQuotes(word) + " is not " + list + suggestion(word, values));
                }
                *index = static_cast<size_t>(found - values.begin());
            });
    mArguments.back().choices = std::move(choices);
    return value;
}

Value<std::string> Command::text(const std::string& name, const std::string& help,
                                 std::optional<std::string> initial) {
    return add(name, help + bracketed("", initial.value_or("")), initial,
               [](std::string* value, const std::string& word, bool) { *value = word; });
}

Value<std::string> Command::file(const std::string& name, const std::string& help,
                                 std::optional<std::string> initial) {
    auto value = text(name, help, std::move(initial));
    mArguments.back().isFile = true;
    return value;
}

Value<std::vector<std::string>> Command::words(const std::string& name, const std::string& help,
                                               std::function<void(const std::string&)> check) {
    using Words = std::vector<std::string>;
    auto value = add(name, help, std::optional<Words>(Words()),
                     [=](Words* words, const std::string& word, bool /* isStrict */) {
                         if (check) check(word);
                         words->push_back(word);
                     });
    mArguments.back().isMany = true;
    return value;
}

Value<std::vector<std::string>> Command::rest(const std::string& name, const std::string& help) {
    auto value = words(name, help);
    mArguments.back().takesOptions = true;
    return value;
}

Value<bool> Command::flag(const std::string& name, const std::string& help) {
    return add(name, help, std::optional<bool>(false),
               [](bool* value, const std::string& /* word */, bool) { *value = true; });
}

void Command::read(const Given& given, bool isStep) const {
    for (const Argument& argument : mArguments)
        argument.reset();
    for (size_t i = 0; i < given.size(); ++i) {
        const auto& [argument, word] = given[i];
        try {
            argument->read(word, isStep);
        } catch (const UsageError& error) {
            const bool isNamed = argument->isOption() && !isStep;
            throw UsageError((isNamed ? argument->name + ": " : "") + error.what(), i);
        }
    }
    for (const Argument& argument : mArguments) {
        const bool isGiven = std::any_of(given.begin(), given.end(),
                                         [&](const auto& each) { return each.first == &argument; });
        if (!isGiven && (argument.isRequired || (isStep && argument.isMany))) {
            throw UsageError(argument.name + " is missing: " + argument.help, given.size());
        }
    }
}

void Command::readStep(const std::vector<std::string>& words) const {
    Given given;
    auto next = mArguments.begin();
    for (const std::string& word : words) {
        const auto isItsFlag = [&](const Argument& each) {
            return each.isFlag() && each.name == "--" + word;
        };
        const bool isFlag = std::any_of(mArguments.begin(), mArguments.end(), isItsFlag);
        next = std::find_if(next, mArguments.end(), [&](const Argument& each) {
            return isFlag ? isItsFlag(each) : !each.isFlag() && !each.isFile;
        });
        if (next == mArguments.end()) throw UsageError(inQuotes(word) + kTooMany, given.size());
        given.emplace_back(&*next, word);
        if (!next->isMany) ++next;
    }
    read(given, true);
}

Program::Program(std::string name, std::string version, const std::string& about)
    : mName(std::move(name)), mVersion(std::move(version)) {
    mRoot.mHelp = about;
    mWantsHelp = mRoot.flag("-h,--help", "print the help of the command, or this one");
    mWantsVersion = mRoot.flag("--version", "print the version");
    Command& helpCommand = command("Help", "help", "print the help of a command", "prebaked play");
    const auto words = helpCommand.words("COMMAND", "a command, in one or two words");
    helpCommand.withoutJson().run([this, words] {
        help(join(*words, " ", " "));
        return 0;
    });
}

Command& Program::command(const std::string& group, const std::string& name,
                          const std::string& help, const std::string& example) {
    Command& added = mCommands.emplace_back();
    added.mName = name;
    added.mGroup = group;
    added.mHelp = help;
    added.mExample = example;
    return added;
}

const Command* Program::find(const std::string& name) const {
    const auto found = std::find_if(mCommands.begin(), mCommands.end(),
                                    [&](const Command& each) { return each.mName == name; });
    return found == mCommands.end() ? nullptr : &*found;
}

std::vector<Choice> Program::commandsAfter(const std::string& typed) const {
    std::vector<Choice> words;
    const std::string start = afterBlank(typed);
    for (const Command& each : mCommands) {
        if (each.mName.compare(0, start.size(), start) != 0) continue;
        const std::string word = each.mName.substr(start.size());
        const std::string group = word.substr(0, word.find(' '));
        if (group == word) {
            words.push_back({word, each.mHelp});
        } else if (words.empty() || words.back().value != group) {
            // One entry for a group of commands.
            words.push_back({group, join(valuesOf(commandsAfter(group)), ", ", " or ")});
        }
    }
    return words;
}

std::vector<const Argument*> Program::optionsOf(const Command* command) const {
    std::vector<const Argument*> options;
    for (const Command* each : {command, &mRoot}) {
        if (each == nullptr) continue;
        for (const Argument& argument : each->mArguments) {
            if (argument.isOption()) options.push_back(&argument);
        }
    }
    return options;
}

const Argument* Program::nextArgument(const Line& line) {
    auto before = std::count_if(line.given.begin(), line.given.end(),
                                [](const auto& each) { return !each.first->isOption(); });
    for (const Argument& argument : line.command->mArguments) {
        if (!argument.isOption() && (argument.isMany || before-- == 0)) return &argument;
    }
    return nullptr;
}

void Program::Line::complain(const std::string& what) {
    if (problem.empty()) problem = what;
}

Program::Line Program::parse(const std::vector<std::string>& words) const {
    Options options;
    CLI::App root;
    root.set_help_flag();
    root.allow_extras()->fallthrough()->require_subcommand(0, 1);
    define(&root, mRoot.mArguments, &options);
    std::map<std::string, CLI::App*> groups = {{"", &root}};
    for (const Command& each : mCommands) {
        // In a name of one word there is no blank, and npos + 1 is 0.
        const size_t start = each.mName.find(' ') + 1;
        const std::string group = each.mName.substr(0, start == 0 ? 0 : start - 1);
        CLI::App*& parent = groups[group];
        if (parent == nullptr) define(parent = root.add_subcommand(group), {}, &options);
        define(parent->add_subcommand(each.mName.substr(start)), each.mArguments, &options);
    }
    std::string unfinished;
    try {
        root.parse(std::vector<std::string>(words.rbegin(), words.rend()));
    } catch (const CLI::ParseError& error) {
        // The line has been read but for its last option's value: "--option: what is missing".
        const std::string what = error.what();
        unfinished = what.substr(0, what.find(':'));
    }

    Line line;
    std::vector<std::string> unknown = root.remaining(true);
    const auto marks = std::remove(unknown.begin(), unknown.end(), "--");
    line.hasOptionsEnded = marks != unknown.end();
    unknown.erase(marks, unknown.end());
    std::vector<CLI::App*> next = {&root};
    for (; !next.empty(); next = next[0]->get_subcommands()) {
        line.typed = afterBlank(line.typed) + next[0]->get_name();
        line.command = find(line.typed);
        std::map<const CLI::Option*, size_t> counts;
        for (const CLI::Option* each : next[0]->parse_order()) {
            const std::string& word = each->results()[counts[each]++];
            if (const Argument* option = options[each]) {
                takeOption(*option, word, &line);
            } else {
                takeWord(word, &line);
            }
        }
    }
    std::vector<std::string> names;
    for (const Argument* each : optionsOf(line.command)) {
        names.push_back(each->name);
        if (line.taking == nullptr && each->name == unfinished) line.taking = each;
    }
    if (!unknown.empty()) {
        // May be why a word makes no sense: it is the option's value.
        const std::string name = unknown[0].substr(0, unknown[0].find('='));
        line.problem = "no option " + inQuotes(name) + suggestion(name, names);
    }
    return line;
}

void Program::takeOption(const Argument& option, const std::string& value, Line* line) {
    if (option.isFlag()) {
        if (value != "true") return line->complain(option.name + ": takes no value");
        // Also of a line with a mistake in it.
        option.read("", false);
    }
    line->given.emplace_back(&option, option.isFlag() ? "" : value);
}

void Program::takeWord(const std::string& word, Line* line) const {
    if (line->command == nullptr) {
        if (line->hasOptionsEnded) return line->complain("\"--\" stands behind the command");
        const std::string name = afterBlank(line->typed) + word;
        line->complain("no command " + inQuotes(name) +
                       suggestion(word, valuesOf(commandsAfter(line->typed))));
    } else if (const Argument* argument = nextArgument(*line)) {
        line->given.emplace_back(argument, word);
        if (argument->takesOptions) line->taking = argument;
    } else {
        line->complain(inQuotes(word) + kTooMany);
    }
}

int Program::obey(const std::vector<std::string>& words) {
    if (words.size() > 1 && words[0] == "--complete") {
        complete({words.begin() + 1, words.end()});
        return kSuccess;
    }
    Line line = parse(words);
    mCurrent = line.command;
    if (*mWantsHelp) {
        help(line.typed);
        return kSuccess;
    }
    if (*mWantsVersion) {
        std::cout << mName << ' ' << mVersion << '\n';
        return kSuccess;
    }
    if (line.taking != nullptr && line.taking->isOption()) {
        line.complain(line.taking->name + ": the value is missing");
    }
    if (line.command == nullptr) {
        line.complain(line.typed.empty()
                              ? "no command; " + inQuotes(mName + " help") + " lists them"
                              : line.typed + ": no command; " +
                                        join(valuesOf(commandsAfter(line.typed)), ", ", " or "));
    }
    if (!line.problem.empty()) throw UsageError(line.problem);
    mCurrent->read(line.given, false);
    if (isJson() && !mCurrent->mHasJson) throw UsageError("has no JSON answer; leave out --json");
    return perform(*mCurrent);
}

int Program::run(int argc, char** argv) {
    int code = kFailed;
    try {
        code = obey({argv + std::min(argc, 1), argv + argc});
    } catch (const UsageError& error) {
        complain("USAGE", error.what());
        code = kUsage;
    } catch (const std::exception& error) {
        complain("FAILED", error.what());
    }
    errno = 0;
    if (std::cout.flush()) return code;
    std::cerr << mName
              << ": standard output cannot be written: " << strerror(errno != 0 ? errno : EIO)
              << '\n';
    return kFailed;
}

void Program::warn(const std::string& text) const {
    if (!isJson()) std::cerr << mName << ": " << printable(text) << '\n';
}

void Program::complain(const std::string& /* status */, const std::string& reason) const {
    warn((current().empty() ? "" : current() + ": ") + reason);
}

}  // namespace cli
