// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"
#include "Packets.h"
#include "Scaling.h"

namespace {

HapticEnginePackets readPackets(const std::vector<std::string>& words, const std::string& file) {
    HapticEnginePackets packets;
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

}  // namespace

void addEngine(Client& client) {
    cli::Command& engine =
            client.program().command(kRestricted, "engine", "play a waveform packet by packet",
                                     "10,5000,150,0 20,10000,200,1 --amplitude 5000");
    const auto words = engine.words("PACKET", "PARAM0,INTENSITY,PARAM2,PARAM3, whole numbers");
    const auto file =
            engine.file("--file FILE", "CSV or JSON file of packets; - is standard input", "");
    const auto amplitude = engine.number("--amplitude N", kIntensities,
                                         "scales the intensities; 10000 leaves them", 10000);
    engine.run([=, &client] {
        const HapticEnginePackets packets = readPackets(*words, *file);
        const std::string problem = scalingProblem(packets, *amplitude);
        if (!problem.empty()) throw cli::UsageError(problem);
        const Call call{"engine", "daxPerformHapticEngine", true};
        const std::string count = std::to_string(packets.size());
        return client.answer(call, client.service()->daxPerformHapticEngine(packets, *amplitude),
                             {count + (packets.size() == 1 ? " packet" : " packets"),
                              {{"packets", packets.size()}}});
    });
}
