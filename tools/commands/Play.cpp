// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Input.h"
#include "text/Text.h"

#include <algorithm>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <iostream>
#include <string>
#include <system_error>
#include <thread>

namespace vibratorctl {

namespace {

volatile std::sig_atomic_t interruption = 0;

/** Makes the signals that end a program stop the play first; a second one ends it at once. Signals
 * that are ignored, as under nohup, stay ignored. */
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

int playStep(Client& client, const ScoreStep& step) {
    if (step.command == nullptr) {
        wait(step.pause);
        return client.report().found("", {{"argument", step.argument()}});
    }
    // Other steps may have set the command's arguments.
    step.command->readStep(step.words);
    return step.command->perform();
}

/** Stops the motor, and says why. @return the exit code. */
int stop(const Client& client, const char* status, const std::string& why) {
    bool isStopped = false;
    try {
        isStopped = reached(client.service()->off()) == VibratorStatus::OK;
    } catch (const Unreachable&) {
        // The same as a refusal.
    }
    client.complain(status, why + (isStopped ? "; the motor is stopped"
                                             : "; the motor could not be stopped"));
    return cli::kFailed;
}

/** Plays one step, and reports it. @return the exit code. @throw Unreachable */
int playReported(Client& client, const ScoreStep& step, const std::string& place) {
    const Subject play = client.report().setSubject({step.name, step.argument(), step.place()});
    try {
        const int code = playStep(client, step);
        client.report().setSubject(play);
        std::cout.flush();
        return code;
    } catch (const Unreachable& error) {
        throw Unreachable(std::string(error.what()) + ", at " + place);
    }
}

/**
 * Plays the steps of a score, and reports each with its place in the file.
 *
 * @param keepsGoing whether it passes over steps that fail, and names them at the end.
 */
int playScore(Client& client, const std::string& file, const Score& score, bool keepsGoing) {
    std::vector<std::string> failed;
    catchInterruptions();
    for (const uint32_t index : score.order) {
        const ScoreStep& step = score.lines[index];
        const std::string place = std::to_string(step.line) + ":" + std::to_string(step.column);
        const int code = playReported(client, step, file + ":" + place);
        if (code != cli::kSuccess && !keepsGoing) {
            return stop(client, "FAILED", file + ":" + place + ": the step failed");
        }
        const std::string name = step.name + " at " + place;
        if (code != cli::kSuccess && std::count(failed.begin(), failed.end(), name) == 0)
            failed.push_back(name);
        if (interruption != 0) {
            stop(client, "INTERRUPTED", "interrupted at " + file + ":" + place);
            std::signal(interruption, SIG_DFL);
            return raise(interruption);
        }
    }
    if (failed.empty()) return cli::kSuccess;
    client.complain("FAILED", file + ": passed over " + cli::join(failed, ", ", " and "));
    return cli::kFailed;
}

int play(Client& client, const std::string& file, bool isCheck, bool keepsGoing) {
    Score score;
    const auto errors = parseScore(readInput(file), client.steps, &score);
    for (const ScoreError& error : errors) {
        client.complain("USAGE", file + ":" + std::to_string(error.line) + ":" +
                                         std::to_string(error.column) + ": " + error.what);
    }
    if (errors.size() == kMaxScoreErrors) {
        client.warn("play: " + file + ": only the first " + std::to_string(kMaxScoreErrors) +
                    " mistakes are shown");
    }
    if (!errors.empty()) return cli::kUsage;
    if (!isCheck) return playScore(client, file, score, keepsGoing);
    const size_t steps = score.order.size();
    return client.report().found("OK, " + std::to_string(steps) +
                                         (steps == 1 ? " step, " : " steps, ") +
                                         cli::durationInWords(score.seconds()) + "\n",
                                 {{"steps", steps}, {"seconds", score.seconds()}});
}

/** @return where a score is: beside the installed client, or else in the source. */
std::string exampleScore() {
    constexpr char kScore[] = "docs/examples/clicks.score";
    std::error_code error;
    const auto program = std::filesystem::read_symlink("/proc/self/exe", error);
    const auto prefix = program.parent_path().parent_path();
    const std::string installed = prefix / "share/doc/vibrator-service" / kScore;
    return std::filesystem::exists(installed, error) ? installed : kScore;
}

}  // namespace

void wait(uint32_t ms) {
    constexpr auto kSlice = std::chrono::milliseconds(20);
    const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(ms);
    while (interruption == 0) {
        const auto left = end - std::chrono::steady_clock::now();
        if (left.count() <= 0) return;
        std::this_thread::sleep_for(std::min<std::chrono::nanoseconds>(left, kSlice));
    }
}

void addPlay(Client& client) {
    cli::Command& command = client.command(kTools, "play", "play a score", exampleScore());
    const auto* const file =
            command.add("SCORE", cli::kFile, "file with a step a line, - for standard input");
    const auto* const check =
            command.add("--check", cli::kFlag, "only check the score, and print how long it takes");
    const auto* const keepsGoing = command.add(
            "--keep-going", cli::kFlag, "pass over steps that fail, and name them at the end");
    command.note(
            "Steps: click [light|medium|strong], on MS [STRENGTH] [wait], off, wait MS, amplitude "
            "N, intensity N, pattern N [INTENSITY] [repeat], engine INTENSITY PACKET..., external "
            "on|off, frequency N, force-touch N, fold open|close; the steps between repeat N and "
            "end are played N times; # begins a comment. The whole score is checked before the "
            "first call. The motor is stopped when a step fails or the play is interrupted.");
    command.run([=, &client] {
        return play(client, file->text(), check->isGiven(), keepsGoing->isGiven());
    });
}

}  // namespace vibratorctl
