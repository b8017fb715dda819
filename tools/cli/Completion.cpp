// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "CompletionScripts.h"
#include "Text.h"

#include <iostream>

namespace cli {

void Program::addCompletion(const std::string& group) {
    Command& added = command(group, "completion", "print the completion script of a shell", "bash");
    const std::vector<Choice> shells = {
            {"bash", "load it with: source <(" + mName + " completion bash)"},
            {"zsh", "load it with: source <(" + mName + " completion zsh)"},
            {"fish", "load it with: " + mName + " completion fish | source"}};
    const auto shell = added.choice("SHELL", shells, "the shell");
    for (const Choice& each : shells)
        added.note(each.value + ": " + each.meaning);
    added.withoutJson().run([this, shell] {
        std::string script = kScripts[*shell];
        const std::string placeholder = "NAME";
        for (size_t at = 0; (at = script.find(placeholder, at)) != std::string::npos;)
            script.replace(at, placeholder.size(), mName);
        std::cout << script;
        return 0;
    });
}

std::vector<Choice> Program::answersFor(const Line& line, const std::string& word) const {
    if (!line.problem.empty()) return {};
    const Argument* next = line.taking;
    if (next == nullptr && !line.hasOptionsEnded && word[0] == '-') {
        std::vector<Choice> options;
        for (const Argument* each : optionsOf(line.command))
            options.push_back({each->name, each->help});
        return options;
    }
    if (next == nullptr && line.command == nullptr) return commandsAfter(line.typed);
    if (next == nullptr && line.typed == "help") {
        std::vector<std::string> typed;
        for (const auto& given : line.given)
            typed.push_back(given.second);
        return commandsAfter(join(typed, " ", " "));
    }
    if (next == nullptr) next = nextArgument(line);
    if (next == nullptr) return {};
    return next->isFile ? std::vector<Choice>{{":files", ""}} : next->choices;
}

void Program::complete(const std::vector<std::string>& words) const {
    const std::string& word = words.back();
    for (const Choice& each : answersFor(parse({words.begin(), words.end() - 1}), word)) {
        if (each.value[0] == ':') {
            std::cout << each.value << '\n';
        } else if (each.value.compare(0, word.size(), word) == 0) {
            std::cout << each.value << '\t' << each.meaning << '\n';
        }
    }
}

}  // namespace cli
