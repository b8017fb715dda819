// SPDX-License-Identifier: Apache-2.0
#include "Completion.h"

#include <CLI/CLI.hpp>

namespace {

/** What a shell needs to know of the commands. */
struct Cases {
    /** The paths of all commands, like "/prebaked/play", as a pattern of the shell. */
    std::string paths;
    /** A case for each path, that sets the candidates to the commands and options after it. */
    std::string candidates;
};

void add(const CLI::App& app, const std::string& path, Cases* cases) {
    if (!path.empty()) cases->paths += (cases->paths.empty() ? "" : "|") + path;
    std::string words;
    for (const CLI::App* command : app.get_subcommands(nullptr))
        words += command->get_name() + " ";
    for (const CLI::App* level = &app; level != nullptr; level = level->get_parent()) {
        for (const CLI::Option* option : level->get_options()) {
            for (const std::string& name : option->get_lnames()) {
                if (level == &app || name != "help") words += "--" + name + " ";
            }
        }
    }
    words.pop_back();
    cases->candidates += "        \"" + path + "\") candidates=\"" + words + "\" ;;\n";
    for (const CLI::App* command : app.get_subcommands(nullptr))
        add(*command, path + "/" + command->get_name(), cases);
}

}  // namespace

std::string completionScript(const CLI::App& app, const std::string& program,
                             const std::string& shell) {
    Cases cases;
    add(app, "", &cases);
    const bool isBash = shell == "bash";
    const std::string typed =
            isBash ? "\"${COMP_WORDS[@]:1:COMP_CWORD-1}\"" : "\"${(@)words[2,CURRENT-1]}\"";
    const std::string body = "    local command= candidates= word\n    for word in " + typed +
                             "; do\n        case \"$command/$word\" in\n            " +
                             cases.paths +
                             ") command=\"$command/$word\" ;;\n        esac\n    done\n"
                             "    case \"$command\" in\n" +
                             cases.candidates + "    esac\n";
    if (!isBash)
        return "#compdef " + program + "\n" + body + "    compadd -- ${=candidates}\n    _files\n";
    return "_" + program + "() {\n" + body +
           "    COMPREPLY=($(compgen -W \"$candidates\" -- \"${COMP_WORDS[COMP_CWORD]}\"))\n}\n"
           "complete -o default -F _" +
           program + " " + program + "\n";
}
