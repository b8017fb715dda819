// SPDX-License-Identifier: Apache-2.0
#include "Completion.h"
#include "Doctor.h"
#include "NodeAccess.h"
#include "Packets.h"
#include "Plot.h"
#include "Report.h"
#include "Score.h"
#include "Trace.h"
#include "Watch.h"

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <sys/ioctl.h>
#include <unistd.h>

#include <CLI/CLI.hpp>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <exception>
#include <fstream>
#include <functional>
#include <iostream>
#include <map>
#include <sstream>
#include <string>
#include <thread>
#include <vector>

namespace {

using ::android::sp;
using ::android::hardware::hidl_vec;
using ::android::hardware::Return;
using ::android::hardware::vibrator::V1_0::EffectStrength;
using nlohmann::ordered_json;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

constexpr char kAmplitudeRange[] = "1 to 10000";

/** The command line, and what it makes of the service's answers. */
class Client {
  public:
    int run(int argc, char** argv);

  private:
    /** Adds a command that runs once the service is at hand. */
    CLI::App* command(CLI::App& parent, const std::string& name, const std::string& help,
                      std::function<int()> run);
    void addStandardCommands();
    void addQueryCommands();
    void addSettingCommands();
    void addPrebakedCommands();
    void addEngineCommand();
    void addTools();

    int answer(const Call& call, const Return<VibratorStatus>& result);
    int effect(uint32_t number, const std::string& version);
    int supports();
    int status();
    int ladder(uint32_t type);
    int motor();
    int countPrebaked();
    int engine();
    int doctor();
    int watchTraffic();
    int plot();
    int play();
    int playStep(const ScoreStep& step);

    CLI::App mApp{"Calls the vibrator service from the command line."};
    std::string mInstance = "default";
    bool mJson = false;
    Report mReport{false};
    sp<IDaxVibrator> mVibrator;
    std::function<int()> mRun;

