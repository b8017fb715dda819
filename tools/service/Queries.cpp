// SPDX-License-Identifier: Apache-2.0
#include "service/Queries.h"

#include "service/Reasons.h"

namespace vibratorctl {

// The operation's name, and both ways to answer it.
#define QUERY(name) #name, &IDaxVibrator::name, &LocalDriver::name

const std::vector<Query> kQueries = {
        {"supportsAmplitudeControl", &IDaxVibrator::supportsAmplitudeControl,
         &LocalDriver::daxSupportsAmplitudeControl, "amplitudes of the platform"},
        {QUERY(supportsExternalControl), "external control", "external-control", true},
        {QUERY(daxSupportsAmplitudeControl), "intensities", "intensity"},
        {QUERY(daxSupportsForceTouchAmplitudeControl), "force-touch feedback", "force-touch"},
        {QUERY(daxSupportsFrequencyControl), "frequency types", "frequency"},
        {QUERY(daxSupportsHapticEngine), "haptic engine packets", "haptic-engine"},
        {QUERY(daxSupportsPrebakedHapticPattern), "stored patterns", "pattern"},
        {QUERY(daxSupportsFolderStatusSetting), "fold state", "fold"},
        {QUERY(daxSupportsEnhancedVelmoraHapticPattern), "enhanced patterns"},
};

std::vector<Comparison> compareAnswers(IDaxVibrator& vibrator, const LocalDriver& driver) {
    std::vector<Comparison> answers;
    const bool isPermitted = mayCallRestricted();
    for (const Query& query : kQueries) {
        const bool wanted = (isPermitted || query.isForAll) && (driver.*query.expect)();
        const bool got = reached((vibrator.*query.ask)());
        answers.push_back({query.operation, wanted ? "yes" : "no", got ? "yes" : "no"});
    }
    if (!isPermitted || !driver.isUsable()) return answers;
    std::string count;
    reached(vibrator.daxGetNumberOfPrebakedHapticPattern([&](auto status, uint32_t patterns) {
        if (status == VibratorStatus::OK) count = std::to_string(patterns);
    }));
    const LocalDriver::Node waves = driver.look("num_waves");
    answers.push_back({"number of patterns", waves.reads ? waves.firstLine() : "", count});
    for (const uint32_t type : {0U, 1U}) {
        answers.push_back({"ladder " + std::to_string(type), ladderInWords(driver.ladder(type)),
                           ladderInWords(askLadder(vibrator, type))});
    }
    return answers;
}

LocalDriver driverOf(IDaxVibrator& vibrator) {
    return LocalDriver(serverOf(vibrator).value_or(thisProcess()));
}

std::vector<uint32_t> askLadder(IDaxVibrator& vibrator, uint32_t type) {
    using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
    std::vector<uint32_t> ladder;
    reached(vibrator.daxGetAmplitudeList(
            static_cast<DaxAmplitudeType>(type), [&](bool supported, const auto& amplitudes) {
                if (supported) ladder.assign(amplitudes.begin(), amplitudes.end());
            }));
    return ladder;
}

std::string ladderInWords(const std::vector<uint32_t>& ladder) {
    std::string words;
    for (const uint32_t step : ladder)
        words += (words.empty() ? "" : " ") + std::to_string(step);
    return words.empty() ? "none" : words;
}

}  // namespace vibratorctl
