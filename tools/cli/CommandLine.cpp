// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"

#include "text/Text.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <iostream>

namespace cli {
namespace {

/** @return what stands in brackets behind a help: "1 to 255; default: 7". */
std::string bracketed(const std::string& range, const std::string& initial) {
    const std::string between = range.empty() || initial.empty() ? "" : "; ";
    const std::string all = range + between + (initial.empty() ? "" : "default: " + initial);
    return all.empty() ? "" : " (" + all + ")";
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
                      const std::optional<T>& initial, const Read& read) {
    const T first = initial.value_or(T());
    auto value = std::make_shared<T>(first);
    Argument& argument = mArguments.emplace_back();
    // "-v,--verbose"; without a comma npos + 1 is 0.
    const size_t start = name.find(',') + 1;
    const size_t end = std::min(name.find(' '), name.size());
    argument.name = name.substr(start, end - start);
    argument.letter = start == 0 ? '\0' : name[1];
    argument.placeholder = name.substr(std::min(end + 1, name.size()));
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

Value<bool> Command::flag(const std::string& name, const std::string& help) {
    return add(name, help, std::optional<bool>(false),
               [](bool* value, const std::string& /* word */, bool) { *value = true; });
}

Program::Program(std::string name, std::string version, const std::string& about)
    : mName(std::move(name)), mVersion(std::move(version)) {
    mShared.mHelp = about;
    mWantsHelp = mShared.flag("-h,--help", "print the help of the command, or this one");
    mWantsVersion = mShared.flag("--version", "print the version");
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

Command* Program::find(const std::string& name) {
    for (Command& each : mCommands) {
        if (each.mName == name) return &each;
    }
    return nullptr;
}

std::vector<Choice> Program::commandsAfter(const std::string& typed) const {
    std::vector<Choice> words;
    const std::string start = typed.empty() ? "" : typed + " ";
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

int Program::run(int argc, char** argv) {
    int code = kFailed;
    addHelp();
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
