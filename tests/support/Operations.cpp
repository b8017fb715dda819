// SPDX-License-Identifier: Apache-2.0
#include "support/Operations.h"

#include <fcntl.h>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

namespace platform = ::android::hardware::vibrator;

using Accesses = std::vector<Access>;

template <typename T>
Answer answerOf(const Return<T>& result) {
    if (!result.isOk()) return {};
    return {static_cast<T>(result), 1, true};
}

/** @return what an operation calls back with; Given is the type of its arguments together. */
template <typename Given, typename Call>
Answer answerTo(Call call) {
    Answer answer;
    const Return<void> result = call([&](const auto&... given) {
        answer.value = Given(given...);
        ++answer.times;
    });
    answer.isOk = result.isOk();
    return answer;
}

using StatusAndNumber = std::pair<Status, uint32_t>;
using List = std::pair<bool, hidl_vec<uint32_t>>;

struct InWords {
    std::string operator()(bool answer) const { return answer ? "true" : "false"; }
    std::string operator()(Status status) const {
        const char* const names[] = {"OK", "UNKNOWN_ERROR", "BAD_VALUE", "UNSUPPORTED_OPERATION"};
        return names[static_cast<size_t>(status)];
    }
    std::string operator()(const StatusAndNumber& answer) const {
        return "(" + (*this)(answer.first) + ", " + std::to_string(answer.second) + ")";
    }
    std::string operator()(const List& answer) const {
        std::string text = (*this)(answer.first) + " [";
        for (const uint32_t number : answer.second)
            text += " " + std::to_string(number);
        return text + " ]";
    }
};

Access probe(const std::string& leaf, const std::string& failed, int mode = O_RDWR) {
    return {Access::kProbe, leaf, mode, "", 0, failed, "", "", {}};
}
Access write(const std::string& leaf, const std::string& text, const std::string& failed,
             const std::vector<std::string>& writtenAfter = {}) {
    return {Access::kWrite, leaf, O_RDWR, text, 0, failed, failed, failed, writtenAfter};
}
Access read(const std::string& leaf, const std::string& text, size_t size, int mode,
            const std::string& failed, const std::string& oneByte,
            const std::vector<std::string>& writtenAfter = {}) {
    return {Access::kRead, leaf, mode, text, size, failed, failed, oneByte, writtenAfter};
}

Accesses operator+(Accesses first, const Accesses& second) {
    first.insert(first.end(), second.begin(), second.end());
    return first;
}

/** What on(ms) does; what its caller answers, and writes, when a step of it fails. */
Accesses switchOn(simulator::Layout layout, const std::string& ms, const std::string& failed,
                  const std::vector<std::string>& writtenAfter = {}) {
    if (layout == simulator::Layout::kTimedOutput) {
        return {write("enable", ms + "\n", failed, writtenAfter)};
    }
    return {write("state", "1\n", failed, writtenAfter),
            write("duration", ms + "\n", failed, writtenAfter),
            write("activate", "1\n", failed, writtenAfter)};
}

using Query = Return<bool> (Vibrator::*)();

Operation query(const std::string& name, Query operation, const Accesses& accesses) {
    return {name, [=](Vibrator& vibrator) { return answerOf((vibrator.*operation)()); }, "true",
            accesses};
}

Operation setting(const std::string& name, const std::function<Return<Status>(Vibrator&)>& call,
                  const Accesses& accesses) {
    return {name, [=](Vibrator& vibrator) { return answerOf(call(vibrator)); }, "OK", accesses};
}

template <typename Effect, typename Callback>
Operation effect(const std::string& name,
                 Return<void> (Vibrator::*operation)(Effect, EffectStrength, Callback),
                 const std::string& answer, const Accesses& accesses) {
    return {name,
            [=](Vibrator& vibrator) {
                return answerTo<StatusAndNumber>([&](const auto& callback) {
                    return (vibrator.*operation)(Effect{0}, EffectStrength::MEDIUM, callback);
                });
            },
            answer, accesses};
}

}  // namespace

std::string Answer::inWords() const {
    if (!isOk) return "transport error";
    if (times != 1) return "answered " + std::to_string(times) + " times";
    return std::visit(InWords(), value);
}

