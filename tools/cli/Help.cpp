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

/** @return either the options or the other arguments. */
std::vector<Choice> titlesOf(const Command& command, bool isOptions) {
    std::vector<Choice> list;
    for (const Argument& each : command.arguments) {
        if (each.isOption() == isOptions) list.push_back({each.title, each.inHelp()});
    }
    return list;
}

/** @return a command as it stands in a call, without its options. */
std::string inCall(const Command& command) {
    std::vector<std::string> words = valuesOf(titlesOf(command, false));
    words.insert(words.begin(), command.name);
    return join(words, " ", " ");
}

}  // namespace

void Program::addHelp() {
    Command& first = command("Help", "help", "print the help of a command", mCommands[0].name);
    Argument* const topic = first.add("[COMMAND...]", kText, "a command, in one or two words");
    first.hasJson = false;
    first.run([this, topic] {
        std::vector<std::string> words = topic->given;
        words.emplace_back("--help");
        return obey(words);
    });
    Command& second =
            command("Help", "completion", "print the completion script of a shell", "bash");
    Argument* const shell =
            second.add("SHELL", {{"bash", ""}, {"zsh", ""}, {"fish", ""}}, "the shell");
    second.note("To load it: \"source <(" + mName +
                " completion bash)\", the same for zsh, and \"" + mName +
                " completion fish | source\".");
    second.hasJson = false;
    second.run([this, shell] {
        std::cout << std::regex_replace(kScripts[shell->number()], std::regex("NAME"), mName);
        return kSuccess;
    });
}

void Program::help(const std::string& name) {
    for (const Command* each : name.empty() ? std::vector{&mShared} : named(name))
        help(*each);
}

void Program::help(const Command& command) const {
    const bool isOfAll = &command == &mShared;
    const std::vector<Choice> options = titlesOf(command, true);
    std::string about = command.help + ".";
    about[0] = static_cast<char>(toupper(about[0]));
    std::cout << "Usage: " << mName << ' '
              << (isOfAll ? "[OPTION...] COMMAND [ARGUMENT...]"
                          : inCall(command) + (options.empty() ? "" : " [OPTION...]"))
              << '\n'
              << wrap(about, 0);
    if (isOfAll) printCommands();
    printList("Arguments", titlesOf(command, false));
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
            if (each.group == first.group) list.push_back({inCall(each), each.help});
        }
        printList(first.group, list);
    }
}

}  // namespace cli
