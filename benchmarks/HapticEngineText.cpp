// SPDX-License-Identifier: Apache-2.0
#include "HapticEngineText.h"

#include <benchmark/benchmark.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <vector>

namespace {

using ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::HapticEnginePackets;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::HapticEngineText;

constexpr uint32_t kAmplitude = 5000;

/** The most packets that are allowed, with values of all lengths. */
HapticEnginePackets makePackets() {
    std::vector<DaxHapticEnginePacket> packets(339);
    for (int i = 0; i < 339; ++i) {
        packets[static_cast<size_t>(i)] = {i, i * 29, i * 292929, -i * 29292};
    }
    return packets;
}

void buildText(benchmark::State& state) {
    const HapticEnginePackets packets = makePackets();
    for (auto _ : state) {
        HapticEngineText text;
        int32_t abnormal = 0;
        if (!text.build(packets, kAmplitude, &abnormal)) abort();
        benchmark::DoNotOptimize(text);
    }
}
BENCHMARK(buildText);

/** The same text by one snprintf for each value, in a buffer of the same kind. */
size_t printText(const HapticEnginePackets& packets, char (&text)[13600]) {
    memset(text, 0, sizeof(text));
    size_t length = 0;
    const auto append = [&](int value) {
        length += static_cast<size_t>(snprintf(text + length, sizeof(text) - length, "%d ", value));
    };
    append(static_cast<int>(4 * packets.size()));
    for (const auto& packet : packets) {
        append(packet.param0);
        append(static_cast<int>(static_cast<uint32_t>(packet.intensity) * kAmplitude / 10000));
        append(packet.param2);
        append(packet.param3);
    }
    text[length - 1] = '\n';
    return length;
}

void buildTextBySnprintf(benchmark::State& state) {
    const HapticEnginePackets packets = makePackets();
    HapticEngineText expected;
    int32_t abnormal = 0;
    expected.build(packets, kAmplitude, &abnormal);
    char text[13600];
    if (printText(packets, text) != expected.length() || strcmp(text, expected.c_str()) != 0) {
        state.SkipWithError("the texts differ");
    }
    for (auto _ : state) {
        benchmark::DoNotOptimize(printText(packets, text));
        benchmark::DoNotOptimize(text);
    }
}
BENCHMARK(buildTextBySnprintf)->Name("buildText/snprintf");

}  // namespace
