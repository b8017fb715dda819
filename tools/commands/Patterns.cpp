// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "HapticEngineText.h"
#include "Input.h"
#include "PrebakedPatterns.h"
#include "scores/Packets.h"

#include <algorithm>

namespace vibratorctl {

namespace {

constexpr size_t kMaxPackets = product::HapticEngineText::kMaxPackets;

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
    cli::Command& command = client.command(kRestricted, "pattern count",
                                           "tell how many patterns the driver has stored", "");
    command.run([&client] {
        uint32_t count = 0;
        const VibratorStatus status = countPatterns(client, &count);
        Answer answer;
        if (status == VibratorStatus::OK) {
            answer.words = std::to_string(count) + " patterns";
            answer.members["count"] = count;
        }
        return client.report().answer({"daxGetNumberOfPrebakedHapticPattern", true, {"num_waves"}},
                                      status, answer);
    });
}

int playPattern(const Client& client, uint32_t pattern, uint32_t intensity, bool isRepeated) {
    const Operation operation = {"daxPerformPrebakedHapticPattern",
                                 true,
                                 {"cp_trigger_index", "intensity", "cp_trigger_queue"}};
    Answer answer{std::to_string(pattern)};
    uint32_t count = 0;
    if (countPatterns(client, &count) == VibratorStatus::OK && pattern > count) {
        answer.warning = "the driver counts only " + std::to_string(count) +
                         " stored patterns; it may play nothing";
    }
    return client.report().answer(
            operation,
            client.service()->daxPerformPrebakedHapticPattern(pattern, intensity, isRepeated),
            answer);
}

void addPattern(Client& client) {
    constexpr cli::Numbers kPatterns = {"the number of a pattern", 0, INT32_MAX};
    cli::Command& command =
            client.command(kRestricted, "pattern play", "play a pattern that the driver has stored",
                           "3 --intensity 5000");
    const auto* const pattern = command.add("PATTERN", kPatterns, "0 selects without playing");
    const auto* const intensity =
            command.add("--intensity N", kIntensities, "how strong; 10000 is full",
                        std::to_string(kIntensities.most));
    const auto* const isRepeated =
            command.add("--repeat", cli::kFlag, "play it through the driver's queue");
    command.run([=, &client] {
        return playPattern(client, pattern->number(), intensity->number(), isRepeated->isGiven());
    });
    client.steps.push_back({"pattern", &command, [=]() -> std::optional<double> {
                                if (pattern->number() == 0) return std::nullopt;
                                return product::kPatternMs;
                            }});
}

Packets readPackets(const std::vector<std::string>& words, const std::string& file) {
    // Many times what a call may have; JSON takes 80 times as much memory.
    constexpr size_t kMaxMiB = 1;
    Packets packets;
    for (const std::string& word : words)
        packets.push_back(parsePacket(word));
    const std::string text = file.empty() ? "" : readInput(file, kMaxMiB);
    try {
        for (const Packet& packet : parsePackets(text))
            packets.push_back(packet);
        if (!packets.empty()) return packets;
        throw cli::UsageError("no packets; each is PARAM0,INTENSITY,PARAM2,PARAM3");
    } catch (const cli::UsageError& error) {
        throw cli::UsageError((file.empty() ? "" : file + ": ") + error.what());
    }
}

/** Refuses what the service would refuse, or what would overflow in it. @throw cli::UsageError */
void checkPackets(const Packets& packets, uint32_t intensity) {
    if (packets.size() > kMaxPackets) {
        throw cli::UsageError(std::to_string(packets.size()) + " packets are more than " +
                              std::to_string(kMaxPackets));
    }
    // The service multiplies in 32 bits.
    const uint32_t most = UINT32_MAX / std::max(intensity, kIntensities.least);
    for (const auto& packet : packets) {
        if (packet.intensity < 0 || static_cast<uint32_t>(packet.intensity) > most) {
            throw cli::UsageError("intensity " + std::to_string(packet.intensity) +
                                  " cannot be scaled by " + std::to_string(intensity) +
                                  "; it is 0 to " + std::to_string(most));
        }
        for (const int32_t value : {packet.param0, packet.param2, packet.param3}) {
            if (!product::isEngineValue(value))
                throw cli::UsageError(std::to_string(value) + " has more than 8 characters");
        }
    }
}

/** @return how long packets are taken to last, in ms. */
double lengthOf(const Packets& packets) {
    double length = 0;
    for (const auto& packet : packets)
        length += std::max(0, packet.param0);
    return length;
}

void addEngine(Client& client) {
    cli::Command& command =
            client.command(kRestricted, "engine", "play a waveform packet by packet",
                           "10,5000,150,0 20,10000,200,1 --intensity 5000");
    const auto* const file = command.add("--file FILE", cli::kFile,
                                         "CSV or JSON file of packets; - is standard input");
    const auto* const intensity =
            command.add("--intensity N", kIntensities, "scales the intensities; 10000 leaves them",
                        std::to_string(kIntensities.most));
    cli::Argument* const words =
            command.add("[PACKET...]", cli::kText, "PARAM0,INTENSITY,PARAM2,PARAM3, whole numbers");
    words->check = [](const std::string& word) { parsePacket(word); };
    const auto packets = [=] {
        Packets read = readPackets(words->given, file->text());
        checkPackets(read, intensity->number());
        return read;
    };
    command.run([=, &client] {
        const Packets read = packets();
        const Operation operation = {"daxPerformHapticEngine", true, {"haptic_engine"}};
        const std::string count = std::to_string(read.size());
        return client.report().answer(
                operation, client.service()->daxPerformHapticEngine(read, intensity->number()),
                {"",
                 count + (read.size() == 1 ? " packet" : " packets"),
                 {{"packets", read.size()}}});
    });
    client.steps.push_back({"engine", &command, [packets] { return lengthOf(packets()); }});
}

}  // namespace

void addPatterns(Client& client) {
    addCount(client);
    addPattern(client);
    addEngine(client);
}

}  // namespace vibratorctl
