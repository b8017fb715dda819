// SPDX-License-Identifier: Apache-2.0
#include "service/Diagnosis.h"

#include "service/Reasons.h"
#include "service/System.h"
#include "text/Text.h"

#include <unistd.h>

#include <array>
#include <map>

namespace vibratorctl {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;

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

class Examination {
  public:
    explicit Examination(const std::string& instance) {
        setCallTimeout(kPatience);
        try {
            mVibrator = connect(instance);
            mFound.server = serverOf(*mVibrator);
            reached(mVibrator->ping());
            mFound.answers = true;
        } catch (const Unreachable& error) {
            examineSilence(error);
        }
        mFound.route = findRoute();
        mOpener = mFound.server.value_or(thisProcess());
        mDriver = LocalDriver(mOpener);
    }

    Diagnosis examine() {
        mFound.layout = mDriver.layout();
        if (!mDriver.isThere()) examineMissingDriver();
        if (mDriver.isThere()) examineNodes();
        if (mDriver.isUsable()) examineMotor();
        try {
            if (mFound.answers && mDriver.isUsable()) examineAnswers();
        } catch (const Unreachable& error) {
            find(service() + " answers no more: " + error.what(), mSystem.restart);
        }
        if (!mFound.server && mDriver.isThere()) {
            note("the service's user is not known; what it may open is judged for uid " +
                 std::to_string(mOpener.uid));
        }
        if (!mayCallRestricted()) {
            note("uid " + std::to_string(geteuid()) +
                 " may not set amplitudes or make the calls for " + permittedUsers());
        }
        return std::move(mFound);
    }

  private:
    void find(const std::string& problem, const std::string& advice) {
        mFound.findings.push_back({problem, advice});
    }
    void note(const std::string& text) { mFound.notes.push_back(text); }
    /** @return the service's process, for a sentence. */
    std::string service() const {
        return mFound.server ? "the service (" + mOpener.inWords() + ")"
                             : "uid " + std::to_string(mOpener.uid);
    }

    void examineSilence(const Unreachable& error);
    void examineMissingDriver();
    void examineNodes();
    std::string howToGive(const std::string& paths, const LocalDriver::Node& node) const;
    void examineControl();
    void examineMotor();
    void examineAnswers();
    bool canBeOff() const;

    Diagnosis mFound;
    ::android::sp<IDaxVibrator> mVibrator;
    Process mOpener;
    LocalDriver mDriver{thisProcess()};
    const System mSystem = thisSystem();
};

/** Says why no service answers. @param error what the client met. */
void Examination::examineSilence(const Unreachable& error) {
    const std::string why = error.what();
    std::vector<Process> servers = findServers();
    if (mFound.server) servers = {*mFound.server};
    for (const Process& server : servers) {
        // A service that is stopped is found all the same.
        if (!error.isFound || server.state != 'T') continue;
        mFound.server = server;
        return find("the service (" + server.inWords() + ") is stopped, and answers nobody",
                    "let it go on: kill -CONT " + std::to_string(server.pid));
    }
    if (servers.empty()) {
        return find("the service does not run: " + why, mSystem.start);
    }
    find("a service runs (" + servers[0].inWords() + "), but cannot be reached: " + why,
         "give the client the HWBINDER_DIR and --instance of the service, or " + mSystem.restart);
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
    // What is closed in the same way has one cause, and is said once.
    std::map<std::array<std::string, 3>, std::pair<LocalDriver::Node, std::vector<std::string>>>
            closed;
    for (size_t i = 0; i < std::size(NodePathTable); ++i) {
        const NodeInfo& info = NodePathTable[i];
        if (!info.isIn(mDriver.mode())) continue;
        const std::string path = mDriver.path(info.leaf);
        const LocalDriver::Node node = mDriver.look(path);
        mFound.nodes.push_back({path, kServes[i], node});
        // What somebody else may not open is no fault.
        if (!mFound.server && !mOpener.overridesModes) continue;
        if (!node.exists || (node.reads && (info.isOnlyRead || node.writes))) continue;
        auto& [sample, leaves] = closed[{node.reads ? "write " : "read ", node.owner, node.mode}];
        sample = node;
        leaves.emplace_back(info.leaf);
    }
    for (const auto& [how, which] : closed) {
        const auto& [access, owner, mode] = how;
        const auto& [sample, leaves] = which;
        const std::string names = cli::join(leaves, ",", ",");
        const std::string paths = mDriver.path(leaves.size() == 1 ? names : "{" + names + "}");
        find(service() + " cannot " + access + paths + " (owner " + owner + ", " + mode + ")",
             howToGive(paths, sample));
    }
    if (mDriver.mode() == kTimedOutputMode && mDriver.look(THE_DEVICE_ACTIVATE).exists) {
        find("the kernel has both layouts, and the service takes the timed output",
             "remove the driver that is not the motor's from the kernel");
    }
    examineControl();
}

/** Looks at who controls the motor. */
void Examination::examineControl() {
    const LocalDriver::Node control = mDriver.look("ext_control");
    const bool isRunning = mDriver.isVibrating();
    const std::string stop = howToStop(mDriver);
    if (control.firstLine() == "1") {
        find("external control is on, so the motor may not follow the service",
             (isRunning ? stop + " and then " : std::string()) + "vibratorctl external off");
    } else if (isRunning && control.exists) {
        note("the motor counts as running, so external control is refused until \"" + stop + "\"");
    }
}

void Examination::examineMotor() {
    for (const Query& query : kQueries) {
        if (query.feature == nullptr) continue;
        mFound.features.emplace_back(query.feature, (mDriver.*query.expect)());
    }
    mFound.motor = mDriver.motor();
    for (const uint32_t type : {0U, 1U})
        mFound.ladders[type] = mDriver.ladder(type);
    const LocalDriver::Node node = mDriver.look("motor_type");
    if (node.value.empty() || node.firstLine() == mFound.motor->name) return;
    const std::vector<std::string> known(std::begin(MotorTypeNames) + 1, std::end(MotorTypeNames));
    find("the driver's name for the motor, \"" + node.firstLine() + "\", is not a known one",
         "have the driver show one of these in " + mDriver.path("motor_type") + ": " +
                 cli::join(known, ", ", " or "));
}

/** @return whether "off" changes nothing. */
bool Examination::canBeOff() const {
    return !mDriver.isVibrating() && mDriver.look("ext_control").firstLine() != "1";
}

/** Compares what the service answers with what the nodes show. */
void Examination::examineAnswers() {
    std::vector<std::string> wrong;
    const auto compare = [&](const std::string& operation, bool isAsExpected) {
        if (!isAsExpected) wrong.push_back(operation);
    };
    if (canBeOff()) compare("off", reached(mVibrator->off()) == VibratorStatus::OK);
    for (const Query& query : kQueries) {
        if (!mayCallRestricted() && !query.isForAll) continue;
        compare(query.operation, reached((*mVibrator.*query.ask)()) == (mDriver.*query.expect)());
    }
    if (mayCallRestricted()) {
        compare("daxGetAmplitudeList", askLadder(*mVibrator, 0) == mFound.ladders[0] &&
                                               askLadder(*mVibrator, 1) == mFound.ladders[1]);
    }
    if (wrong.empty()) return;
    find(service() + " does not answer as the driver is: " + cli::join(wrong, ", ", " and ") +
                 "; it has started before the driver was there, or the driver fails",
         mSystem.restart + "; if that does not help, the log has the error: " + mSystem.log);
}

}  // namespace

Diagnosis diagnose(const std::string& instance) {
    return Examination(instance).examine();
}

}  // namespace vibratorctl
