// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "TraceLine.h"
#include "service/Queries.h"
#include "service/System.h"
#include "text/Text.h"

#include <unistd.h>

#include <map>

namespace vibratorctl {

using namespace product;
using nlohmann::ordered_json;

namespace {

/** The longest that a service that works needs to answer. */
constexpr std::chrono::seconds kPatience(3);

/** What each node serves, in the order of NodePathTable. */
constexpr const char* kServes[] = {"on, off, is it running",
                                   "on, off",
                                   "on, is it running",
                                   "on",
                                   "amplitudes, patterns",
                                   "force-touch",
                                   "frequency types",
                                   "engine packets",
                                   "stored patterns",
                                   "repeated patterns",
                                   "number of patterns",
                                   "name of the motor",
                                   "fold state",
                                   "only logged",
                                   "external control"};
static_assert(std::size(kServes) == std::size(NodePathTable));

/** @return a text in a column of a table. */
std::string cell(const std::string& text, size_t width) {
    if (text.size() > width) return text.substr(0, width - 3) + "... ";
    return text + std::string(width - text.size() + 1, ' ');
}

/** Examines all that the service needs, and tells what it finds in words and as JSON. */
class Examination {
  public:
    /** @param instance of the service. */
    explicit Examination(const std::string& instance) {
        setCallTimeout(kPatience);
        try {
            mVibrator = connect(instance);
            mServer = serverOf(*mVibrator);
            reached(mVibrator->ping());
            mAnswers = true;
        } catch (const Unreachable& error) {
            examineSilence(error);
        }
        mOpener = mServer.value_or(thisProcess());
        mDriver = LocalDriver(mOpener);
    }

    /** @return the exit code. */
    int report(const Report& report) {
        tellService();
        if (!mDriver.isThere()) examineMissingDriver();
        mMembers["nodes"] = ordered_json::array();
        if (mDriver.isThere()) examineNodes();
        if (mDriver.isUsable()) examineMotor();
        if (mAnswers && mDriver.isUsable()) examineAnswers();
        addNotes();
        return tellFindings(report);
    }

  private:
    /** Adds a line for a person. */
    void line(const std::string& label, const std::string& text) {
        if (!text.empty()) mLines += cell(label + ":", 10) + cli::wrap(text, 11);
    }
    /** Adds what is wrong, and what to do about it. */
    void find(const std::string& problem, const std::string& advice) {
        mFindings.emplace_back(problem, advice);
    }
    void note(const std::string& text) { mNotes.push_back(text); }
    /** @return the service's process, for a sentence. */
    std::string service() const {
        return mServer ? "the service (" + mOpener.inWords() + ")"
                       : "uid " + std::to_string(mOpener.uid);
    }

    void examineSilence(const Unreachable& error);
    void tellService();
    void examineMissingDriver();
    void examineNodes();
    void tellNode(const std::string& leaf, const char* serves, const LocalDriver::Node& node);
    std::string howToGive(const std::string& paths, const LocalDriver::Node& node) const;
    void examineControl();
    void examineMotor();
    void examineAnswers();
    void addNotes();
    int tellFindings(const Report& report);

    ::android::sp<IDaxVibrator> mVibrator;
    bool mAnswers = false;
    std::optional<Process> mServer;
    Process mOpener;
    LocalDriver mDriver{thisProcess()};
    const System mSystem = thisSystem();

