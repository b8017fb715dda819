// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "Text.h"

#include <algorithm>
#include <cctype>
#include <iostream>

#include <CLI/App.hpp>

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

std::string shown(const Argument& argument) {
    if (argument.isOption()) {
        return argument.names + (argument.placeholder.empty() ? "" : " " + argument.placeholder);
    }
    const std::string name = argument.name + (argument.isMany ? "..." : "");
    return argument.isRequired ? name : "[" + name + "]";
}

void printOptions(const std::string& heading, const std::deque<Argument>& arguments) {
    bool any = false;
    for (const Argument& each : arguments) {
        if (!each.isOption()) continue;
        if (!any) std::cout << '\n' << heading << ":\n";
        any = true;
        printEntry(shown(each), each.help);
    }
}

std::string sentence(std::string text) {
    text[0] = static_cast<char>(std::toupper(static_cast<unsigned char>(text[0])));
    return text + ".";
}

/** @return a command's name and its arguments, without the options. */
std::string call(const std::string& name, const std::deque<Argument>& arguments) {
    std::string words = name;
    for (const Argument& each : arguments) {
        if (!each.isOption()) words += " " + shown(each);
    }
    return words;
}

}  // namespace

void Program::help(const std::string& name) const {
    const Command* command = find(name);
    if (command != nullptr) {
        helpCommand(*command);
    } else if (name.empty()) {
        helpProgram();
    } else {
        const std::vector<Choice> commands = commandsAfter(name);
        if (commands.empty()) {
            throw UsageError("no command " + inQuotes(name) +
                             suggestion(name, valuesOf(commandsAfter(""))));
        }
        for (const Choice& each : commands)
            helpCommand(*find(name + " " + each.value));
    }
}

void Program::helpProgram() const {
    std::cout << "Usage: " << mApp->get_name() << " [OPTION...] COMMAND [ARGUMENT...]\n"
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
            if (each.mGroup == group) printEntry(call(each.mName, each.mArguments), each.mHelp);
        }
    }
    printOptions("Options of every command", mRoot.mArguments);
    for (const std::string& note : mRoot.mNotes)
        std::cout << '\n' << wrap(note, 0);
}

void Program::helpCommand(const Command& command) const {
    const auto& arguments = command.mArguments;
    const bool hasOptions = std::any_of(arguments.begin(), arguments.end(),
                                        [](const Argument& each) { return each.isOption(); });
    std::cout << "Usage: " << mApp->get_name() << ' ' << call(command.mName, arguments)
              << (hasOptions ? " [OPTION...]" : "") << '\n'
              << wrap(sentence(command.mHelp), 0);
    bool any = false;
    for (const Argument& each : arguments) {
        if (each.isOption()) continue;
        if (!any) std::cout << "\nArguments:\n";
        any = true;
        printEntry(each.name, each.help);
    }
    printOptions("Options", arguments);
    for (const std::string& note : command.mNotes)
        std::cout << '\n' << wrap(note, 0);
    std::cout << "\nExample: " << mApp->get_name() << ' ' << command.mName
              << (command.mExample.empty() ? "" : " ") << command.mExample << '\n';
}

}  // namespace cli
