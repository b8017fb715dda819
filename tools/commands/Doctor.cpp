// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Ladder.h"
#include "LocalDriver.h"
#include "NodePathTable.h"
#include "Trace.h"
#include "cli/Text.h"

#include <unistd.h>

#include <cstdio>
#include <map>

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using nlohmann::ordered_json;

/** A node, and what the service does with it. */
struct NodeUse {
    std::string path;
    const char* serves;
    bool isOnlyRead = false;
};

class Examination {
  public:
    /** @param whyNot why the service cannot be reached; empty where it answers. */
    Examination(const ::android::sp<service::IDaxVibrator>& vibrator, const std::string& whyNot)
        : mAnswers(whyNot.empty()), mService(service::describe(vibrator)) {
        mReport = {{"layout", mDriver.layout()},  {"service", mAnswers ? "answers" : whyNot},
                   {"server", mService.server},   {"transport", mService.transport},
                   {"manager", mService.manager}, {"nodes", ordered_json::array()}};
        if (!mAnswers) {
            find("the service cannot be reached: " + whyNot,
                 "start the daemon, or give the client the daemon's HWBINDER_DIR");
        }
        examineLayout();
        if (mDriver.isThere()) {
            examineNodes();
            examineState();
        }
        if (mDriver.isUsable() && mayCallRestricted()) examineMotor();
        if (!mayCallRestricted()) {
            note("uid " + std::to_string(getuid()) +
                 " may not set amplitudes, nor use what is for root and uid 1000 (system)");
        }
        mReport["findings"] = mFindings;
        mReport["notes"] = mNotes;
    }

    bool isHealthy() const { return mFindings.empty(); }
    const ordered_json& asJson() const { return mReport; }
    std::string inWords() const;

  private:
    void find(const std::string& problem, const std::string& advice) {
        mFindings.push_back({{"problem", problem}, {"advice", advice}});
    }
    void note(const std::string& text) { mNotes.push_back(text); }

    void examineLayout();
    void explainMissingLayout();
    void examineNodes();
    void examineMotor();
    void examineState();
    std::string nodeTable() const;
    static std::string cell(const std::string& text, size_t width);

    bool mAnswers;
    service::Description mService;
    LocalDriver mDriver;
    std::map<std::string, LocalDriver::Node> mNodes;
    ordered_json mReport;
    ordered_json mFindings = ordered_json::array();
    ordered_json mNotes = ordered_json::array();
};

void Examination::examineLayout() {
    if (!mDriver.isUsable()) {
        explainMissingLayout();
    } else if (DriverMode == kTimedOutputMode && mDriver.look(THE_DEVICE_ACTIVATE).exists) {
        find("the kernel has both layouts, and the service takes the timed output",
             "remove the driver that is not the motor's from the kernel");
    }
}

void Examination::explainMissingLayout() {
    const std::string led = THE_DEVICE_ACTIVATE.substr(0, THE_DEVICE_ACTIVATE.rfind('/'));
    for (const std::string* path :
         {&THE_DEVICE_ENABLE, &THE_DEVICE_ACTIVATE, &THE_DEVICE_DURATION, &THE_DEVICE_STATE}) {
        const LocalDriver::Node node = mDriver.look(*path);
        if (!node.exists || (node.reads && node.writes)) continue;
        const std::string user = "uid " + std::to_string(getuid());
        // What is closed to root is closed to the service, too.
        if (mAnswers && getuid() != 0) {
            note(user + " cannot open the nodes; root can, and sees more here");
        } else {
            find(*path + " cannot be opened for reading and writing by " + user,
                 "give the node to the service's user, as the init declaration in device/ does");
        }
        return;
    }
    if (mDriver.look(led + "/trigger").exists) {
        find(led + " has no transient trigger",
             "load ledtrig-transient, and write \"transient\" to " + led + "/trigger");
    } else {
        find("the kernel offers no vibrator driver in /sys/class",
             "build the motor's driver in, or load it; docs/device.md tells how for a GPIO");
    }
}

void Examination::examineNodes() {
    std::vector<NodeUse> uses = {{THE_DEVICE_ENABLE, "on, off, is it running"}};
    if (DriverMode == kLedTriggerMode) {
        uses = {{THE_DEVICE_ACTIVATE, "on, off"},
                {THE_DEVICE_DURATION, "on, is it running"},
                {THE_DEVICE_STATE, "on"}};
    }
    uses.insert(uses.end(), {{THE_DEVICE_INTENSITY, "amplitudes, patterns"},
                             {THE_DEVICE_FORCE_TOUCH_INTENSITY, "force-touch"},
                             {THE_DEVICE_MULTI_FREQ, "frequency types"},
                             {THE_DEVICE_HAPTIC_ENGINE, "engine packets"},
                             {THE_DEVICE_HAPTIC_ENGINE_INDEX, "stored patterns"},
                             {THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, "repeated patterns"},
                             {THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, "number of patterns", true},
                             {THE_DEVICE_MOTOR_TYPE, "name of the motor"},
                             {THE_DEVICE_EVENT_CMD, "fold state"},
                             {THE_DEVICE_PATTERN_LENGTH, "only logged", true},
                             {THE_DEVICE_EXT_CONTROL, "external control"}});
    for (const NodeUse& use : uses) {
        const LocalDriver::Node node = mNodes[use.path] = mDriver.look(use.path);
        mReport["nodes"].push_back({{"path", use.path},
                                    {"exists", node.exists},
                                    {"mode", node.mode},
                                    {"owner", node.owner},
                                    {"readable", node.reads},
                                    {"writable", node.writes},
                                    {"value", node.value},
                                    {"serves", use.serves}});
        const bool suffices = node.reads && (use.isOnlyRead || node.writes);
        if (node.exists && !suffices && mDriver.isUsable()) {
            find(use.path + " is there, but uid " + std::to_string(getuid()) + " cannot " +
                         (node.reads ? "write" : "read") + " it",
                 "give the node to the service's user, or give it a mode of 0644");
        }
    }
}

