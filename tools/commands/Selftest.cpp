// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "service/Queries.h"
#include "service/Reasons.h"
#include "text/Text.h"

#include <hidl/HidlSupport.h>
#include <private/android_filesystem_config.h>
#include <unistd.h>

#include <chrono>
#include <cstdlib>
#include <future>
#include <iostream>
#include <map>
#include <thread>
#include <utility>

namespace vibratorctl {

namespace {

using ::android::hardware::vibrator::V1_0::EffectStrength;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
using Ask = VibratorStatus (*)(IDaxVibrator&);

/** A call, and what the driver's node holds after it. */
struct Trial {
    const char* name;
    Ask call;
    /** Empty for arguments out of range, which the service refuses. */
    const char* node = "";
    const char* text = "";
    /** Whether it moves the motor. */
    bool moves = false;
    bool isRestricted = true;
};

template <auto Operation, auto... Given>
VibratorStatus ask(IDaxVibrator& vibrator) {
    return reached((vibrator.*Operation)(Given...));
}

VibratorStatus playPacket(IDaxVibrator& vibrator) {
    return reached(vibrator.daxPerformHapticEngine({{20, 5000, 150, 0}}, product::kMaxAmplitude));
}

using I = IDaxVibrator;
using Clock = std::chrono::steady_clock;

struct Recipient : ::android::hardware::hidl_death_recipient {
    void serviceDied(uint64_t /* cookie */,
                     const ::android::wp<::android::hidl::base::V1_0::IBase>& /* who */) override {
        notice.set_value();
    }
    std::promise<void> notice;
};

const Trial kTrials[] = {
        {"setAmplitude 128", ask<&I::setAmplitude, 128>, "intensity", "5001"},
        {"daxSetAmplitude 7000", ask<&I::daxSetAmplitude, 7000U>, "intensity", "7000"},
        {"daxSetAmplitude 10001", ask<&I::daxSetAmplitude, 10001U>},
        {"daxSetForceTouchAmplitude 6000", ask<&I::daxSetForceTouchAmplitude, 6000U>,
         "force_touch_intensity", "6000"},
        {"daxSetForceTouchAmplitude 0", ask<&I::daxSetForceTouchAmplitude, 0U>},
        {"daxSetFrequencyType 1", ask<&I::daxSetFrequencyType, DaxFrequencyType::TYPE_1>,
         "multi_freq", "1"},
        {"daxSetFrequencyType 5", ask<&I::daxSetFrequencyType, static_cast<DaxFrequencyType>(5)>},
        {"daxSetFolderStatus open", ask<&I::daxSetFolderStatus, DaxFolderStatus::FOLDER_OPEN>,
         "event_cmd", "FOLDER_OPEN"},
        {"daxSetFolderStatus 2", ask<&I::daxSetFolderStatus, static_cast<DaxFolderStatus>(2)>},
        {"setExternalControl on", ask<&I::setExternalControl, true>, "ext_control", "1", false,
         false},
        {"setExternalControl off", ask<&I::setExternalControl, false>, "ext_control", "0", false,
         false},
        {"daxPerformPrebakedHapticPattern 1",
         ask<&I::daxPerformPrebakedHapticPattern, 1U, 5000U, false>, "cp_trigger_index", "1", true},
        // The last of these, since 0 is what the node holds at first.
        {"daxPerformPrebakedHapticPattern 0",
         ask<&I::daxPerformPrebakedHapticPattern, 0U, 5000U, false>, "cp_trigger_index", "0"},
        {"daxPerformHapticEngine", playPacket, "haptic_engine", "4 20 5000 150 0", true},
};

/** Checks a board: each operation, by what the driver offers. */
class Selftest {
  public:
    Selftest(Client& client, bool isQuiet, bool asks, std::string restart)
        : mClient(client),
          mVibrator(client.service()),
          mDriver(driverOf(*mVibrator)),
          mIsQuiet(isQuiet),
          mAsks(asks),
          mRestart(std::move(restart)) {}

    /** @return the exit code. */
    int run() {
        mBefore = look();
        checkInterfaces();
        for (const auto& [question, wanted, got] : compareAnswers(*mVibrator, mDriver))
            expect(question, wanted, got);
        // The LED trigger keeps its duration, and then counts as running.
        ask<&I::on, 0>(*mVibrator);
        for (const Trial& trial : kTrials)
            tryOut(trial);
        checkMotor();
        checkCallers();
        restore();
        checkRestart();
        return mClient.report().found(std::to_string(mCounts["passed"]) + " passed, " +
                                              std::to_string(mCounts["failed"]) + " failed, " +
                                              std::to_string(mCounts["skipped"]) + " skipped\n",
                                      mCounts, mCounts["failed"] == 0);
    }

