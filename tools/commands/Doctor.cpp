// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "NodePathTable.h"
#include "Queries.h"
#include "TraceLine.h"
#include "service/LocalDriver.h"
#include "text/Text.h"

#include <unistd.h>

namespace vibratorctl {

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using nlohmann::ordered_json;

/** A node, and what the service does with it. */
struct NodeUse {
    const std::string& path;
    const char* serves;
    bool isOnlyRead = false;
};

/** @return all nodes; those that run the motor, for both layouts, stand first. */
std::vector<NodeUse> nodeUses() {
    return {{THE_DEVICE_ENABLE, "on, off, is it running"},
            {THE_DEVICE_ACTIVATE, "on, off"},
            {THE_DEVICE_DURATION, "on, is it running"},
            {THE_DEVICE_STATE, "on"},
            {THE_DEVICE_INTENSITY, "amplitudes, patterns"},
            {THE_DEVICE_FORCE_TOUCH_INTENSITY, "force-touch"},
            {THE_DEVICE_MULTI_FREQ, "frequency types"},
            {THE_DEVICE_HAPTIC_ENGINE, "engine packets"},
            {THE_DEVICE_HAPTIC_ENGINE_INDEX, "stored patterns"},
            {THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, "repeated patterns"},
            {THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, "number of patterns", true},
            {THE_DEVICE_MOTOR_TYPE, "name of the motor"},
            {THE_DEVICE_EVENT_CMD, "fold state"},
            {THE_DEVICE_PATTERN_LENGTH, "only logged", true},
            {THE_DEVICE_EXT_CONTROL, "external control"}};
}

/** Examines all that the service needs. The result is JSON; the words are made from it. */
class Examination {
  public:
    explicit Examination(const Client& client) : mClient(client) {
        ::android::sp<IDaxVibrator> vibrator;
        std::string answer = "answers";
        try {
            vibrator = client.service();
        } catch (const Unreachable& error) {
            answer = error.what();
            find("the service cannot be reached: " + answer,
                 "start the daemon, or give the client the daemon's HWBINDER_DIR");
        }
        mAnswers = vibrator != nullptr;
        const Description description = describe(vibrator);
        mReport = {{"layout", mDriver.layout()},     {"service", answer},
                   {"server", description.server},   {"transport", description.transport},
                   {"manager", description.manager}, {"nodes", ordered_json::array()}};
        if (!mDriver.isUsable()) examineLayout();
        if (mDriver.isThere()) examineNodes();
        if (mDriver.isUsable() && mayCallRestricted()) examineMotor();
        if (!mayCallRestricted()) {
            mNotes.push_back(mUser +
                             " may not set amplitudes or make the calls for root and uid "
                             "1000 (system)");
        }
        mReport.update({{"findings", mFindings}, {"notes", mNotes}});
    }

    /** @return the exit code. */
    int report() const { return mClient.found(inWords(), mReport, mFindings.empty()); }

  private:
    void find(const std::string& problem, const std::string& advice) {
        mFindings.push_back({{"problem", problem}, {"advice", advice}});
    }
    void examineLayout();
    void examineNodes();
    void examineMotor();
    std::string nodeTable() const;
    std::string inWords() const;

    const Client& mClient;
    bool mAnswers = false;
    LocalDriver mDriver;
    const std::string mUser = "uid " + std::to_string(getuid());
    ordered_json mReport;
    ordered_json mFindings = ordered_json::array();
    ordered_json mNotes = ordered_json::array();
};

/** Says why the service's code finds no driver. */
void Examination::examineLayout() {
    for (const NodeUse& use : nodeUses()) {
        const LocalDriver::Node node = mDriver.look(use.path);
        if (!node.exists || (node.reads && node.writes)) continue;
        // What root cannot open, the service cannot open either.
        if (mAnswers && getuid() != 0) {
            mNotes.push_back(mUser + " cannot open the nodes; run doctor as root to see more");
        } else {
            find(use.path + " cannot be opened for reading and writing by " + mUser,
                 "give the node to the service's user, as the init declaration in device/ does");
        }
        return;
    }
    const std::string led = THE_DEVICE_ACTIVATE.substr(0, THE_DEVICE_ACTIVATE.rfind('/'));
    if (mDriver.look(led + "/trigger").exists) {
        find(led + " has no transient trigger",
             "load ledtrig-transient, and write \"transient\" to " + led + "/trigger");
    } else {
        find("the kernel offers no vibrator driver in /sys/class",
             "build the motor's driver in, or load it; docs/device.md tells how for a GPIO");
    }
}

void Examination::examineNodes() {
    for (const NodeUse& use : nodeUses()) {
        const LocalDriver::Node node = mDriver.look(use.path);
        if (use.path.find(mDriver.directory()) != 0) {
            if (mDriver.isUsable() && use.path == THE_DEVICE_ACTIVATE && node.exists) {
                find("the kernel has both layouts, and the service takes the timed output",
                     "remove the driver that is not the motor's from the kernel");
            }
            continue;
        }
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
            find(use.path + " is there, but " + mUser + " cannot " +
                         (node.reads ? "write" : "read") + " it",
                 "give the node to the service's user, or give it a mode of 0644");
        }
    }
    const LocalDriver::Node control = mDriver.look(THE_DEVICE_EXT_CONTROL);
    if (control.value == "1\n") {
        find("external control is on, so the motor may not follow the service",
             "switch it off with \"vibratorctl external off\"");
    }
    if (!mDriver.isVibrating() || !control.exists) return;
    const bool isLed = DriverMode == kLedTriggerMode;
    mNotes.push_back(std::string("the motor counts as running, so external control is refused; ") +
                     (isLed ? "the trigger keeps its last duration until \"vibratorctl on 0\""
                            : "\"vibratorctl off\" stops it"));
}

