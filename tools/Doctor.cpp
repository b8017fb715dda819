// SPDX-License-Identifier: Apache-2.0
#include "Doctor.h"

#include "AmplitudeLists.h"
#include "Driver.h"
#include "MotorType.h"
#include "NodePaths.h"
#include "Trace.h"

#include <fcntl.h>
#include <pwd.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <map>
#include <vector>

namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using nlohmann::ordered_json;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;

/** How a node is used; decides which of its permissions matter. */
enum class Use { kReadWrite, kRead };

struct NodeToExamine {
    std::string path;
    Use use;
    const char* serves;
};

/** One node as it is now. */
struct NodeState {
    bool exists = false;
    bool reads = false;
    bool writes = false;
    std::string mode;
    std::string owner;
    std::string value;
};

class Examination {
  public:
    explicit Examination(std::string simulation) : mSimulation(std::move(simulation)) {}

    ordered_json run(const std::string& serviceError) {
        findLayout();
        mReport["service"] = serviceError.empty() ? "answers" : serviceError;
        if (!serviceError.empty()) {
            find("the service cannot be reached: " + serviceError,
                 "start the daemon, or give the client the daemon's HWBINDER_DIR");
        }
        if (geteuid() != 0 && geteuid() != 1000) {
            find("uid " + std::to_string(geteuid()) +
                         " may not set amplitudes or use the extended operations",
                 "run the client as root or as uid 1000 (system)");
        }
        mReport["nodes"] = ordered_json::array();
        if (mHasLayout) {
            examineNodes();
            examineMotor();
            examineState();
        }
        mReport["findings"] = mFindings;
        return mReport;
    }

  private:
    void find(const std::string& problem, const std::string& advice) {
        mFindings.push_back({{"problem", problem}, {"advice", advice}});
    }

    std::string fileOf(const std::string& path) const { return mSimulation + path; }