  private:
    /** What is told of a check. */
    void tell(const std::string& result, const std::string& name, const std::string& details) {
        ++mCounts[result];
        mClient.report().found(result + std::string(9 - result.size(), ' ') + name +
                                       (details.empty() ? "" : ": " + details) + "\n",
                               {{"ok", result != "failed"},
                                {"check", name},
                                {"result", result},
                                {"details", details}});
    }
    void expect(const std::string& name, bool wanted, bool got) {
        expect(name, std::string(wanted ? "yes" : "no"), std::string(got ? "yes" : "no"));
    }
    void expect(const std::string& name, const std::string& wanted, const std::string& got) {
        tell(wanted == got ? "passed" : "failed", name,
             wanted == got ? "" : got + ", not " + wanted);
    }

    void checkInterfaces();
    /** @return what each node of the driver holds, by its leaf. */
    std::map<std::string, std::string> look() const;
    void tryOut(const Trial& trial);
    void checkTime(const char* node);
    void checkMotor();
    void checkCallers();
    void restore();
    void checkRestart();

    Client& mClient;
    const ::android::sp<IDaxVibrator> mVibrator;
    const LocalDriver mDriver;
    const bool mIsQuiet;
    const bool mAsks;
    /** A command that restarts the service; empty if nobody has given one. */
    const std::string mRestart;
    const ::android::sp<Recipient> mRecipient = new Recipient;
    /** How many checks passed, failed and were skipped. */
    std::map<std::string, size_t> mCounts = {{"passed", 0}, {"failed", 0}, {"skipped", 0}};
    /** What the nodes held at first. */
    std::map<std::string, std::string> mBefore;
};

/** Compares what the service says of its interfaces with what this client was built with. */
void Selftest::checkInterfaces() {
    std::vector<std::string> wanted;
    std::vector<std::string> got;
    std::vector<::android::hardware::hidl_array<uint8_t, 32>> built;
    std::vector<::android::hardware::hidl_array<uint8_t, 32>> reported;
    const auto into = [](auto& list) {
        return [&list](const auto& given) { list.assign(given.begin(), given.end()); };
    };
    mVibrator->IDaxVibrator::interfaceChain(into(wanted));
    reached(mVibrator->interfaceChain(into(got)));
    mVibrator->IDaxVibrator::getHashChain(into(built));
    reached(mVibrator->getHashChain(into(reported)));
    expect("interface chain", cli::join(wanted, " ", " "), cli::join(got, " ", " "));
    expect("a hash of each interface", std::to_string(wanted.size()),
           std::to_string(reported.size()));
    // A device has the platform's own packages; these two are the service's.
    constexpr size_t kOurs = 2;
    built.resize(kOurs);
    reported.resize(kOurs);
    expect("the service's own interfaces are those of this client", true, built == reported);
    using Platform = ::android::hardware::vibrator::V1_0::IVibrator;
    expect("found by the platform's interface", true,
           Platform::tryGetService(mClient.instance()) != nullptr);
    expect("death notice", true, reached(mVibrator->linkToDeath(mRecipient, 0)));
}

std::map<std::string, std::string> Selftest::look() const {
    std::map<std::string, std::string> values;
    for (const product::NodeInfo& node : product::NodePathTable)
        values[node.leaf] = mDriver.look(node.leaf).firstLine();
    return values;
}

void Selftest::tryOut(const Trial& trial) {
    if (trial.isRestricted && !mayCallRestricted())
        return tell("skipped", trial.name, notPermitted());
    if (trial.moves && mIsQuiet) return tell("skipped", trial.name, "it moves the motor");
    const bool isRefused = *trial.node == '\0';
    auto before = look();
    const VibratorStatus status = trial.call(*mVibrator);
    if (!isRefused && !mDriver.look(trial.node).exists && status != VibratorStatus::OK)
        return tell("skipped", trial.name, std::string("this driver has no node ") + trial.node);
    expect(trial.name, isRefused ? "BAD_VALUE" : "OK", toString(status));
    auto after = look();
    if (!isRefused && status == VibratorStatus::OK)
        expect(std::string(trial.node) + " after it", trial.text, after[trial.node]);
    for (const product::NodeInfo& node : product::NodePathTable) {
        // A pattern also sets the intensity, and starts the motor.
        const bool mayChange = node.onlyMode || node.leaf == std::string("intensity") ||
                               node.leaf == std::string(trial.node);
        if (!mayChange && after[node.leaf] != before[node.leaf])
            tell("failed", trial.name, std::string("it changes ") + node.leaf + ", too");
    }
    if (trial.moves) ask<&I::off>(*mVibrator);
}

/** Checks how long a run of 300 ms lasts. */
void Selftest::checkTime(const char* node) {
    constexpr long kMs = 300;
    // A timer of the kernel is late by some ms, and so is the look at it on a busy machine.
    constexpr long kLate = 150;
    const auto start = Clock::now();
    const VibratorStatus status = ask<&I::on, kMs>(*mVibrator);
    expect("on 300", "OK", toString(status));
    if (status != VibratorStatus::OK) return;
    const auto latest = start + std::chrono::milliseconds(kMs + kLate);
    while (mDriver.look(node).firstLine() != "0" && Clock::now() < latest)
        std::this_thread::sleep_for(std::chrono::milliseconds(1));
    const auto time = Clock::now() - start;
    const auto ms = std::chrono::duration_cast<std::chrono::milliseconds>(time).count();
    tell(ms >= kMs - 1 && ms < kMs + kLate ? "passed" : "failed", "it ran for 300 ms",
         std::to_string(ms) + " ms");
}

void Selftest::checkMotor() {
    if (mIsQuiet) return tell("skipped", "on", "it moves the motor");
    const char* const node = mDriver.layout().start;
    checkTime(node);
    ask<&I::on, 1000>(*mVibrator);
    expect("off", "OK", toString(ask<&I::off>(*mVibrator)));
    expect(std::string(node) + " after it", "0", mDriver.look(node).firstLine());
    std::string click;
    reached(mVibrator->perform(::android::hardware::vibrator::V1_0::Effect::CLICK,
                               EffectStrength::STRONG, [&](VibratorStatus status, uint32_t ms) {
                                   click = toString(status) + ", " + std::to_string(ms) + " ms";
                               }));
    expect("click", "OK, 20 ms", click);
    if (!mAsks) return;
    std::cerr << "did it move? [y/N] ";
    std::string answer;
    std::getline(std::cin, answer);
    expect("the motor moved", "y", answer.substr(0, 1));
}

/** Calls as the system user and as one who may do little. */
void Selftest::checkCallers() {
    if (geteuid() != 0) return tell("skipped", "callers", "only root can be another user");
    const bool hasIntensity = mDriver.daxSupportsAmplitudeControl();
    for (const uid_t uid : {AID_SYSTEM, AID_SHELL}) {
        if (seteuid(uid) != 0) continue;
        const bool mayAsk = uid == AID_SYSTEM && hasIntensity;
        const std::string user = "uid " + std::to_string(uid) + ": ";
        expect(user + "daxSupportsAmplitudeControl", mayAsk,
               reached(mVibrator->daxSupportsAmplitudeControl()));
        expect(user + "daxSetAmplitude", mayAsk ? "OK" : "UNKNOWN_ERROR",
               toString(ask<&I::daxSetAmplitude, 5000U>(*mVibrator)));
        expect(user + "on 0", "OK", toString(ask<&I::on, 0>(*mVibrator)));
        if (seteuid(0) != 0) std::abort();
    }
}

void Selftest::restore() {
    const auto number = [&](const char* node) {
        return static_cast<uint32_t>(atoi(mBefore[node].c_str()));
    };
    ask<&I::on, 0>(*mVibrator);
    ask<&I::off>(*mVibrator);
    mVibrator->daxSetAmplitude(number("intensity"));
    mVibrator->daxSetForceTouchAmplitude(number("force_touch_intensity"));
    mVibrator->daxSetFrequencyType(static_cast<DaxFrequencyType>(number("multi_freq")));
    const bool isClosed = mBefore["event_cmd"] + "\n" == product::FOLDER_CLOSE_COMMAND;
    mVibrator->daxSetFolderStatus(isClosed ? DaxFolderStatus::FOLDER_CLOSE
                                           : DaxFolderStatus::FOLDER_OPEN);
    mVibrator->setExternalControl(number("ext_control") == 1);
}

/** Checks that the service's end is heard of, and that it comes back. */
void Selftest::checkRestart() {
    constexpr char kName[] = "the service restarts";
    if (mRestart.empty()) return tell("skipped", kName, "--restart COMMAND says how");
    if (system(mRestart.c_str()) != 0)
        return tell("failed", kName, "this failed: " + cli::printable(mRestart));
    constexpr std::chrono::seconds kRestartTime(10);
    expect("death notice of it", true,
           mRecipient->notice.get_future().wait_for(kRestartTime) == std::future_status::ready);
    try {
        const auto restarted = connect(mClient.instance(), kRestartTime);
        expect(kName, "OK", toString(ask<&I::off>(*restarted)));
    } catch (const Unreachable& error) {
        tell("failed", kName, error.what());
    }
}

}  // namespace

void addSelftest(Client& client) {
    cli::Command& command = client.command(
            kTools, "selftest", "check each operation on this board, and restore what was set",
            "--quiet");
    const auto* const quiet =
            command.add("--quiet", cli::kFlag, "do not move the motor; otherwise for 3 s at most");
    const auto* const asks = command.add("--ask", cli::kFlag, "ask whether the motor moved");
    const auto* const restart =
            command.add("--restart COMMAND", cli::kText,
                        "restarts the service with it, and checks that it comes back");
    command.note("Root checks the most: it also calls as uid 1000 and uid 2000.");
    command.run([=, &client] {
        return Selftest(client, quiet->isGiven(), asks->isGiven(), restart->text()).run();
    });
}

}  // namespace vibratorctl
