// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

namespace {

using service::IDaxVibrator;

struct Query {
    const char* operation;
    const char* words;
    ::android::hardware::Return<bool> (IDaxVibrator::*ask)();
};

constexpr Query kQueries[] = {
        {"supportsAmplitudeControl", "amplitudes of the platform",
         &IDaxVibrator::supportsAmplitudeControl},
        {"supportsExternalControl", "external control", &IDaxVibrator::supportsExternalControl},
        {"daxSupportsAmplitudeControl", "intensities", &IDaxVibrator::daxSupportsAmplitudeControl},
        {"daxSupportsForceTouchAmplitudeControl", "force-touch feedback",
         &IDaxVibrator::daxSupportsForceTouchAmplitudeControl},
        {"daxSupportsFrequencyControl", "frequency types",
         &IDaxVibrator::daxSupportsFrequencyControl},
        {"daxSupportsHapticEngine", "haptic engine packets",
         &IDaxVibrator::daxSupportsHapticEngine},
        {"daxSupportsPrebakedHapticPattern", "stored patterns",
         &IDaxVibrator::daxSupportsPrebakedHapticPattern},
        {"daxSupportsFolderStatusSetting", "fold state",
         &IDaxVibrator::daxSupportsFolderStatusSetting},
        {"daxSupportsEnhancedVelmoraHapticPattern", "enhanced patterns",
         &IDaxVibrator::daxSupportsEnhancedVelmoraHapticPattern},
};

}  // namespace

void addSupports(Client& client) {
    cli::Command& command = client.program().command(kForAll, "supports",
                                                     "ask the service what it can do here", "");
    command.run([&client] {
        const auto vibrator = client.service();
        const bool permitted = mayCallRestricted();
        std::string words;
        nlohmann::ordered_json answers;
        for (const Query& query : kQueries) {
            const bool answer = Client::reached((*vibrator.*query.ask)());
            answers[query.operation] = answer;
            const bool isForAll = query.ask == &IDaxVibrator::supportsExternalControl;
            words += std::string(query.words) + ": " +
                     (answer                  ? "yes"
                      : permitted || isForAll ? "no"
                                              : "may not ask") +
                     (client.report().isVerbose ? std::string(" [") + query.operation + "]" : "") +
                     "\n";
        }
        nlohmann::ordered_json members = {{"permitted", permitted}, {"supports", answers}};
        if (!permitted) {
            members["reason"] = notPermitted();
            client.report().warn("supports: " + notPermitted());
        }
        return client.report().found("supports", words, members);
    });
}
