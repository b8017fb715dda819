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

std::string Argument::range() const {
    if (kind == kNumber) return numbers.range();
    return kind == kChoice ? join(valuesOf(choices), ", ", " or ") : "";
}

std::string Argument::inHelp() const {
    std::vector<std::string> facts;
    if (!range().empty()) facts.push_back(range());
    if (!initial.empty()) facts.push_back("default: " + initial);
    return about + (facts.empty() ? "" : " (" + join(facts, "; ", "; ") + ")");
}

void Argument::take(const std::string& word) {
    if (!range().empty()) parse(word);
    if (check) check(word);
    given.push_back(word);
}

uint32_t Argument::parse(const std::string& word) const {
    std::string wanted = range();
    if (kind == kNumber) {
        if (const auto number = numbers.parse(word)) return *number;
        wanted = std::string(numbers.what) + " (" + wanted + ")";
    } else {
        const std::vector<std::string> values = valuesOf(choices);
        const auto found = std::find(values.begin(), values.end(), word);
        if (found != values.end()) return static_cast<uint32_t>(found - values.begin());
        wanted += suggestion(word, values);
    }
    throw UsageError((isOption() ? name + ": " : "") + inQuotes(word) + " is not " + wanted);
}

Argument* Command::add(const std::string& title, Kind kind, const std::string& about,
                       const std::string& initial) {
    arguments.push_back({title, kind, about, initial});
    Argument& argument = arguments.back();
    // In "-o, --output FILE" and "[FILE...]" the name stands in the middle.
    const size_t start = argument.isOption() ? title.find("--") : title.find_first_not_of('[');
    argument.name = title.substr(start, title.find_first_of(" .]", start) - start);
    if (argument.isOption() && start > 0) argument.letter = title.substr(0, 2);
    return &argument;
}

Argument* Command::add(const std::string& title, const Numbers& numbers, const std::string& about,
                       const std::string& initial) {
    add(title, kNumber, about, initial)->numbers = numbers;
    return &arguments.back();
}

Argument* Command::add(const std::string& title, const std::vector<Choice>& choices,
                       const std::string& about, const std::string& initial, Kind kind) {
    add(title, kind, about, initial)->choices = choices;
    return &arguments.back();
}

Program::Program(std::string name, std::string version, const std::string& about)
    : mName(std::move(name)), mVersion(std::move(version)) {
    mShared.help = about;
    mWantsHelp = mShared.add("-h, --help", kFlag, "print the help of the command, or this one");
    mWantsVersion = mShared.add("--version", kFlag, "print the version");
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
    const Output output;
    int code = kFailed;
    addHelp();
    try {
        const std::vector<std::string> words(argv + std::min(argc, 1), argv + argc);
        code = words.size() > 1 && words[0] == "--complete" ? complete(words) : obey(words);
    } catch (const UsageError& error) {
        complain("USAGE", error.what());
        code = kUsage;
    } catch (const std::exception& error) {
        complain("FAILED", error.what());
    }
    std::cout.flush();
    if (output.error() == 0) return code;
    Program::warn(std::string("standard output cannot be written: ") + strerror(output.error()));
    return kFailed;
}

void Program::warn(const std::string& text) const {
    std::cerr << mName << ": " << printable(text) << '\n';
}

void Program::complain(const std::string& /* status */, const std::string& reason) const {
    warn((mCurrent.empty() ? "" : mCurrent + ": ") + reason);
}

}  // namespace cli
