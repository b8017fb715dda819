// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Input.h"
#include "text/Text.h"

#include <chrono>
#include <csignal>
#include <iostream>
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

/** Waits, unless interrupted. */
void wait(uint32_t ms) {
    constexpr auto kSlice = std::chrono::milliseconds(20);
    const auto end = std::chrono::steady_clock::now() + std::chrono::milliseconds(ms);
    while (interruption == 0) {
        const auto left = end - std::chrono::steady_clock::now();
        if (left.count() <= 0) return;
        std::this_thread::sleep_for(std::min<std::chrono::nanoseconds>(left, kSlice));
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

/** Plays the steps of a score, and reports each with its place in the file. */
int playScore(Client& client, const std::string& file, const Score& score) {
    catchInterruptions();
    for (const uint32_t index : score.order) {
        const ScoreStep& step = score.lines[index];
        const std::string place =
                file + ":" + std::to_string(step.line) + ":" + std::to_string(step.column);
        int code = cli::kSuccess;
        const Subject play = client.report().setSubject({step.name, step.argument(), step.place()});
        try {
            code = playStep(client, step);
        } catch (const Unreachable& error) {
            throw Unreachable(std::string(error.what()) + ", at " + place);
        }
        client.report().setSubject(play);
        if (code != cli::kSuccess) return stop(client, "FAILED", place + ": the step failed");
        std::cout.flush();
        if (interruption != 0) {
            stop(client, "INTERRUPTED", "interrupted at " + place);
            std::signal(interruption, SIG_DFL);
            return raise(interruption);
        }
    }
    return cli::kSuccess;
}

int play(Client& client, const std::string& file, bool isCheck) {
    Score score;
    const auto errors = parseScore(readInput(file), client.steps, &score);
    for (const ScoreError& error : errors) {
        client.complain("USAGE", file + ":" + std::to_string(error.line) + ":" +
                                         std::to_string(error.column) + ": " + error.what);
    }
    if (errors.size() == kMostScoreErrors) {
        client.warn("play: " + file + ": only the first 20 mistakes are shown");
    }
    if (!errors.empty()) return cli::kUsage;
    if (!isCheck) return playScore(client, file, score);
    const size_t steps = score.order.size();
    return client.report().found("OK, " + std::to_string(steps) +
                                         (steps == 1 ? " step, " : " steps, ") +
                                         cli::durationInWords(score.seconds()) + "\n",
                                 {{"steps", steps}, {"seconds", score.seconds()}});
}

}  // namespace

void addPlay(Client& client) {
    cli::Command& command =
            client.command(kTools, "play", "play a score", "docs/examples/clicks.score");
    const auto file = command.file("SCORE", "file with a step a line, - for standard input");
    const auto check = command.flag("--check", "only check the score, and print how long it takes");
    command.note(
            "Steps: click [light|medium|strong], on MS, off, wait MS, amplitude N, intensity N, "
            "pattern N [AMPLITUDE] [repeat], engine AMPLITUDE PACKET..., external on|off, "
            "frequency N, force-touch N, fold open|close; the steps between repeat N and end are "
            "played N times; # begins a comment. The whole score is checked before the first call. "
            "The motor is stopped when a step fails or the play is interrupted.");
    command.run([=, &client] { return play(client, *file, *check); });
}

}  // namespace vibratorctl