    NodeState look(const std::string& path) const {
        NodeState state;
        struct stat info {};
        const std::string file = fileOf(path);
        if (path.empty() || stat(file.c_str(), &info) != 0) return state;
        state.exists = true;
        // Root is let into any file, but not past the mode of a driver's attribute.
        state.reads = (info.st_mode & 0444) != 0 && canOpen(file, O_RDONLY);
        state.writes = (info.st_mode & 0222) != 0 && canOpen(file, O_WRONLY);
        char mode[8];
        snprintf(mode, sizeof(mode), "%04o", info.st_mode & 07777);
        state.mode = mode;
        const passwd* user = getpwuid(info.st_uid);
        state.owner = user != nullptr ? user->pw_name : std::to_string(info.st_uid);
        if (state.reads) state.value = read(path);
        return state;
    }
    static bool canOpen(const std::string& file, int mode) {
        const int descriptor = open(file.c_str(), mode | O_CLOEXEC | O_NONBLOCK);
        if (descriptor >= 0) close(descriptor);
        return descriptor >= 0;
    }
    std::string read(const std::string& path) const {
        simulator::Node node;
        if (!mSimulation.empty() && simulator::findNode(mSimulation, path.c_str(), &node)) {
            return simulator::show(node);
        }
        char text[512];
        const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK);
        if (descriptor < 0) return {};
        const ssize_t size = ::read(descriptor, text, sizeof(text));
        close(descriptor);
        return {text, static_cast<size_t>(std::max<ssize_t>(size, 0))};
    }
    bool opens(const std::string& path) const {
        const NodeState state = look(path);
        return state.reads && state.writes;
    }

    /** Decides as the service does when it starts. */
    void findLayout() {
        const bool timed = opens(THE_DEVICE_ENABLE);
        const bool led =
                opens(THE_DEVICE_ACTIVATE) && opens(THE_DEVICE_DURATION) && opens(THE_DEVICE_STATE);
        mHasLayout = timed || led;
        setDriverMode(timed || !led ? kTimedOutputMode : kLedTriggerMode);
        mReport["layout"] = timed ? "timed output" : led ? "LED trigger" : "none";
        if (timed && led) {
            find("the kernel has both layouts, and the service takes the timed output",
                 "remove the driver that is not the motor's from the kernel");
        }
        if (!mHasLayout) explainMissingLayout();
    }

    void explainMissingLayout() {
        const std::string led = THE_DEVICE_ACTIVATE.substr(0, THE_DEVICE_ACTIVATE.rfind('/'));
        for (const std::string* path :
             {&THE_DEVICE_ENABLE, &THE_DEVICE_ACTIVATE, &THE_DEVICE_DURATION, &THE_DEVICE_STATE}) {
            const NodeState state = look(*path);
            if (state.exists && !(state.reads && state.writes)) {
                find(*path + " cannot be opened for reading and writing by uid " +
                             std::to_string(geteuid()),
                     "give the node to the service's user, as the init declaration in device/ "
                     "does");
                return;
            }
        }
        if (look(led + "/trigger").exists) {
            find(led + " has no transient trigger",
                 "load ledtrig-transient, and write \"transient\" to " + led + "/trigger");
            return;
        }
        find("the kernel offers no vibrator driver in /sys/class",
             "build the motor's driver in, or load it; docs/device.md tells how for a GPIO");
    }

    void examineNodes() {
        const bool isTimed = DriverMode == kTimedOutputMode;
        std::vector<NodeToExamine> nodes;
        if (isTimed) {
            nodes = {{THE_DEVICE_ENABLE, Use::kReadWrite, "on, off, whether the motor runs"}};
        } else {
            nodes = {{THE_DEVICE_ACTIVATE, Use::kReadWrite, "on, off"},
                     {THE_DEVICE_DURATION, Use::kReadWrite, "on, whether the motor runs"},
                     {THE_DEVICE_STATE, Use::kReadWrite, "on"}};
        }
        nodes.insert(nodes.end(),
                     {{THE_DEVICE_INTENSITY, Use::kReadWrite, "amplitudes, patterns"},
                      {THE_DEVICE_FORCE_TOUCH_INTENSITY, Use::kReadWrite, "force-touch amplitudes"},
                      {THE_DEVICE_MULTI_FREQ, Use::kReadWrite, "frequency types"},
                      {THE_DEVICE_HAPTIC_ENGINE, Use::kReadWrite, "haptic engine packets"},
                      {THE_DEVICE_HAPTIC_ENGINE_INDEX, Use::kReadWrite, "stored patterns"},
                      {THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, Use::kReadWrite, "repeated patterns"},
                      {THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES, Use::kRead, "number of stored patterns"},
                      {THE_DEVICE_MOTOR_TYPE, Use::kReadWrite, "the motor's name"},
                      {THE_DEVICE_EVENT_CMD, Use::kReadWrite, "fold state"},
                      {THE_DEVICE_PATTERN_LENGTH, Use::kRead, "nothing; it is only logged"},
                      {THE_DEVICE_EXT_CONTROL, Use::kReadWrite, "external control"}});
        for (const NodeToExamine& node : nodes)
            examineNode(node);
    }

    void examineNode(const NodeToExamine& node) {
        const NodeState state = look(node.path);
        mStates[node.path] = state;
        mReport["nodes"].push_back({{"path", node.path},
                                    {"exists", state.exists},
                                    {"mode", state.mode},
                                    {"owner", state.owner},
                                    {"readable", state.reads},
                                    {"writable", state.writes},
                                    {"value", state.value},
                                    {"serves", node.serves}});
        const bool suffices = state.reads && (node.use == Use::kRead || state.writes);
        if (state.exists && !suffices) {
            find(node.path + " is there, but uid " + std::to_string(geteuid()) + " cannot " +
                         (state.reads ? "write" : "read") + " it",
                 "give the node to the service's user, or give it a mode of 0644");
        }
    }

    bool has(const std::string& path) { return mStates[path].reads && mStates[path].writes; }

    void examineMotor() {
        const bool prebaked = has(THE_DEVICE_HAPTIC_ENGINE_INDEX);
        const bool engine = has(THE_DEVICE_HAPTIC_ENGINE);
        const bool intensity = has(THE_DEVICE_INTENSITY);
        mReport["features"] = {{"amplitude", intensity},
                               {"forceTouch", has(THE_DEVICE_FORCE_TOUCH_INTENSITY)},
                               {"frequency", has(THE_DEVICE_MULTI_FREQ)},
                               {"hapticEngine", engine},
                               {"prebakedPatterns", prebaked},
                               {"foldState", has(THE_DEVICE_EVENT_CMD)},
                               {"externalControl", has(THE_DEVICE_EXT_CONTROL)}};

        std::string name = mStates[THE_DEVICE_MOTOR_TYPE].value;
        if (!name.empty() && name.back() == '\n') name.pop_back();
        int32_t type = kMotorTypeCount - 1;
        while (type > kMotorNone && MotorTypeNames[type] != name)
            --type;
        const char* foundBy = "by the driver's name for it";
        if (type == kMotorNone || !has(THE_DEVICE_MOTOR_TYPE)) {
            if (mStates[THE_DEVICE_MOTOR_TYPE].exists) {
                find("the driver's name for the motor, \"" + name + "\", is of no use",
                     "have the driver show one of the known names in " + THE_DEVICE_MOTOR_TYPE);
            }
            foundBy = "by the features of the driver";
            type = prebaked ? (engine ? kMotorLinearIndex : kMotorLinear1030)
                   // Without a name a haptic engine is taken for the newer of two motors.
                   : engine ? (mStates[THE_DEVICE_MOTOR_TYPE].reads ? kMotorLinear0832Rc
                                                                    : kMotorLinear1040)
                            : (intensity ? kMotorLinear : kMotorCoinDc);
        }
        mReport["motor"] = {{"name", MotorTypeNames[type]}, {"number", type}, {"found", foundBy}};
        for (const auto& [key, variant] :
             {std::pair("0", DaxAmplitudeType::TYPE_0), std::pair("1", DaxAmplitudeType::TYPE_1)}) {
            mReport["ladders"][key] = selectAmplitudeList(type, variant, prebaked);
        }
    }

    void examineState() {
        if (mStates[THE_DEVICE_EXT_CONTROL].value == "1\n") {
            find("external control is on, so the motor may not follow the service",
                 "switch it off with \"vibratorctl external off\"");
        }
        const std::string& duration = mStates[THE_DEVICE_DURATION].value;
        if (DriverMode == kLedTriggerMode && has(THE_DEVICE_EXT_CONTROL) && !duration.empty() &&
            duration != "0\n") {
            find("the trigger keeps its last duration, so the motor counts as running and external "
                 "control is refused",
                 "write 0 to it with \"vibratorctl on 0\" before external control is switched");
        }
    }

    std::string mSimulation;
    bool mHasLayout = false;
    std::map<std::string, NodeState> mStates;
    ordered_json mReport;
    ordered_json mFindings = ordered_json::array();
};

