// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"

#include "text/Output.h"
#include "text/Text.h"

#include <algorithm>
#include <cstring>
#include <iostream>

namespace cli {

std::vector<std::string> valuesOf(const std::vector<Choice>& choices) {
    std::vector<std::string> values;
    values.reserve(choices.size());
    for (const Choice& choice : choices)
        values.push_back(choice.value);
    return values;
}

/** @param shown the initial value, in words. @param read sets a value from a word. */
template <typename T, typename Read>
Value<T> Command::add(const std::string& name, const std::string& help, const std::string& range,
                      const std::optional<T>& initial, const std::string& shown, const Read& read) {
    const T first = initial.value_or(T());
    auto value = std::make_shared<T>(first);
    Argument& argument = mArguments.emplace_back();
    argument.title = name;
    // In "-o, --output FILE" the name stands in the middle.
    const size_t start = name[0] == '-' ? name.find("--") : 0;
    const size_t blank = name.find(' ', start);
    argument.name = name.substr(start, blank - start);
    argument.letter = name.substr(0, start > 0 ? 2 : 0);
    argument.isFlag = argument.isOption() && blank == std::string::npos;
    const std::string between = range.empty() || shown.empty() ? "" : "; ";
    const std::string more = range + between + (shown.empty() ? "" : "default: " + shown);
    argument.help = help + (more.empty() ? "" : " (" + more + ")");
    argument.isRequired = !initial && !argument.isOption();
    argument.reset = [=] { *value = first; };
    argument.read = [=](const std::string& word) { read(*value, word); };
    return value;
}

Value<uint32_t> Command::number(const std::string& name, const Numbers& numbers,
                                const std::string& help, std::optional<uint32_t> initial) {
    const std::string shown = initial ? std::to_string(*initial) : "";
    return add(name, help, numbers.range(), numbers.parse(shown), shown,
               [numbers](uint32_t& value, const std::string& word) {
                   const auto number = numbers.parse(word);
                   if (!number) {
                       throw UsageError(inQuotes(word) + " is not " + numbers.what + " (" +
                                        numbers.range() + ")");
                   }
                   value = *number;
               });
}

Value<size_t> Command::choice(const std::string& name, const std::vector<Choice>& choices,
                              const std::string& help, std::optional<size_t> initial) {
    const std::vector<std::string> values = valuesOf(choices);
    const std::string range = join(values, ", ", " or ");
    auto value = add(name, help, range, initial, initial ? values[*initial] : "",
                     [values, range](size_t& index, const std::string& word) {
                         const auto found = std::find(values.begin(), values.end(), word);
                         if (found == values.end()) {
                             throw UsageError(inQuotes(word) + " is not " + range +
                                              suggestion(word, values));
                         }
                         index = static_cast<size_t>(found - values.begin());
                     });
    mArguments.back().choices = choices;
    return value;
}

Value<std::string> Command::text(const std::string& name, const std::string& help,
                                 std::optional<std::string> initial, std::vector<Choice> offered) {
    auto value = add(name, help, "", initial, initial.value_or(""),
                     [](std::string& text, const std::string& word) { text = word; });
    mArguments.back().choices = std::move(offered);
    return value;
}

Value<std::vector<std::string>> Command::words(const std::string& name, const std::string& help,
                                               std::function<void(const std::string&)> check) {
    auto value = add(name, help, "", std::optional(std::vector<std::string>()), "",
                     [check](std::vector<std::string>& words, const std::string& word) {
                         if (check) check(word);
                         words.push_back(word);
                     });
    mArguments.back().isMany = true;
    return value;
}

Value<bool> Command::flag(const std::string& name, const std::string& help) {
    return add(name, help, "", std::optional(false), "",
               [](bool& value, const std::string& /* word */) { value = true; });
}

Program::Program(std::string name, std::string version, const std::string& about)
    : mName(std::move(name)), mVersion(std::move(version)) {
    mShared.mHelp = about;
    mWantsHelp = mShared.flag("-h, --help", "print the help of the command, or this one");
    mWantsVersion = mShared.flag("--version", "print the version");
}

std::vector<Command*> Program::named(const std::string& name) {
    std::vector<Command*> found;
    for (Command& each : mCommands) {
        if ((each.mName + " ").compare(0, name.size() + 1, name + " ") == 0) found.push_back(&each);
    }
    return found;
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
    Output output;
    std::streambuf* const before = std::cout.rdbuf(&output);
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
    std::cout.flush();
    std::cout.rdbuf(before);
    if (output.error() == 0) return code;
    std::cerr << mName << ": standard output cannot be written: " << strerror(output.error())
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