void Examination::examineMotor() {
    const auto& vibrator = mDriver.vibrator();
    mReport["features"] = {{"amplitude", bool{vibrator->daxSupportsAmplitudeControl()}},
                           {"force-touch", bool{vibrator->daxSupportsForceTouchAmplitudeControl()}},
                           {"frequency", bool{vibrator->daxSupportsFrequencyControl()}},
                           {"haptic-engine", bool{vibrator->daxSupportsHapticEngine()}},
                           {"prebaked", bool{vibrator->daxSupportsPrebakedHapticPattern()}},
                           {"fold", bool{vibrator->daxSupportsFolderStatusSetting()}},
                           {"external-control", bool{vibrator->supportsExternalControl()}}};
    const LocalDriver::Motor motor = mDriver.motor();
    mReport["motor"] = {{"name", motor.name}, {"number", motor.number}, {"found", motor.found}};
    for (const uint32_t type : {0U, 1U})
        mReport["ladders"][std::to_string(type)] = askLadder(vibrator, type);

    std::string name = mNodes[THE_DEVICE_MOTOR_TYPE].value;
    if (!name.empty() && name.back() == '\n') name.pop_back();
    if (mNodes[THE_DEVICE_MOTOR_TYPE].reads && name != motor.name) {
        find("the driver's name for the motor, \"" + name + "\", is not a known one",
             "have the driver show one of the known names in " + THE_DEVICE_MOTOR_TYPE);
    }
}

void Examination::examineState() {
    if (mNodes[THE_DEVICE_EXT_CONTROL].value == "1\n") {
        find("external control is on, so the motor may not follow the service",
             "switch it off with \"vibratorctl external off\"");
    }
    if (mDriver.isVibrating() && mNodes[THE_DEVICE_EXT_CONTROL].exists) {
        note("the motor counts as running, so external control is refused; " +
             std::string(DriverMode == kLedTriggerMode
                                 ? "the trigger keeps its last duration until \"vibratorctl on 0\""
                                 : "\"vibratorctl off\" stops it"));
    }
}

std::string Examination::cell(const std::string& text, size_t width) {
    if (text.size() > width) return text.substr(0, width - 3) + "... ";
    return text + std::string(width - text.size() + 1, ' ');
}

std::string Examination::nodeTable() const {
    const std::string directory = mDriver.directory();
    std::string table = "\nNodes in " + directory + "\n" +
                        "NAME                  MODE OWNER    RW VALUE              FOR\n";
    for (const auto& node : mReport["nodes"]) {
        const bool exists = node["exists"];
        const std::string value = simulator::quote(node["value"].get<std::string>());
        table += cell(node["path"].get<std::string>().substr(directory.size()), 21) +
                 cell(node["mode"], 4) + cell(node["owner"], 8) + (node["readable"] ? "r" : "-") +
                 (node["writable"] ? "w " : "- ") +
                 cell(!exists            ? "missing"
                      : node["readable"] ? value
                                         : "",
                      18) +
                 node["serves"].get<std::string>() + "\n";
    }
    return table;
}

std::string Examination::inWords() const {
    std::string words = "layout:    " + mReport["layout"].get<std::string>() + "\n";
    words += std::string("service:   ") + (mAnswers ? "answers\n" : "cannot be reached\n");
    if (mAnswers) words += "served by: " + cli::wrap(mService.server, 11);
    words += "transport: " + cli::wrap(mService.transport, 11);
    words += "manager:   " + cli::wrap(mService.manager, 11);
    if (mReport.contains("motor")) {
        const auto& motor = mReport["motor"];
        words += "motor:     " + motor["name"].get<std::string>() + ", number " +
                 motor["number"].dump() + ", found " + motor["found"].get<std::string>() + "\n";
        for (const auto& [type, ladder] : mReport["ladders"].items())
            words += "ladder " + type + ":  " + ladderInWords(ladder) + "\n";
        std::string features;
        std::string missing;
        for (const auto& [name, has] : mReport["features"].items()) {
            std::string& list = has.get<bool>() ? features : missing;
            list += (list.empty() ? "" : ", ") + name;
        }
        words += "features:  " + cli::wrap(features.empty() ? "none" : features, 11);
        if (!missing.empty()) words += "missing:   " + cli::wrap(missing, 11);
    }
    if (mDriver.isThere()) words += nodeTable();
    words += "\n";
    if (mFindings.empty()) words += "nothing is wrong\n";
    for (const auto& finding : mFindings) {
        words += "! " + cli::wrap(cli::printable(finding["problem"].get<std::string>()) + ";", 2) +
                 "  " + cli::wrap(finding["advice"].get<std::string>() + ".", 2);
    }
    for (const auto& each : mNotes)
        words += "note: " + cli::wrap(each.get<std::string>() + ".", 6);
    return words;
}

}  // namespace

void addDoctor(Client& client) {
    cli::Command& command = client.program().command(
            kTools, "doctor", "say what is wrong with the driver or the service", "");
    command.run([&client] {
        std::string whyNot;
        const auto vibrator = service::connect(client.instance(), &whyNot);
        const Examination examination(vibrator, whyNot);
        return client.report().found("doctor", examination.inWords(), examination.asJson(),
                                     examination.isHealthy());
    });
}
