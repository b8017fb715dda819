// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Duration.h"
#include "Score.h"

#include <chrono>
#include <csignal>
#include <iostream>
#include <thread>

namespace {

using ::android::hardware::vibrator::V1_0::EffectStrength;
using nlohmann::ordered_json;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;

volatile std::sig_atomic_t interruption = 0;

/** Lets the signals that end a program end the play first; a second one ends it at once. Those that
 * are ignored, as nohup has it, stay so. */
void catchInterruptions() {
    struct sigaction action = {};
    action.sa_handler = [](int signal) { interruption = signal; };
    action.sa_flags = static_cast<int>(SA_RESETHAND);
    for (const int signal : {SIGINT, SIGTERM, SIGHUP, SIGPIPE}) {
        struct sigaction before = {};
        sigaction(signal, nullptr, &before);
        if (before.sa_handler != SIG_IGN) sigaction(signal, &action, nullptr);
    }
}

/** Waits, up to an interruption. */
void wait(uint32_t ms) {
    constexpr auto kSlice = std::chrono::milliseconds(20);
    const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(ms);
    while (interruption == 0) {
        const auto left = end - std::chrono::steady_clock::now();
        if (left.count() <= 0) return;
        std::this_thread::sleep_for(std::min<std::chrono::nanoseconds>(left, kSlice));
    }
}

/** Plays the steps of a score, and reports each with its place in the file. */
class Player {
  public:
    Player(const Client& client, const std::string& file) : mClient(client), mFile(file) {}

    int play(const Score& score) {
        catchInterruptions();
        for (const uint32_t index : score.order) {
            const ScoreStep& step = score.lines[index];
            const std::string place =
                    mFile + ":" + std::to_string(step.line) + ":" + std::to_string(step.column);
            try {
                if (playStep(step) != kSuccess) return stop("FAILED", place + ": the step failed");
            } catch (const Unreachable& error) {
                throw Unreachable(std::string(error.what()) + ", at " + place);
            }
            std::cout.flush();
            if (interruption != 0) {
                stop("INTERRUPTED", "interrupted at " + place);
                std::signal(interruption, SIG_DFL);
                return raise(interruption);
            }
        }
        return kSuccess;
    }

  private:
    /** Stops the motor, and says why. @return the exit code. */
    int stop(const char* status, const std::string& why) {
        bool isStopped = false;
        try {
            isStopped = Client::reached(mClient.service()->off()) == VibratorStatus::OK;
        } catch (const Unreachable&) {
            // As good as refused.
        }
        mClient.report().failure(
                "play", status,
                why + (isStopped ? "; the motor is stopped" : "; the motor could not be stopped"));
        return kRefused;
    }

    int answer(const ScoreStep& step, const char* operation, bool isRestricted,
               const ::android::hardware::Return<VibratorStatus>& status) {
        const Call call{step.name, operation, isRestricted, step.argument};
        return mClient.answer(call, status, {"", {{"line", step.line}, {"column", step.column}}});
    }

    int click(const ScoreStep& step) {
        VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
        Client::reached(mClient.service()->perform(
                ::android::hardware::vibrator::V1_0::Effect::CLICK,
                static_cast<EffectStrength>(step.number),
                [&](VibratorStatus answered, uint32_t /* length */) { status = answered; }));
        return answer(step, "perform", false, status);
    }

    int playStep(const ScoreStep& step) {
        if (step.kind == ScoreStep::kWait) {
            wait(step.number);
            return mClient.report().found(
                    step.name, "",
                    {{"argument", step.argument}, {"line", step.line}, {"column", step.column}});
        }
        const auto vibrator = mClient.service();
        switch (step.kind) {
            case ScoreStep::kClick:
                return click(step);
            case ScoreStep::kOn:
                return answer(step, "on", false, vibrator->on(step.number));
            case ScoreStep::kAmplitude:
                return answer(step, "setAmplitude", true,
                              vibrator->setAmplitude(static_cast<uint8_t>(step.number)));
            case ScoreStep::kIntensity:
                return answer(step, "daxSetAmplitude", true,
                              vibrator->daxSetAmplitude(step.number));
            case ScoreStep::kPattern:
                return answer(step, "daxPerformPrebakedHapticPattern", true,
                              vibrator->daxPerformPrebakedHapticPattern(step.number, step.amplitude,
                                                                        step.repeat));
            case ScoreStep::kEngine:
                return answer(step, "daxPerformHapticEngine", true,
                              vibrator->daxPerformHapticEngine(step.packets, step.amplitude));
            case ScoreStep::kExternal:
                return answer(step, "setExternalControl", false,
                              vibrator->setExternalControl(step.number != 0));
            case ScoreStep::kFrequency:
                return answer(
                        step, "daxSetFrequencyType", true,
                        vibrator->daxSetFrequencyType(static_cast<DaxFrequencyType>(step.number)));
            case ScoreStep::kForceTouch:
                return answer(step, "daxSetForceTouchAmplitude", true,
                              vibrator->daxSetForceTouchAmplitude(step.number));
            case ScoreStep::kFold:
                return answer(
                        step, "daxSetFolderStatus", true,
                        vibrator->daxSetFolderStatus(static_cast<DaxFolderStatus>(step.number)));
            default:
                return answer(step, "off", false, vibrator->off());
        }
    }

    const Client& mClient;
    const std::string& mFile;
};

int play(const Client& client, const std::string& file, bool isCheck) {
    Score score;
    const std::vector<ScoreError> errors = parseScore(readInput(file), &score);
    for (const ScoreError& error : errors) {
        client.report().failure("play", "USAGE",
                                file + ":" + std::to_string(error.line) + ":" +
                                        std::to_string(error.column) + ": " + error.what);
    }
    if (errors.size() == kMostScoreErrors) {
        client.report().warn("play: " + file + ": only the first 20 mistakes are shown");
    }
    if (!errors.empty()) return kUsage;
    if (!isCheck) return Player(client, file).play(score);
    const size_t steps = score.order.size();
    return client.report().found("play",
                                 "OK, " + std::to_string(steps) +
                                         (steps == 1 ? " step, " : " steps, ") +
                                         durationInWords(score.seconds()) + "\n",
                                 {{"steps", steps}, {"seconds", score.seconds()}});
}

}  // namespace

void addPlay(Client& client) {
    cli::Command& command =
            client.program().command(kTools, "play", "play a score", "docs/examples/clicks.score");
    const auto file = command.file("SCORE", "file with a step a line, - for standard input");
    const auto check = command.flag("--check", "only say whether it can be played, and how long");
    command.note(
            "Steps: click [light|medium|strong], on MS, off, wait MS, amplitude N, intensity N, "
            "pattern N [AMPLITUDE] [repeat], engine AMPLITUDE PACKET..., external on|off, "
            "frequency N, force-touch N, fold open|close; repeat N and end stand around steps that "
            "are played N times; # begins a comment. The whole score is checked before the first "
            "call. The motor is stopped when a step fails or the play is interrupted.");
    command.run([=, &client] { return play(client, *file, *check); });
}