std::string yesNo(bool yes) {
    return yes ? "yes" : "no";
}

}  // namespace

ordered_json examine(const std::string& simulation, const std::string& serviceError) {
    return Examination(simulation).run(serviceError);
}

std::string examinationInWords(const ordered_json& examination) {
    std::string words = "layout:   " + examination["layout"].get<std::string>() + "\n" +
                        "service:  " + examination["service"].get<std::string>() + "\n";
    if (examination.contains("motor")) {
        const auto& motor = examination["motor"];
        words += "motor:    " + motor["name"].get<std::string>() + ", number " +
                 motor["number"].dump() + ", found " + motor["found"].get<std::string>() + "\n";
        std::string features;
        for (const auto& [name, has] : examination["features"].items()) {
            features += (features.empty() ? "" : ", ") + name + " " + yesNo(has.get<bool>());
        }
        words += "features: " + features + "\n";
        for (const auto& [type, ladder] : examination["ladders"].items()) {
            words += "ladder " + type + ": " + (ladder.empty() ? "none" : ladder.dump()) + "\n";
        }
        words += "\n";
    }
    for (const auto& node : examination["nodes"]) {
        char line[256];
        const bool exists = node["exists"].get<bool>();
        snprintf(line, sizeof(line), "%-55s  %-4s  %-8s  %c%c  %-16s  %s\n",
                 node["path"].get<std::string>().c_str(), node["mode"].get<std::string>().c_str(),
                 node["owner"].get<std::string>().c_str(), node["readable"].get<bool>() ? 'r' : '-',
                 node["writable"].get<bool>() ? 'w' : '-',
                 exists ? simulator::quote(node["value"].get<std::string>()).c_str() : "missing",
                 node["serves"].get<std::string>().c_str());
        words += line;
    }
    words += examination["findings"].empty() ? "\nnothing is wrong\n" : "\n";
    for (const auto& finding : examination["findings"]) {
        words += "! " + finding["problem"].get<std::string>() + ";\n  " +
                 finding["advice"].get<std::string>() + ".\n";
    }
    return words;
}
