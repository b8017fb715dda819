// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "Text.h"

#include <algorithm>
#include <cctype>
#include <iostream>

namespace cli {
namespace {

/** A line of a list: a name, and beside or below it what it means. */
void printEntry(const std::string& name, const std::string& meaning) {
    constexpr size_t kColumn = 26;
    const std::string start = "  " + name;
    const bool fits = start.size() + 2 <= kColumn;
    std::cout << start << (fits ? "" : "\n")
              << std::string(fits ? kColumn - start.size() : kColumn, ' ')
              << wrap(meaning, kColumn);
}

/** @return the arguments as they stand in a call, without the options: " PATTERN [FILE...]". */
std::string inCall(const std::deque<Argument>& arguments) {
    std::string words;
    for (const Argument& each : arguments) {
        if (each.isOption()) continue;
        const std::string name = each.name + (each.isMany ? "..." : "");
        words += " " + (each.isRequired ? name : "[" + name + "]");
    }
    return words;
}

/** Prints either the options or the other arguments. */
void printList(const std::string& heading, const std::deque<Argument>& arguments, bool options) {
    bool any = false;
    for (const Argument& each : arguments) {
        if (each.isOption() != options) continue;
        if (!any) std::cout << '\n' << heading << ":\n";
        any = true;
        printEntry((each.letter.empty() ? "" : each.letter + ", ") + each.name +
                           (each.placeholder.empty() ? "" : " " + each.placeholder),
                   each.help);
    }
}

void printNotes(const std::vector<std::string>& notes) {
    for (const std::string& note : notes)
        std::cout << '\n' << wrap(note, 0);
}

std::string sentence(std::string text) {
    text[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(text[0])));
    return text + ".";
}

}  // namespace

void Program::help(const std::string& name) const {
    if (name.empty()) return helpProgram();
    if (const Command* command = find(name)) return helpCommand(*command);
    const std::vector<Choice> commands = commandsAfter(name);
    if (commands.empty()) {
        throw UsageError("no command " + inQuotes(name) +
                         suggestion(name, valuesOf(commandsAfter(""))));
    }
    for (const Choice& each : commands)
        helpCommand(*find(name + " " + each.value));
}

void Program::helpProgram() const {
    std::cout << "Usage: " << mName << " [OPTION...] COMMAND [ARGUMENT...]\n"
              << wrap(mRoot.mHelp, 0);
    std::vector<std::string> groups;
    for (const Command& each : mCommands) {
        if (std::find(groups.begin(), groups.end(), each.mGroup) == groups.end()) {
            groups.push_back(each.mGroup);
        }
    }
    // The help command is the first one, and stands last.
    std::rotate(groups.begin(), groups.begin() + 1, groups.end());
    for (const std::string& group : groups) {
        std::cout << '\n' << group << ":\n";
        for (const Command& each : mCommands) {
            if (each.mGroup == group) printEntry(each.mName + inCall(each.mArguments), each.mHelp);
        }
    }
    printList("Options of every command", mRoot.mArguments, true);
    printNotes(mRoot.mNotes);
}

void Program::helpCommand(const Command& command) const {
    const auto& arguments = command.mArguments;
    const bool hasOptions = std::any_of(arguments.begin(), arguments.end(),
                                        [](const Argument& each) { return each.isOption(); });
    std::cout << "Usage: " << mName << ' ' << command.mName << inCall(arguments)
              << (hasOptions ? " [OPTION...]" : "") << '\n'
              << wrap(sentence(command.mHelp), 0);
    printList("Arguments", arguments, false);
    printList("Options", arguments, true);
    printNotes(command.mNotes);
    std::cout << "\nExample: " << mName << ' ' << command.mName
              << (command.mExample.empty() ? "" : " ") << command.mExample << '\n';
}

}  // namespace cli