void Examination::examineMotor() {
    LocalDriver::Vibrator& vibrator = *mDriver.vibrator();
    for (const Query& query : kQueries) {
        if (query.feature == nullptr) continue;
        mReport["features"][query.feature] = reached((vibrator.*query.ask)());
    }
    const LocalDriver::Motor motor = mDriver.motor();
    mReport["motor"] = {{"name", motor.name}, {"number", motor.number}, {"found", motor.found}};
    for (const uint32_t type : {0U, 1U})
        mReport["ladders"][std::to_string(type)] = askLadder(vibrator, type);
    const LocalDriver::Node node = mDriver.look(THE_DEVICE_MOTOR_TYPE);
    if (node.reads && node.firstLine() != motor.name) {
        find("the driver's name for the motor, \"" + node.firstLine() + "\", is not a known one",
             "have the driver show one of the known names in " + THE_DEVICE_MOTOR_TYPE);
    }
}

/** @return a text in a column of a table. */
std::string cell(const std::string& text, size_t width) {
    if (text.size() > width) return text.substr(0, width - 3) + "... ";
    return text + std::string(width - text.size() + 1, ' ');
}

std::string Examination::nodeTable() const {
    const std::string directory = mDriver.directory();
    std::string table = "\nNodes in " + directory + "\n" +
                        "NAME                  MODE OWNER    RW VALUE              FOR\n";
    for (const auto& node : mReport["nodes"]) {
        const std::string value = model::quote(node["value"].get<std::string>());
        table += cell(node["path"].get<std::string>().substr(directory.size()), 21) +
                 cell(node["mode"], 4) + cell(node["owner"], 8) + (node["readable"] ? "r" : "-") +
                 (node["writable"] ? "w " : "- ") +
                 cell(node["readable"] ? value
                      : node["exists"] ? ""
                                       : "missing",
                      18) +
                 node["serves"].get<std::string>() + "\n";
    }
    return table;
}

std::string Examination::inWords() const {
    std::string words;
    const auto line = [&](const std::string& label, const std::string& text) {
        if (!text.empty()) words += cell(label + ":", 10) + cli::wrap(text, 11);
    };
    line("layout", mReport["layout"]);
    line("service", mAnswers ? "answers" : "cannot be reached");
    line("served by", mReport["server"]);
    line("transport", mReport["transport"]);
    line("manager", mReport["manager"]);
    if (mReport.contains("motor")) {
        line("motor", mDriver.motor().inWords());
        for (const auto& [type, ladder] : mReport["ladders"].items())
            line("ladder " + type, ladderInWords(ladder));
        std::vector<std::string> features;
        std::vector<std::string> missing;
        for (const auto& [name, has] : mReport["features"].items())
            (has ? features : missing).push_back(name);
        line("features", features.empty() ? "none" : cli::join(features, ", ", ", "));
        line("missing", cli::join(missing, ", ", ", "));
    }
    if (mDriver.isThere()) words += nodeTable();
    words += mFindings.empty() ? "\nnothing is wrong\n" : "\n";
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
    client.command(kTools, "doctor", "say what is wrong with the driver or the service", "")
            .run([&client] { return Examination(client).report(); });
}

}  // namespace vibratorctl
