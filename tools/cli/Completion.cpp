// SPDX-License-Identifier: Apache-2.0
#include "CommandLine.h"
#include "Text.h"

#include <CLI/App.hpp>

#include <iostream>

namespace cli {
namespace {

/** Asks the program what may follow; each answer is a word, a tabulator and what it means. */
constexpr const char* kScripts[] = {
        // bash shows the meanings while there is a choice.
        R"(_NAME() {
    local answers word meaning
    answers=$("$1" --complete "${COMP_WORDS[@]:1:COMP_CWORD}" 2>/dev/null)
    COMPREPLY=()
    [ "$answers" != :files ] || { compopt -o default; return 0; }
    while IFS=$'\t' read -r word meaning; do
        [ -z "$word" ] || COMPREPLY+=("$word${meaning:+  ($meaning)}")
    done <<<"$answers"
    [ ${#COMPREPLY[@]} -ne 1 ] || COMPREPLY=("${COMPREPLY[0]%%  (*}")
}
complete -F _NAME NAME
)",
        R"(#compdef NAME
_NAME() {
    local answers line
    local -a described
    answers=$("$words[1]" --complete "${(@)words[2,CURRENT]}" 2>/dev/null)
    [[ $answers != :files ]] || { _files; return; }
    for line in ${(f)answers}; do
        described+=("${${line%%$'\t'*}//:/\\:}:${line#*$'\t'}")
    done
    _describe 'NAME' described
}
if [[ $funcstack[1] == _NAME ]]; then _NAME "$@"; else compdef _NAME NAME; fi
)",
        R"(function __NAME_complete
    set -l typed (commandline -opc)
    set -l answers ($typed[1] --complete $typed[2..-1] (commandline -ct) 2>/dev/null)
    if test "$answers" = :files
        __fish_complete_path (commandline -ct)
    else
        string join \n -- $answers
    end
end
complete -c NAME -f -a '(__NAME_complete)'
)",
};

}  // namespace

void Program::addCompletion(const std::string& group) {
    Command& added = command(group, "completion", "print the completion script of a shell", "bash");
    const std::vector<Choice> shells = {
            {"bash", "load it with: source <(" + mApp->get_name() + " completion bash)"},
            {"zsh", "load it with: source <(" + mApp->get_name() + " completion zsh)"},
            {"fish", "load it with: " + mApp->get_name() + " completion fish | source"}};
    const auto shell = added.choice("SHELL", shells, "the shell");
    for (const Choice& each : shells)
        added.note(each.value + ": " + each.meaning);
    added.withoutJson().run([this, shell] {
        std::string script = kScripts[*shell];
        const std::string placeholder = "NAME";
        for (size_t at = 0; (at = script.find(placeholder, at)) != std::string::npos;)
            script.replace(at, placeholder.size(), mApp->get_name());
        std::cout << script;
        return 0;
    });
}

const Argument* Program::findOption(const Command* command, const std::string& name) const {
    // The command's own go first: effect has a --version of its own.
    for (const Command* each : {command, &mRoot}) {
        if (each == nullptr) continue;
        for (const Argument& argument : each->mArguments) {
            if (argument.isOption() && argument.name == name) return &argument;
        }
    }
    return nullptr;
}

std::vector<Choice> Program::optionsOf(const Command* command) const {
    std::vector<Choice> options;
    for (const Command* each : {command, &mRoot}) {
        if (each == nullptr) continue;
        for (const Argument& argument : each->mArguments) {
            if (argument.isOption()) options.push_back({argument.name, argument.help});
        }
    }
    return options;
}

const Argument* Program::plainArgument(const Command& command, size_t position) {
    for (const Argument& argument : command.mArguments) {
        if (argument.isOption()) continue;
        if (argument.isMany || position-- == 0) return &argument;
    }
    return nullptr;
}

std::vector<Choice> Program::answersFor(const std::vector<std::string>& words) const {
    const std::string typed = words.empty() ? "" : words.back();
    const Command* command = nullptr;
    // The option that the last word is the value of, or the argument in whose place it stands.
    const Argument* awaiting = nullptr;
    std::vector<std::string> plain;
    std::string name;
    for (size_t i = 0; i + 1 < words.size(); ++i) {
        if (awaiting != nullptr) {
            awaiting = nullptr;
        } else if (words[i].size() > 1 && words[i][0] == '-') {
            awaiting = findOption(command, words[i]);
            if (awaiting != nullptr && awaiting->placeholder.empty()) awaiting = nullptr;
        } else if (command == nullptr) {
            name += (name.empty() ? "" : " ") + words[i];
            command = find(name);
        } else {
            plain.push_back(words[i]);
        }
    }
    if (awaiting == nullptr && !typed.empty() && typed[0] == '-') return optionsOf(command);
    if (awaiting == nullptr && command == nullptr) return commandsAfter(name);
    if (awaiting == nullptr && name == "help") return commandsAfter(join(plain, " ", " "));
    if (awaiting == nullptr) awaiting = plainArgument(*command, plain.size());
    if (awaiting == nullptr) return {};
    return awaiting->isFile ? std::vector<Choice>{{":files", ""}} : awaiting->choices;
}

void Program::complete(const std::vector<std::string>& words) const {
    for (const Choice& each : answersFor(words)) {
        if (each.value[0] == ':') {
            std::cout << each.value << '\n';
        } else if (each.value.compare(0, words.back().size(), words.back()) == 0) {
            std::cout << each.value << '\t' << each.meaning << '\n';
        }
    }
}

}  // namespace cli
