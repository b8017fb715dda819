// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"

#include "text/Output.h"
#include "text/Text.h"

#include <algorithm>
#include <cstring>
#include <iostream>

namespace cli {

namespace {

/** @return what a help says of an argument's values, where it says anything. */
std::string inBrackets(const std::string& range, const std::string& initial) {
    if (range.empty() && initial.empty()) return "";
    const std::string between = range.empty() || initial.empty() ? "" : "; ";
    return " (" + range + between + (initial.empty() ? "" : "default: " + initial) + ")";
}

[[noreturn]] void refuse(const std::string& word, const std::string& wanted) {
    throw UsageError(inQuotes(word) + " is not " + wanted);
}

}  // namespace

std::vector<std::string> valuesOf(const std::vector<Choice>& choices) {
    std::vector<std::string> values;
    values.reserve(choices.size());
    for (const Choice& choice : choices)
        values.push_back(choice.value);
    return values;
}

template <typename T, typename Read>
Value<T> Command::add(const std::string& title, const std::string& about,
                      const std::optional<T>& initial, const Read& read) {
    const T first = initial.value_or(T());
    auto value = std::make_shared<T>(first);
    Argument& argument = arguments.emplace_back();
    argument.title = title;
    // In "-o, --output FILE" the name stands in the middle.
    const size_t start = title[0] == '-' ? title.find("--") : 0;
    const size_t blank = title.find(' ', start);
    argument.name = title.substr(start, blank - start);
    argument.letter = title.substr(0, start > 0 ? 2 : 0);
    argument.isFlag = argument.isOption() && blank == std::string::npos;
    argument.help = about;
    argument.isRequired = !initial && !argument.isOption();
    argument.reset = [=] { *value = first; };
    argument.read = [=](const std::string& word) { read(*value, word); };
    return value;
}

Value<uint32_t> Command::number(const std::string& title, const Numbers& numbers,
                                const std::string& about, std::optional<uint32_t> initial) {
    const std::string shown = initial ? std::to_string(*initial) : "";
    return add(title, about + inBrackets(numbers.range(), shown), numbers.parse(shown),
               [numbers](uint32_t& value, const std::string& word) {
                   const auto number = numbers.parse(word);
                   if (!number) refuse(word, numbers.what + inBrackets(numbers.range(), ""));
                   value = *number;
               });
}

Value<size_t> Command::choice(const std::string& title, const std::vector<Choice>& choices,
                              const std::string& about, std::optional<size_t> initial) {
    const std::vector<std::string> values = valuesOf(choices);
    const std::string range = join(values, ", ", " or ");
    auto value = add(title, about + inBrackets(range, initial ? values[*initial] : ""), initial,
                     [values, range](size_t& index, const std::string& word) {
                         const auto found = std::find(values.begin(), values.end(), word);
                         if (found == values.end()) refuse(word, range + suggestion(word, values));
                         index = static_cast<size_t>(found - values.begin());
                     });
    arguments.back().choices = choices;
    return value;
}

Value<std::string> Command::text(const std::string& title, const std::string& about,
                                 const std::optional<std::string>& initial,
                                 std::vector<Choice> offered) {
    auto value = add(title, about + inBrackets("", initial.value_or("")), initial,
                     [](std::string& text, const std::string& word) { text = word; });
    arguments.back().choices = std::move(offered);
    return value;
}

Value<std::vector<std::string>> Command::words(const std::string& title, const std::string& about,
                                               std::function<void(const std::string&)> check) {
    auto value = add(title, about, std::optional(std::vector<std::string>()),
                     [check](std::vector<std::string>& words, const std::string& word) {
                         if (check) check(word);
                         words.push_back(word);
                     });
    arguments.back().isMany = true;
    return value;
}

Value<bool> Command::flag(const std::string& title, const std::string& about) {
    return add(title, about, std::optional(false),
               [](bool& value, const std::string& /* word */) { value = true; });
}

Program::Program(std::string name, std::string version, const std::string& about)
    : mName(std::move(name)), mVersion(std::move(version)) {
    mShared.help = about;
    mWantsHelp = mShared.flag("-h, --help", "print the help of the command, or this one");
    mWantsVersion = mShared.flag("--version", "print the version");
}

std::vector<Command*> Program::named(const std::string& name) {
    std::vector<Command*> found;
    for (Command& each : mCommands) {
        if ((each.name + " ").compare(0, name.size() + 1, name + " ") == 0) found.push_back(&each);
    }
    return found;
}

std::vector<Choice> Program::commandsAfter(const std::string& typed) const {
    std::vector<Choice> words;
    const std::string start = typed.empty() ? "" : typed + " ";
    for (const Command& each : mCommands) {
        if (each.name.compare(0, start.size(), start) != 0) continue;
        const std::string word = each.name.substr(start.size());
        const std::string group = word.substr(0, word.find(' '));
        if (group == word) {
            words.push_back({word, each.help});
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