std::vector<Operation> allOperations(simulator::Layout layout) {
    const bool isTimed = layout == simulator::Layout::kTimedOutput;
    const std::string error = "UNKNOWN_ERROR";
    const std::string unsupported = "UNSUPPORTED_OPERATION";
    const std::string none = "(UNSUPPORTED_OPERATION, 0)";
    const std::string click = "(OK, 20)";
    const std::string queue = std::string("3.50, 10, 0~") + '\0';
    return {
            setting(
                    "on", [](Vibrator& v) { return v.on(500); }, switchOn(layout, "500", error)),
            setting("off", [](Vibrator& v) { return v.off(); },
                    {write(isTimed ? "enable" : "activate", "0\n", error)}),
            query("supportsAmplitudeControl", &Vibrator::supportsAmplitudeControl,
                  {probe("intensity", "false")}),
            setting("setAmplitude", [](Vibrator& v) { return v.setAmplitude(128); },
                    {probe("intensity", unsupported), write("intensity", "5001\n", error)}),
            // A click is reported as played whatever fails, and goes on to its strength.
            effect("perform", &Vibrator::perform, click,
                   switchOn(layout, "20", click, {"intensity"}) +
                           Accesses{probe("intensity", click),
                                    write("intensity", "5001\n", click)}),
            effect("perform_1_1", &Vibrator::perform_1_1, none, {}),
            effect("perform_1_2", &Vibrator::perform_1_2, none, {}),
            query("supportsExternalControl", &Vibrator::supportsExternalControl,
                  {probe("ext_control", "false")}),
            // A motor that cannot be asked counts as idle.
            setting("setExternalControl", [](Vibrator& v) { return v.setExternalControl(true); },
                    {read(isTimed ? "enable" : "duration", "0\n", 7, O_RDONLY, "OK", "OK",
                          {"ext_control"}),
                     write("ext_control", "1\n", unsupported)}),
            effect("perform_1_3", &Vibrator::perform_1_3, none, {}),
            query("daxSupportsAmplitudeControl", &Vibrator::daxSupportsAmplitudeControl,
                  {probe("intensity", "false")}),
            query("daxSupportsForceTouchAmplitudeControl",
                  &Vibrator::daxSupportsForceTouchAmplitudeControl,
                  {probe("force_touch_intensity", "false")}),
            query("daxSupportsFrequencyControl", &Vibrator::daxSupportsFrequencyControl,
                  {probe("multi_freq", "false")}),
            query("daxSupportsHapticEngine", &Vibrator::daxSupportsHapticEngine,
                  {probe("haptic_engine", "false")}),
            query("daxSupportsPrebakedHapticPattern", &Vibrator::daxSupportsPrebakedHapticPattern,
                  {probe("cp_trigger_index", "false")}),
            query("daxSupportsFolderStatusSetting", &Vibrator::daxSupportsFolderStatusSetting,
                  {read("event_cmd", "FOLDER_OPEN\n", 511, O_RDWR, "false", "true")}),
            // A motor without a name is judged by the haptic engine, which is there.
            query("daxSupportsEnhancedVelmoraHapticPattern",
                  &Vibrator::daxSupportsEnhancedVelmoraHapticPattern,
                  {probe("motor_type", "true", O_RDONLY),
                   read("motor_type", "LINEAR_1040\n", 31, O_RDONLY, "false", "false")}),
            setting("daxSetAmplitude", [](Vibrator& v) { return v.daxSetAmplitude(7000); },
                    {write("intensity", "7000\n", error)}),
            setting("daxSetForceTouchAmplitude",
                    [](Vibrator& v) { return v.daxSetForceTouchAmplitude(7000); },
                    {write("force_touch_intensity", "7000\n", error)}),
            setting("daxSetFrequencyType",
                    [](Vibrator& v) { return v.daxSetFrequencyType(DaxFrequencyType::TYPE_3); },
                    {write("multi_freq", "3\n", error)}),
            setting("daxSetFolderStatus",
                    [](Vibrator& v) { return v.daxSetFolderStatus(DaxFolderStatus::FOLDER_CLOSE); },
                    {write("event_cmd", "FOLDER_CLOSE\n", error)}),
            {"daxGetNumberOfPrebakedHapticPattern",
             [](Vibrator& v) {
                 return answerTo<StatusAndNumber>([&](const auto& callback) {
                     return v.daxGetNumberOfPrebakedHapticPattern(callback);
                 });
             },
             "(OK, 12)",
             {probe("num_waves", none, O_RDONLY),
              read("num_waves", "12\n", 7, O_RDONLY, "(UNKNOWN_ERROR, 0)", "(OK, 1)")}},
            // That the motor is set off is not part of the answer.
            setting(
                    "daxPerformHapticEngine",
                    [](Vibrator& v) {
                        return v.daxPerformHapticEngine({{10, 5000, 150, 0}}, 5000);
                    },
                    Accesses{write("haptic_engine", "4 10 2500 150 0\n", error)} +
                            switchOn(layout, "1", "OK")),
            setting(
                    "daxPerformPrebakedHapticPattern",
                    [](Vibrator& v) { return v.daxPerformPrebakedHapticPattern(3, 5050, false); },
                    Accesses{write("intensity", "5050\n", error),
                             write("cp_trigger_index", "3\n", error)} +
                            switchOn(layout, "1000", error)),
            setting(
                    "daxPerformPrebakedHapticPattern/repeat",
                    [](Vibrator& v) { return v.daxPerformPrebakedHapticPattern(3, 5050, true); },
                    Accesses{write("cp_trigger_index", "65534\n", error),
                             write("cp_trigger_queue", queue, error)} +
                            switchOn(layout, "1000", error)),
            // Without its name the motor is taken for a LINEAR_INDEX, which has another ladder.
            {"daxGetAmplitudeList",
             [](Vibrator& v) {
                 return answerTo<List>([&](const auto& callback) {
                     return v.daxGetAmplitudeList(DaxAmplitudeType::TYPE_0, callback);
                 });
             },
             "true [ 0 1000 5000 9000 ]",
             {read("motor_type", "COINDC_PMIC\n", 31, O_RDWR,
                   "true [ 0 3000 4000 6000 8000 10000 ]", "true [ 0 3000 4000 6000 8000 10000 ]"),
              probe("cp_trigger_index", "true [ 0 1000 5000 9000 ]")},
             "COINDC_PMIC\n"},
    };
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
