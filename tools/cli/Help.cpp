// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "CompletionScripts.h"
#include "text/Text.h"

#include <algorithm>
#include <cctype>
#include <iostream>
#include <regex>

namespace cli {
namespace {

/** Prints names, and beside or below each what it means. */
void printList(const std::string& heading, const std::vector<Choice>& list) {
    constexpr size_t kColumn = 26;
    if (!list.empty()) std::cout << '\n' << heading << ":\n";
    for (const Choice& each : list) {
        std::string start = "  " + each.value;
        if (start.size() + 2 > kColumn) {
            std::cout << start << '\n';
            start.clear();
        }
        start.resize(kColumn, ' ');
        std::cout << start << wrap(each.meaning, kColumn);
    }
}

/** Prints either the options or the other arguments. */
void printList(const std::string& heading, const std::deque<Argument>& arguments, bool isOptions) {
    std::vector<Choice> list;
    for (const Argument& each : arguments) {
        if (each.isOption() == isOptions) list.push_back({each.title, each.help});
    }
    printList(heading, list);
}

/** @return the arguments as they stand in a call, without the options: " PATTERN [FILE...]". */
std::string inCall(const std::deque<Argument>& arguments) {
    std::string words;
    for (const Argument& each : arguments) {
        if (each.isOption()) continue;
        const std::string name = each.name + (each.isMany ? "..." : "");
        words += each.isRequired ? " " + name : " [" + name + "]";
    }
    return words;
}

}  // namespace

void Program::addHelp() {
    Command& first = command("Help", "help", "print the help of a command", mCommands[0].mName);
    mTopic = first.words("COMMAND", "a command, in one or two words");
    first.withoutJson().run([this] {
        help(join(*mTopic, " ", " "));
        return kSuccess;
    });
    Command& second =
            command("Help", "completion", "print the completion script of a shell", "bash");
    const auto shell =
            second.choice("SHELL", {{"bash", ""}, {"zsh", ""}, {"fish", ""}}, "the shell");
    second.note("To load it: \"source <(" + mName +
                " completion bash)\", the same for zsh, and \"" + mName +
                " completion fish | source\".");
    second.withoutJson().run([this, shell] {
        std::cout << std::regex_replace(kScripts[*shell], std::regex("NAME"), mName);
        return kSuccess;
    });
}

void Program::help(const std::string& name) {
    if (name.empty()) return help();
    const std::vector<Command*> commands = named(name);
    for (const Command* each : commands)
        help(*each);
    if (!commands.empty()) return;
    throw UsageError("no command " + inQuotes(name) +
                     suggestion(name, valuesOf(commandsAfter(""))));
}

void Program::help() const {
    std::cout << "Usage: " << mName << " [OPTION...] COMMAND [ARGUMENT...]\n"
              << wrap(mShared.mHelp, 0);
    std::vector<std::pair<std::string, std::vector<Choice>>> groups;
    for (const Command& each : mCommands) {
        const auto isItsGroup = [&](const auto& group) { return group.first == each.mGroup; };
        auto group = std::find_if(groups.begin(), groups.end(), isItsGroup);
        if (group == groups.end()) group = groups.insert(group, {each.mGroup, {}});
        group->second.push_back({each.mName + inCall(each.mArguments), each.mHelp});
    }
    for (const auto& [name, commands] : groups)
        printList(name, commands);
    printList("Options of every command", mShared.mArguments, true);
    for (const std::string& note : mShared.mNotes)
        std::cout << '\n' << wrap(note, 0);
}

void Program::help(const Command& command) const {
    const auto& arguments = command.mArguments;
    const bool hasOptions = std::any_of(arguments.begin(), arguments.end(),
                                        [](const Argument& each) { return each.isOption(); });
    std::string sentence = command.mHelp + ".";
    sentence[0] = static_cast<char>(toupper(sentence[0]));
    std::cout << "Usage: " << mName << ' ' << command.mName << inCall(arguments)
              << (hasOptions ? " [OPTION...]" : "") << '\n'
              << wrap(sentence, 0);
    printList("Arguments", arguments, false);
    printList("Options", arguments, true);
    for (const std::string& note : command.mNotes)
        std::cout << '\n' << wrap(note, 0);
    std::cout << "\nExample: " << mName << ' ' << command.mName
              << (command.mExample.empty() ? "" : " ") << command.mExample << '\n';
}

}  // namespace cli
