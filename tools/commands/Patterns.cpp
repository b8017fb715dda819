// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "scores/Packets.h"

#include <algorithm>

namespace vibratorctl {

namespace {

/** @return the status of the query for the number of stored patterns. */
VibratorStatus countPatterns(const Client& client, uint32_t* count) {
    VibratorStatus status = VibratorStatus::UNKNOWN_ERROR;
    reached(client.service()->daxGetNumberOfPrebakedHapticPattern(
            [&](VibratorStatus answered, uint32_t patterns) {
                status = answered;
                *count = patterns;
            }));
    return status;
}

void addCount(Client& client) {
    cli::Command& command = client.command(kRestricted, "prebaked count",
                                           "tell how many patterns the driver has stored", "");
    command.run([&client] {
        uint32_t count = 0;
        const VibratorStatus status = countPatterns(client, &count);
        Answer answer;
        if (status == VibratorStatus::OK) {
            answer.words = std::to_string(count) + " patterns";
            answer.members["count"] = count;
        }
        return client.answer({"daxGetNumberOfPrebakedHapticPattern", true, {"num_waves"}}, status,
                             answer);
    });
}

int playPattern(const Client& client, uint32_t pattern, uint32_t amplitude, bool isRepeated) {
    const Operation operation = {"daxPerformPrebakedHapticPattern",
                                 true,
                                 {"cp_trigger_index", "intensity", "cp_trigger_queue"},
                                 "an amplitude is 1 to 10000"};
    Answer answer{std::to_string(pattern)};
    uint32_t count = 0;
    if (countPatterns(client, &count) == VibratorStatus::OK && pattern > count) {
        const std::string warning = "the driver counts only " + std::to_string(count) +
                                    " stored patterns; it may play nothing";
        client.warn("prebaked play " + answer.argument + ": " + warning);
        answer.members["warning"] = warning;
    }
    return client.answer(
            operation,
            client.service()->daxPerformPrebakedHapticPattern(pattern, amplitude, isRepeated),
            answer);
}

void addPattern(Client& client) {
    constexpr cli::Numbers kPatterns = {"the number of a pattern", 0, INT32_MAX};
    cli::Command& command =
            client.command(kRestricted, "prebaked play",
                           "play a pattern that the driver has stored", "3 --amplitude 5000");
    const auto pattern = command.number("PATTERN", kPatterns, "0 selects without playing");
    const auto amplitude =
            command.number("--amplitude N", kIntensities, "how strong; 10000 is full", 10000);
    const auto isRepeated = command.flag("--repeat", "play it through the driver's queue");
    command.run([=, &client] { return playPattern(client, *pattern, *amplitude, *isRepeated); });
    client.addStep({"pattern", &command, [=]() -> std::optional<double> {
                        if (*pattern == 0) return std::nullopt;
                        return 1000;
                    }});
}

Packets readPackets(const std::vector<std::string>& words, const std::string& file) {
    Packets packets;
    std::string error;
    for (const std::string& word : words) {
        if (!parsePacket(word, &packets, &error)) throw cli::UsageError(error);
    }
    if (!file.empty() && !parsePackets(readInput(file), &packets, &error)) {
        throw cli::UsageError(file + ": " + error);
    }
    if (packets.empty()) {
        throw cli::UsageError((file.empty() ? "" : file + ": ") +
                              "no packets; each is PARAM0,INTENSITY,PARAM2,PARAM3");
    }
    return packets;
}

/**
 * Checks that no intensity overflows 32 bits when the service scales it by amplitude / 10000.
 *
 * @throw cli::UsageError
 */
void checkScaling(const Packets& packets, uint32_t amplitude) {
    const uint32_t most = UINT32_MAX / std::max(amplitude, 1U);
    for (const auto& packet : packets) {
        if (packet.intensity >= 0 && static_cast<uint32_t>(packet.intensity) <= most) continue;
        throw cli::UsageError("intensity " + std::to_string(packet.intensity) +
                              " cannot be scaled by amplitude " + std::to_string(amplitude) +
                              "; it is 0 to " + std::to_string(most));
    }
}

/** Refuses what the service would refuse. @return how long the packets last, in ms. */
double judgePackets(const Packets& packets) {
    constexpr size_t kMost = 339;
    if (packets.size() > kMost) throw cli::UsageError("more than 339 packets");
    double length = 0;
    for (const auto& packet : packets) {
        length += std::max(0, packet.param0);
        for (const int32_t value : {packet.param0, packet.param2, packet.param3}) {
            if (value >= -9'999'999 && value <= 99'999'999) continue;
            throw cli::UsageError(std::to_string(value) + " has more than 8 characters");
        }
    }
    return length;
}

void addEngine(Client& client) {
    cli::Command& command =
            client.command(kRestricted, "engine", "play a waveform packet by packet",
                           "10,5000,150,0 20,10000,200,1 --amplitude 5000");
    const auto file =
            command.file("--file FILE", "CSV or JSON file of packets; - is standard input", "");
    const auto amplitude = command.number("--amplitude N", kIntensities,
                                          "scales the intensities; 10000 leaves them", 10000);
    const auto words = command.words("PACKET", "PARAM0,INTENSITY,PARAM2,PARAM3, whole numbers",
                                     [](const std::string& word) { readPackets({word}, ""); });
    const auto packets = [=] {
        Packets read = readPackets(*words, *file);
        checkScaling(read, *amplitude);
        return read;
    };
    command.run([=, &client] {
        const Packets read = packets();
        const Operation operation = {
                "daxPerformHapticEngine",
                true,
                {"haptic_engine"},
                "at most 339 packets, an amplitude of 1 to 10000, values of at most 8 characters"};
        const std::string count = std::to_string(read.size());
        return client.answer(operation, client.service()->daxPerformHapticEngine(read, *amplitude),
                             {"",
                              count + (read.size() == 1 ? " packet" : " packets"),
                              {{"packets", read.size()}}});
    });
    client.addStep({"engine", &command, [packets] { return judgePackets(packets()); }});
}

}  // namespace

void addPatterns(Client& client) {
    addCount(client);
    addPattern(client);
    addEngine(client);
}

}  // namespace vibratorctl
