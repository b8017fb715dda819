// SPDX-License-Identifier: Apache-2.0
#include "Packets.h"
#include "Report.h"

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <unistd.h>

#include <CLI/CLI.hpp>
#include <cstdio>
#include <exception>
#include <fstream>
#include <functional>
#include <iostream>
#include <map>
#include <sstream>
#include <string>
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

    int answer(const Call& call, const Return<VibratorStatus>& result);
    int effect(uint32_t number, const std::string& version);
    int supports();
    int status();
    int ladder(uint32_t type);
    int motor();
    int countPrebaked();
    int engine();

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
        std::ifstream file(mFile);
        std::istream& input = mFile == "-" ? std::cin : file;
        input.peek();
        if (input.bad() || (mFile != "-" && !file.is_open())) {
            std::cerr << "vibratorctl: " << mFile << ": cannot be read\n";
            return kUsage;
        }
        std::ostringstream text;
        text << input.rdbuf();
        if (!parsePackets(text.str(), &packets, &error)) {
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
