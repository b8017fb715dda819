// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "TraceLine.h"
#include "service/Diagnosis.h"
#include "text/Text.h"

namespace vibratorctl {

namespace {

using nlohmann::ordered_json;

ordered_json asJson(const Diagnosis& found) {
    ordered_json json = {{"layout", found.layout}, {"answers", found.answers}};
    json.update(describe(found.server, found.route).members);
    json["nodes"] = ordered_json::array();
    for (const auto& [path, serves, now] : found.nodes) {
        json["nodes"].push_back({{"path", path},
                                 {"exists", now.exists},
                                 {"mode", now.mode},
                                 {"owner", now.owner},
                                 {"readable", now.reads},
                                 {"writable", now.writes},
                                 {"value", now.value},
                                 {"serves", serves}});
    }
    if (found.motor) {
        for (const auto& [name, has] : found.features)
            json["features"][name] = has;
        json["motor"] = asJson(*found.motor);
        json["ladders"] = {{"0", found.ladders[0]}, {"1", found.ladders[1]}};
    }
    json["findings"] = ordered_json::array();
    for (const auto& [problem, advice] : found.findings)
        json["findings"].push_back({{"problem", problem}, {"advice", advice}});
    json["notes"] = found.notes;
    return json;
}

/** @return a text in a column of a table. */
std::string cell(const std::string& text, size_t width) {
    if (text.size() > width) return text.substr(0, width - 3) + "... ";
    return text + std::string(width - text.size() + 1, ' ');
}

std::string nodeTable(const std::vector<NodeFinding>& nodes) {
    const size_t directory = nodes[0].path.rfind('/') + 1;
    std::string table = "\nNodes in " + nodes[0].path.substr(0, directory) +
                        "; the service may read and write as RW says\n" +
                        "NAME                  MODE OWNER    RW VALUE              FOR\n";
    for (const auto& [path, serves, now] : nodes) {
        table += cell(path.substr(directory), 21) + cell(now.mode, 4) + cell(now.owner, 8) +
                 (now.reads ? "r" : "-") + (now.writes ? "w " : "- ") +
                 cell(!now.exists         ? "missing"
                      : now.value.empty() ? ""
                                          : model::quote(now.value),
                      18) +
                 serves + "\n";
    }
    return table;
}

std::string inWords(const Diagnosis& found) {
    std::string words;
    const auto line = [&](const std::string& label, const std::string& text) {
        if (!text.empty()) words += cell(label + ":", 10) + cli::wrap(text, 11);
    };
    line("layout", found.layout);
    line("service", found.answers ? "answers" : "cannot be reached");
    const Served served = describe(found.server, found.route);
    if (found.answers) line("served by", served.server);
    line("transport", served.transport);
    line("manager", served.manager);
    if (found.motor) {
        line("motor", found.motor->inWords());
        line("ladder 0", ladderInWords(found.ladders[0]));
        line("ladder 1", ladderInWords(found.ladders[1]));
        std::vector<std::string> features;
        std::vector<std::string> missing;
        for (const auto& [name, has] : found.features)
            (has ? features : missing).push_back(name);
        line("features", features.empty() ? "none" : cli::join(features, ", ", ", "));
        line("missing", cli::join(missing, ", ", ", "));
    }
    if (!found.nodes.empty()) words += nodeTable(found.nodes);
    words += found.findings.empty() ? "\nnothing is wrong\n" : "\n";
    for (const auto& [problem, advice] : found.findings) {
        words += "! " + cli::wrap(cli::printable(problem) + ":", 2) + "  " +
                 cli::wrap(advice + ".", 2);
    }
    for (const auto& each : found.notes)
        words += "note: " + cli::wrap(each + ".", 6);
    return words;
}

}  // namespace

void addDoctor(Client& client) {
    client.command(kTools, "doctor", "say what is wrong with the driver or the service", "")
            .run([&client] {
                const Diagnosis found = diagnose(client.instance());
                return client.report().found(inWords(found), asJson(found), found.findings.empty());
            });
}

}  // namespace vibratorctl