    uint32_t mNumber = 0;
    uint32_t mAmplitude = 10000;
    std::string mWord;
    std::string mVersion = "1.0";
    bool mRepeat = false;
    EffectStrength mStrength = EffectStrength::MEDIUM;
    std::vector<std::string> mPackets;
    std::string mFile;
    std::string mOutput;
    std::string mSimulation;
    WatchSource mSource;
    bool mCheck = false;
};

int Client::run(int argc, char** argv) {
    mApp.require_subcommand(1);
    mApp.failure_message(CLI::FailureMessage::help);
    mApp.footer(
            "Exit code: 0 done, 1 the service has not done it, 2 the command makes no sense,\n"
            "3 the service cannot be reached.\n\n"
            "Only root and uid 1000 (system) may set amplitudes and use the extended operations.\n"
            "vibratorctl COMMAND --help tells more about a command.");
    mApp.add_option("--instance", mInstance, "name of the service's instance")
            ->capture_default_str();
    mApp.add_flag("--json", mJson, "print the answer as JSON");
    addStandardCommands();
    addQueryCommands();
    addSettingCommands();
    addPrebakedCommands();
    addEngineCommand();
    addTools();
    try {
        mApp.parse(argc, argv);
    } catch (const CLI::ParseError& error) {
        return mApp.exit(error) == 0 ? kSuccess : kUsage;
    }
    mReport = Report(mJson);
    mVibrator = IDaxVibrator::getService(mInstance);
    return mRun();
}

CLI::App* Client::command(CLI::App& parent, const std::string& name, const std::string& help,
                          std::function<int()> run) {
    CLI::App* added = parent.add_subcommand(name, help);
    added->fallthrough();
    added->callback([this, run = std::move(run)] { mRun = run; });
    return added;
}

void Client::addStandardCommands() {
    command(mApp, "on", "run the motor", [this] { return answer({"on"}, mVibrator->on(mNumber)); })
            ->add_option("MS", mNumber, "how long, in milliseconds")
            ->required();
    command(mApp, "off", "stop the motor", [this] { return answer({"off"}, mVibrator->off()); });
    command(mApp, "amplitude", "set the strength of the vibration",
            [this] {
                return answer({"setAmplitude", "1 to 255", true},
                              mVibrator->setAmplitude(static_cast<uint8_t>(mNumber)));
            })
            ->add_option("N", mNumber, "1 (weakest) to 255 (strongest)")
            ->required()
            ->check(CLI::Range(0, 255));

    const std::map<std::string, EffectStrength> strengths = {{"light", EffectStrength::LIGHT},
                                                             {"medium", EffectStrength::MEDIUM},
                                                             {"strong", EffectStrength::STRONG}};
    const auto addStrength = [this, strengths](CLI::App* app) {
        app->add_option("--strength", mStrength, "light, medium (the default) or strong")
                ->transform(CLI::CheckedTransformer(strengths));
    };
    addStrength(command(mApp, "click", "play the predefined click",
                        [this] { return effect(0, "1.0"); }));
    CLI::App* effectCommand = command(mApp, "effect", "ask for a predefined effect by its number",
                                      [this] { return effect(mNumber, mVersion); });
    effectCommand->add_option("NUMBER", mNumber, "number of the effect; 0 is the click")
            ->required();
    effectCommand->add_option("--version", mVersion, "version of the interface that has the effect")
            ->capture_default_str()
            ->check(CLI::IsMember({"1.0", "1.1", "1.2", "1.3"}));
    addStrength(effectCommand);

    command(mApp, "external", "leave the motor to an external control, or take it back",
            [this] {
                return answer({"setExternalControl"}, mVibrator->setExternalControl(mWord == "on"));
            })
            ->add_option("STATE", mWord, "on or off")
            ->required()
            ->check(CLI::IsMember({"on", "off"}));
}

void Client::addQueryCommands() {
    command(mApp, "supports", "ask the service what it can do here", [this] { return supports(); });
    command(mApp, "status", "tell whether the service answers, and what it is",
            [this] { return status(); });
    command(mApp, "motor", "tell what the service knows of the motor", [this] { return motor(); });
    command(mApp, "ladder", "print the ladder of amplitudes that suits the motor", [this] {
        return ladder(mNumber);
    })->add_option("--type", mNumber, "variant of the ladder, 0 (the default) or 1");
}

void Client::addSettingCommands() {
    command(mApp, "intensity", "set the strength of the vibration on the driver's own scale",
            [this] {
                return answer({"daxSetAmplitude", kAmplitudeRange, true},
                              mVibrator->daxSetAmplitude(mNumber));
            })
            ->add_option("N", mNumber, "1 to 10000, full strength")
            ->required();
    command(mApp, "force-touch", "set the strength of force-touch feedback",
            [this] {
                return answer({"daxSetForceTouchAmplitude", kAmplitudeRange, true},
                              mVibrator->daxSetForceTouchAmplitude(mNumber));
            })
            ->add_option("N", mNumber, "1 to 10000, full strength")
            ->required();
    command(mApp, "frequency", "choose the frequency type of the motor",
            [this] {
                const auto type = static_cast<DaxFrequencyType>(mNumber);
                return answer({"daxSetFrequencyType", "0 to 4", true},
                              mVibrator->daxSetFrequencyType(type));
            })
            ->add_option("TYPE", mNumber, "0 to 4; the driver gives the number its meaning")
            ->required();
    command(mApp, "fold", "tell the driver that the device has been opened or closed",
            [this] {
                const auto state = mWord == "open" ? DaxFolderStatus::FOLDER_OPEN
                                                   : DaxFolderStatus::FOLDER_CLOSE;
                return answer({"daxSetFolderStatus", nullptr, true},
                              mVibrator->daxSetFolderStatus(state));
            })
            ->add_option("STATE", mWord, "open or close")
            ->required()
            ->check(CLI::IsMember({"open", "close"}));
}

void Client::addPrebakedCommands() {
    CLI::App* prebaked = mApp.add_subcommand("prebaked", "patterns stored in the driver");
    prebaked->require_subcommand(1);
    prebaked->fallthrough();
    command(*prebaked, "count", "tell how many there are", [this] { return countPrebaked(); });
    CLI::App* play = command(*prebaked, "play", "play one of them", [this] {
        return answer({"daxPerformPrebakedHapticPattern", "the amplitude is 1 to 10000", true},
                      mVibrator->daxPerformPrebakedHapticPattern(mNumber, mAmplitude, mRepeat));
    });
    play->add_option("PATTERN", mNumber, "number of the pattern; 0 selects without playing")
            ->required();
    play->add_option("--amplitude", mAmplitude, "1 to 10000, full strength")->capture_default_str();
    play->add_flag("--repeat", mRepeat, "play it through the driver's queue");
}

void Client::addEngineCommand() {
    CLI::App* engineCommand = command(mApp, "engine", "play a waveform packet by packet",
                                      [this] { return engine(); });
    engineCommand->add_option("PACKETS", mPackets,
                              "packets, each PARAM0,INTENSITY,PARAM2,PARAM3 in whole numbers");
    engineCommand->add_option("--file", mFile,
                              "CSV or JSON file with the packets, - for standard input");
    engineCommand->add_option("--amplitude", mAmplitude, "1 to 10000; scales the intensities")
            ->capture_default_str();
    engineCommand->footer("Packets that begin with a minus sign stand behind --.");
}

void Client::addTools() {
    const char* simulation = getenv("VIBRATOR_SIM_DIR");
    mSimulation = simulation == nullptr ? "" : simulation;
    command(mApp, "doctor", "examine the driver's nodes, and say what is wrong and what to do",
            [this] { return doctor(); });

    CLI::App* watchCommand = command(mApp, "watch", "show the service's node traffic as it comes",
                                     [this] { return watchTraffic(); });
    watchCommand->add_option("FILE", mFile,
                             "trace of the simulated driver (default: the one in "
                             "VIBRATOR_SIM_DIR), - for standard input");
    watchCommand->add_flag("--log", mSource.isLog, "FILE is the daemon's log, as on a device");
    watchCommand->add_flag("--all", mSource.fromStart, "show what is there already, too");
    watchCommand->add_flag("--once", mSource.once, "end instead of waiting for more");

    CLI::App* plotCommand =
            command(mApp, "plot", "draw what the motor did", [this] { return plot(); });
    plotCommand->add_option("TRACE", mFile, "trace of the simulated driver, - for standard input")
            ->required();
    plotCommand->add_option("-o,--output", mOutput,
                            "file to draw to, .svg or .png (default: as text on the terminal)");

    CLI::App* playCommand = command(mApp, "play", "play a score", [this] { return play(); });
    playCommand->add_option("SCORE", mFile, "file with a step a line, - for standard input")
            ->required();
    playCommand->add_flag("--check", mCheck, "only say whether it can be played");
    playCommand->footer(
            "Steps: click [light|medium|strong], on MS, off, wait MS, amplitude N, intensity N,\n"
            "pattern N [AMPLITUDE] [repeat], engine AMPLITUDE PACKET... -- a step a line; # begins "
            "a\n"
            "comment. The whole score is checked before the first call.");

    CLI::App* completion =
            command(mApp, "completion", "print a completion script for a shell", [this] {
                std::cout << completionScript(mApp, "vibratorctl", mWord);
                return kSuccess;
            });
    completion->add_option("SHELL", mWord, "bash or zsh")
            ->required()
            ->check(CLI::IsMember({"bash", "zsh"}));
}

int Client::answer(const Call& call, const Return<VibratorStatus>& result) {
    if (!result.isOk()) return mReport.unreachable(call.operation, result.description());
    return mReport.answer(call, result);
}

int Client::effect(uint32_t number, const std::string& version) {
    VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
    uint32_t length = 0;
    const auto take = [&](VibratorStatus answered, uint32_t lengthMs) {
        status = answered;
        length = lengthMs;
    };
    namespace platform = ::android::hardware::vibrator;
    const Return<void> result =
            version == "1.1"
                    ? mVibrator->perform_1_1(platform::V1_1::Effect_1_1{number}, mStrength, take)
            : version == "1.2"
                    ? mVibrator->perform_1_2(platform::V1_2::Effect{number}, mStrength, take)
            : version == "1.3"
                    ? mVibrator->perform_1_3(platform::V1_3::Effect{number}, mStrength, take)
                    : mVibrator->perform(platform::V1_0::Effect{number}, mStrength, take);
    if (!result.isOk()) return mReport.unreachable("perform", result.description());
    return mReport.answer({"perform"}, status, {{"lengthMs", length}});
}

int Client::supports() {
    using Query = Return<bool> (IDaxVibrator::*)();
    const std::pair<const char*, Query> queries[] = {
            {"supportsAmplitudeControl", &IDaxVibrator::supportsAmplitudeControl},
            {"supportsExternalControl", &IDaxVibrator::supportsExternalControl},
            {"daxSupportsAmplitudeControl", &IDaxVibrator::daxSupportsAmplitudeControl},
            {"daxSupportsForceTouchAmplitudeControl",
             &IDaxVibrator::daxSupportsForceTouchAmplitudeControl},
            {"daxSupportsFrequencyControl", &IDaxVibrator::daxSupportsFrequencyControl},
            {"daxSupportsHapticEngine", &IDaxVibrator::daxSupportsHapticEngine},
            {"daxSupportsPrebakedHapticPattern", &IDaxVibrator::daxSupportsPrebakedHapticPattern},
            {"daxSupportsFolderStatusSetting", &IDaxVibrator::daxSupportsFolderStatusSetting},
            {"daxSupportsEnhancedVelmoraHapticPattern",
             &IDaxVibrator::daxSupportsEnhancedVelmoraHapticPattern},
    };
    ordered_json answers;
    for (const auto& [name, query] : queries) {
        const Return<bool> answer = (*mVibrator.*query)();
        if (!answer.isOk()) return mReport.unreachable(name, answer.description());
        answers[name] = static_cast<bool>(answer);
    }
    if (getuid() != 0 && getuid() != 1000) {
        mReport.note("To uid " + std::to_string(getuid()) +
                     " the service says no to all but supportsExternalControl, whatever there is.");
    }
    return mReport.values(answers);
}

int Client::status() {
    ordered_json chain = ordered_json::array();
    const Return<void> result = mVibrator->interfaceChain([&](const auto& descriptors) {
        for (const auto& descriptor : descriptors)
            chain.push_back(descriptor.c_str());
    });
    if (!result.isOk()) return mReport.unreachable("interfaceChain", result.description());
    return mReport.values({{"instance", mInstance},
                           {"answers", mVibrator->ping().isOk()},
                           {"interfaces", chain}});
}

/** Asks for a ladder. @return it, null where there is none; not OK when nobody answers. */
Return<void> askLadder(const sp<IDaxVibrator>& vibrator, uint32_t type, ordered_json* ladder) {
    return vibrator->daxGetAmplitudeList(DaxAmplitudeType{type},
                                         [&](bool supported, const hidl_vec<uint32_t>& amplitudes) {
                                             if (!supported) return;
                                             *ladder = std::vector<uint32_t>(amplitudes);
                                         });
}

int Client::ladder(uint32_t type) {
    ordered_json ladder;
    const Return<void> result = askLadder(mVibrator, type, &ladder);
    const Call call{"daxGetAmplitudeList", "the type is 0 or 1", true};
    if (!result.isOk()) return mReport.unreachable(call.operation, result.description());
    if (!ladder.is_null()) return mReport.answer(call, VibratorStatus::OK, {{"ladder", ladder}});
    return mReport.answer(
            call, type > 1 ? VibratorStatus::BAD_VALUE : VibratorStatus::UNSUPPORTED_OPERATION);
}

int Client::motor() {
    ordered_json known;
    for (const uint32_t type : {0U, 1U}) {
        ordered_json ladder;
        const Return<void> result = askLadder(mVibrator, type, &ladder);
        if (!result.isOk()) {
            return mReport.unreachable("daxGetAmplitudeList", result.description());
        }
        known["ladder" + std::to_string(type)] = ladder.is_null() ? ordered_json::array() : ladder;
    }
    const Return<bool> enhanced = mVibrator->daxSupportsEnhancedVelmoraHapticPattern();
    if (!enhanced.isOk()) {
        return mReport.unreachable("daxSupportsEnhancedVelmoraHapticPattern",
                                   enhanced.description());
    }
    known["enhancedPatterns"] = static_cast<bool>(enhanced);
    return mReport.values(known);
}

int Client::countPrebaked() {
    VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
    uint32_t count = 0;
    const Call call{"daxGetNumberOfPrebakedHapticPattern", nullptr, true};
    const Return<void> result = mVibrator->daxGetNumberOfPrebakedHapticPattern(
            [&](VibratorStatus answered, uint32_t patterns) {
                status = answered;
                count = patterns;
            });
    if (!result.isOk()) return mReport.unreachable(call.operation, result.description());
    return mReport.answer(call, status, {{"count", count}});
}

/** Reads a file, or standard input for "-"; complains where it cannot. @return whether it could. */
bool readInput(const std::string& name, std::string* text) {
    std::ifstream file(name);
    std::istream& input = name == "-" ? std::cin : file;
    input.peek();
    if (input.bad() || (name != "-" && !file.is_open())) {
        std::cerr << "vibratorctl: " << name << ": cannot be read\n";
        return false;
    }
    std::ostringstream all;
    all << input.rdbuf();
    *text = all.str();
    return true;
}

int Client::engine() {
    if (mPackets.empty() && mFile.empty()) {
        std::cerr << "vibratorctl: no packets: give some, or a file of them with --file\n";
        return kUsage;
    }
    HapticEnginePackets packets;
    std::string error;
    for (const std::string& packet : mPackets) {
        if (!parsePacket(packet, &packets, &error)) {
            std::cerr << "vibratorctl: " << error << '\n';
            return kUsage;
        }
    }
    if (!mFile.empty()) {
        std::string text;
        if (!readInput(mFile, &text)) return kUsage;
        if (!parsePackets(text, &packets, &error)) {
            std::cerr << "vibratorctl: " << mFile << ": " << error << '\n';
            return kUsage;
        }
    }
    return answer(
            {"daxPerformHapticEngine",
             "at most 339 packets, an amplitude of 1 to 10000, values of at most 8 characters",
             true},
            mVibrator->daxPerformHapticEngine(packets, mAmplitude));
}

int Client::doctor() {
    const Return<void> service = mVibrator->ping();
    const ordered_json found = examine(mSimulation, service.isOk() ? "" : service.description());
    if (mJson) {
        mReport.values(found);
    } else {
        std::cout << examinationInWords(found);
    }
    return found["findings"].empty() ? kSuccess : kRefused;
}

int Client::watchTraffic() {
    mSource.file = mFile;
    if (mFile.empty()) {
        if (mSource.isLog || mSimulation.empty()) {
            std::cerr << "vibratorctl: no FILE: name a trace, or a log with --log\n";
            return kUsage;
        }
        mSource.file = simulator::traceFile(mSimulation);
    }
    return watch(mSource);
}

int Client::plot() {
    std::string text;
    if (!readInput(mFile, &text)) return kUsage;
    std::vector<NodeAccess> accesses;
    TraceReader reader;
    std::istringstream lines(text);
    for (std::string line; std::getline(lines, line);) {
        if (auto access = reader.read(line)) accesses.push_back(std::move(*access));
    }
    const Timeline timeline = makeTimeline(accesses);
    if (timeline.marks.empty()) {
        std::cerr << "vibratorctl: " << mFile << ": no write that a driver has taken is in it\n";
        return kUsage;
    }
    if (mOutput.empty()) {
        winsize window{};
        const bool known = ioctl(STDOUT_FILENO, TIOCGWINSZ, &window) == 0 && window.ws_col > 0;
        std::cout << plotText(timeline, known ? window.ws_col : 80U);
        return kSuccess;
    }
    const std::string ending =
            mOutput.size() < 4 ? std::string() : mOutput.substr(mOutput.size() - 4);
    std::string error;
    if (ending == ".png") {
        error = writePng(plotSvg(timeline), mOutput);
    } else if (ending == ".svg") {
        std::ofstream file(mOutput);
        if (!(file << plotSvg(timeline)).flush()) error = "cannot be written";
    } else {
        error = "neither .svg nor .png";
    }
    if (error.empty()) return kSuccess;
    std::cerr << "vibratorctl: " << mOutput << ": " << error << '\n';
    return kUsage;
}

int Client::play() {
    std::string text;
    if (!readInput(mFile, &text)) return kUsage;
    std::vector<ScoreStep> steps;
    const std::vector<ScoreError> errors = parseScore(text, &steps);
    for (const ScoreError& error : errors) {
        std::cerr << mFile << ':' << error.line << ':' << error.column << ": " << error.what
                  << '\n';
    }
    if (!errors.empty()) return kUsage;
    if (mCheck) return kSuccess;
    for (const ScoreStep& step : steps) {
        const int code = playStep(step);
        if (code != kSuccess) return code;
    }
    return kSuccess;
}

int Client::playStep(const ScoreStep& step) {
    switch (step.kind) {
        case ScoreStep::kClick:
            mStrength = step.strength;
            return effect(0, "1.0");
        case ScoreStep::kOn:
            return answer({"on"}, mVibrator->on(step.number));
        case ScoreStep::kOff:
            return answer({"off"}, mVibrator->off());
        case ScoreStep::kAmplitude:
            return answer({"setAmplitude", "1 to 255", true},
                          mVibrator->setAmplitude(static_cast<uint8_t>(step.number)));
        case ScoreStep::kIntensity:
            return answer({"daxSetAmplitude", kAmplitudeRange, true},
                          mVibrator->daxSetAmplitude(step.number));
        case ScoreStep::kPattern:
            return answer({"daxPerformPrebakedHapticPattern", kAmplitudeRange, true},
                          mVibrator->daxPerformPrebakedHapticPattern(step.number, step.amplitude,
                                                                     step.repeat));
        case ScoreStep::kEngine:
            return answer({"daxPerformHapticEngine", kAmplitudeRange, true},
                          mVibrator->daxPerformHapticEngine(step.packets, step.amplitude));
        default:
            std::this_thread::sleep_for(std::chrono::milliseconds(step.number));
            return kSuccess;
    }
}

}  // namespace

int main(int argc, char** argv) {
    try {
        return Client().run(argc, argv);
    } catch (const std::exception& error) {
        // Like text that is no UTF-8 and so no JSON.
        std::fprintf(stderr, "vibratorctl: %s\n", error.what());
        return kUsage;
    }
}
