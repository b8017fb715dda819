// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "CompletionScripts.h"
#include "text/Text.h"

#include <cctype>
#include <iostream>
#include <regex>
#include <set>

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

/** @return either the options or the other arguments, as a help shows them. */
std::vector<Choice> titlesOf(const std::deque<Argument>& arguments, bool isOptions) {
    std::vector<Choice> list;
    for (const Argument& each : arguments) {
        if (each.isOption() == isOptions) list.push_back({each.title, each.help});
    }
    return list;
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
    Command& first = command("Help", "help", "print the help of a command", mCommands[0].name);
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
    const std::vector<Command*> commands = name.empty() ? std::vector{&mShared} : named(name);
    if (commands.empty()) {
        throw UsageError("no command " + inQuotes(name) +
                         suggestion(name, valuesOf(commandsAfter(""))));
    }
    for (const Command* each : commands)
        help(*each);
}

void Program::help(const Command& command) const {
    const bool isOfAll = &command == &mShared;
    const std::vector<Choice> options = titlesOf(command.arguments, true);
    std::string about = command.help + (isOfAll ? "" : ".");
    about[0] = static_cast<char>(toupper(about[0]));
    std::cout << "Usage: " << mName
              << (isOfAll ? " [OPTION...] COMMAND [ARGUMENT...]"
                          : " " + command.name + inCall(command.arguments) +
                                    (options.empty() ? "" : " [OPTION...]"))
              << '\n'
              << wrap(about, 0);
    if (isOfAll) printCommands();
    printList("Arguments", titlesOf(command.arguments, false));
    printList(isOfAll ? "Options of every command" : "Options", options);
    for (const std::string& note : command.notes)
        std::cout << '\n' << wrap(note, 0);
    if (isOfAll) return;
    std::cout << "\nExample: " << mName << ' ' << command.name
              << (command.example.empty() ? "" : " ") << command.example << '\n';
}

void Program::printCommands() const {
    std::set<std::string> printed;
    for (const Command& first : mCommands) {
        if (!printed.insert(first.group).second) continue;
        std::vector<Choice> list;
        for (const Command& each : mCommands) {
            if (each.group == first.group)
                list.push_back({each.name + inCall(each.arguments), each.help});
        }
        printList(first.group, list);
    }
}

}  // namespace cli