    /** For a person: the lines on the service and the driver, and the table of nodes. */
    std::string mLines;
    std::string mTable;
    ordered_json mMembers;
    /** Problems, each with what to do. */
    std::vector<std::pair<std::string, std::string>> mFindings;
    std::vector<std::string> mNotes;
};

/** Says why no service answers. @param error what the client met. */
void Examination::examineSilence(const Unreachable& error) {
    const std::string why = error.what();
    std::vector<Process> servers = findServers();
    if (mServer) servers = {*mServer};
    for (const Process& server : servers) {
        // A service that is stopped is found all the same.
        if (!error.isFound || server.state != 'T') continue;
        mServer = server;
        return find("the service (" + server.inWords() + ") is stopped, and answers nobody",
                    "let it go on: kill -CONT " + std::to_string(server.pid));
    }
    if (servers.empty()) {
        return find("the service does not run: " + why, mSystem.start);
    }
    find("a service runs (" + servers[0].inWords() + "), but cannot be reached: " + why,
         "give the client the HWBINDER_DIR and --instance of the service, or " + mSystem.restart);
}

void Examination::tellService() {
    const Served served = describe(mServer);
    const std::string layout = mDriver.isThere() ? mDriver.layout().name : "none";
    line("layout", layout);
    line("service", mAnswers ? "answers" : "cannot be reached");
    if (mAnswers) line("served by", served.server);
    line("transport", served.transport);
    line("manager", served.manager);
    mMembers = {{"layout", layout}, {"answers", mAnswers}};
    mMembers.update(served.members);
}

void Examination::examineMissingDriver() {
    const std::string led = THE_DEVICE_ACTIVATE.substr(0, THE_DEVICE_ACTIVATE.rfind('/'));
    const std::vector<std::string> motors = forceFeedbackMotors();
    if (mDriver.look(led + "/trigger").exists) {
        find(led + " has no transient trigger",
             "load ledtrig-transient, and write \"transient\" to " + led + "/trigger");
    } else if (!motors.empty()) {
        find("the kernel offers no vibrator driver in /sys/class, but the input device with force "
             "feedback " +
                     cli::join(motors, ", ", " and "),
             "run \"vibrator-driver run\", which offers such a motor as a vibrator driver; "
             "docs/motors.md says how");
    } else {
        find("the kernel offers no vibrator driver in /sys/class",
             "build the motor's driver in, or load it; docs/device.md tells how for a GPIO");
    }
}

std::string Examination::howToGive(const std::string& paths, const LocalDriver::Node& node) const {
    const bool isOwner = mOpener.overridesModes || node.uid == mOpener.uid;
    if (isOwner) return "chmod 0644 " + paths;
    return mSystem.give.empty() ? "chown " + std::to_string(mOpener.uid) + " " + paths
                                : mSystem.give;
}

void Examination::examineNodes() {
    mTable = std::string("\nNodes in ") + kNodeDirectories[mDriver.mode()] +
             "; the service may read and write as RW says\n"
             "NAME                  MODE OWNER    RW VALUE              FOR\n";
    // What is closed in the same way has one cause, and is said once.
    std::map<std::pair<std::string, std::string>, std::vector<std::string>> closed;
    for (size_t i = 0; i < std::size(NodePathTable); ++i) {
        const NodeInfo& info = NodePathTable[i];
        if (!info.isIn(mDriver.mode())) continue;
        const LocalDriver::Node node = mDriver.look(info.leaf);
        tellNode(info.leaf, kServes[i], node);
        // What somebody else may not open is no fault.
        if (!mServer && !mOpener.overridesModes) continue;
        if (!node.exists || (node.reads && (info.isOnlyRead || node.writes))) continue;
        const std::string how = " (owner " + node.owner + ", " + node.mode + ")";
        closed[{node.reads ? "write " : "read ", how}].emplace_back(info.leaf);
    }
    for (const auto& [way, leaves] : closed) {
        const auto& [access, how] = way;
        const std::string names = cli::join(leaves, ",", ",");
        const std::string paths = mDriver.path(leaves.size() == 1 ? names : "{" + names + "}");
        find(service() + " cannot " + access + paths + how,
             howToGive(paths, mDriver.look(leaves[0])));
    }
    if (mDriver.mode() == kTimedOutputMode && mDriver.look(THE_DEVICE_ACTIVATE).exists) {
        find("the kernel has both layouts, and the service takes the timed output",
             "remove the driver that is not the motor's from the kernel");
    }
    examineControl();
}

void Examination::tellNode(const std::string& leaf, const char* serves,
                           const LocalDriver::Node& node) {
    const std::string value = !node.exists         ? "missing"
                              : node.value.empty() ? ""
                                                   : model::quote(node.value);
    mTable += cell(leaf, 21) + cell(node.mode, 4) + cell(node.owner, 8) + (node.reads ? "r" : "-") +
              (node.writes ? "w " : "- ") + cell(value, 18) + serves + "\n";
    mMembers["nodes"].push_back({{"path", mDriver.path(leaf)},
                                 {"exists", node.exists},
                                 {"mode", node.mode},
                                 {"owner", node.owner},
                                 {"readable", node.reads},
                                 {"writable", node.writes},
                                 {"value", node.value},
                                 {"serves", serves}});
}

/** Looks at who controls the motor. */
void Examination::examineControl() {
    const bool isRunning = mDriver.isVibrating();
    const std::string stop = mDriver.layout().howToStop;
    if (mDriver.isControlled()) {
        find("external control is on, so the motor may not follow the service",
             (isRunning ? stop + " and then " : "") + "vibratorctl external off");
    } else if (isRunning && mDriver.look("ext_control").exists) {
        note("the motor counts as running, so external control is refused until \"" + stop + "\"");
    }
}

void Examination::examineMotor() {
    const LocalDriver::Motor motor = mDriver.motor();
    line("motor", motor.inWords());
    mMembers["motor"] = asJson(motor);
    for (const uint32_t type : {0U, 1U}) {
        const auto ladder = mDriver.ladder(type);
        line("ladder " + std::to_string(type), ladderInWords(ladder));
        mMembers["ladders"][std::to_string(type)] = ladder;
    }
    std::vector<std::string> features;
    std::vector<std::string> missing;
    for (const Query& query : kQueries) {
        if (query.feature == nullptr) continue;
        const bool isThere = (mDriver.*query.expect)();
        (isThere ? features : missing).emplace_back(query.feature);
        mMembers["features"][query.feature] = isThere;
    }
    line("features", features.empty() ? "none" : cli::join(features, ", ", ", "));
    line("missing", cli::join(missing, ", ", ", "));
    const LocalDriver::Node node = mDriver.look("motor_type");
    if (node.value.empty() || node.firstLine() == motor.name) return;
    const std::vector<std::string> known(std::begin(MotorTypeNames) + 1, std::end(MotorTypeNames));
    find("the driver's name for the motor, \"" + node.firstLine() + "\", is not a known one",
         "have the driver show one of these in " + mDriver.path("motor_type") + ": " +
                 cli::join(known, ", ", " or "));
}

/** Compares what the service answers with what the nodes show. */
void Examination::examineAnswers() {
    std::vector<std::string> wrong;
    try {
        const bool changesNothing = !mDriver.isVibrating() && !mDriver.isControlled();
        if (changesNothing && reached(mVibrator->off()) != VibratorStatus::OK)
            wrong.emplace_back("off");
        for (const auto& [question, wanted, got] : compareAnswers(*mVibrator, mDriver)) {
            if (wanted != got) wrong.push_back(question);
        }
    } catch (const Unreachable& error) {
        return find(service() + " answers no more: " + error.what(), mSystem.restart);
    }
    if (wrong.empty()) return;
    find(service() + " does not answer as the driver is: " + cli::join(wrong, ", ", " and ") +
                 "; it has started before the driver was there, or the driver fails",
         mSystem.restart + "; if that does not help, the log has the error: " + mSystem.log);
}

void Examination::addNotes() {
    if (!mServer && mDriver.isThere()) {
        note("the service's user is not known; what it may open is judged for uid " +
             std::to_string(mOpener.uid));
    }
    if (!mayCallRestricted()) {
        note("uid " + std::to_string(geteuid()) + " may not set amplitudes or make the calls for " +
             permittedUsers());
    }
}

int Examination::tellFindings(const Report& report) {
    std::string words = mFindings.empty() ? "\nnothing is wrong\n" : "\n";
    mMembers["findings"] = ordered_json::array();
    for (const auto& [problem, advice] : mFindings) {
        words += "! " + cli::wrap(cli::printable(problem) + ":", 2) + "  " +
                 cli::wrap(advice + ".", 2);
        mMembers["findings"].push_back({{"problem", problem}, {"advice", advice}});
    }
    for (const auto& each : mNotes)
        words += "note: " + cli::wrap(each + ".", 6);
    mMembers["notes"] = mNotes;
    return report.found(mLines + mTable + words, mMembers, mFindings.empty());
}

}  // namespace

void addDoctor(Client& client) {
    client.command(kTools, "doctor", "say what is wrong with the driver or the service", "")
            .run([&client] { return Examination(client.instance()).report(client.report()); });
}

}  // namespace vibratorctl
