// SPDX-License-Identifier: Apache-2.0
#include "support/Operations.h"

#include "Trace.h"

#include <fcntl.h>

#include <cstring>

namespace {

using ::android::hardware::Return;
using ::android::hardware::vibrator::V1_0::EffectStrength;
using simulator::Layout;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;

using Accesses = std::vector<Access>;
using Call = std::function<Answer(IDaxVibrator&)>;

Access probe(const std::string& leaf, const std::string& failed, const Lines& logFailed = {},
             int mode = O_RDWR) {
    Access access{Access::kProbe, leaf, mode, "", 0, "", {}, failed, logFailed, "", "", false, {}};
    access.answerTransferFailed = failed;
    return access;
}
Access write(const std::string& leaf, const std::string& text, const std::string& failed,
             const Lines& logFailed = {}, const Lines& before = {},
             const std::string& textOf = {}) {
    return {Access::kWrite, leaf,      O_RDWR, text,   0,     textOf, before,
            failed,         logFailed, failed, failed, false, {}};
}
Access read(const std::string& leaf, const std::string& text, size_t size, int mode,
            const std::string& failed, const std::string& oneByte, const Lines& before,
            const std::string& textOf) {
    return {Access::kRead, leaf, mode,   text,    size,  textOf, before,
            failed,        {},   failed, oneByte, false, {}};
}
/** @return the access, after whose failure the operation goes on and writes some nodes. */
Access goingOn(Access access, const Lines& writtenAfter = {}) {
    access.goesOn = true;
    access.writtenAfter = writtenAfter;
    return access;
}

Accesses operator+(Accesses first, const Accesses& second) {
    first.insert(first.end(), second.begin(), second.end());
    return first;
}

/** What on(ms) does for an operation that answers and logs this when it fails. */
Accesses switchOn(Layout layout, const std::string& ms, const std::string& failed,
                  const Lines& logFailed = {}, const Lines& before = {}) {
    if (layout == Layout::kTimedOutput) {
        return {write("enable", ms + "\n", failed, logFailed, before)};
    }
    const auto impossible = [&](const char* node) {
        Lines lines = {std::string("E THE_DEVICE_") + node + " is impossible"};
        lines.insert(lines.end(), logFailed.begin(), logFailed.end());
        return lines;
    };
    return {write("state", "1\n", failed, impossible("STATE"), before),
            write("duration", ms + "\n", failed, impossible("DURATION")),
            write("activate", "1\n", failed, impossible("ACTIVATE"))};
}
Accesses goingOn(Accesses accesses, const Lines& writtenAfter = {}) {
    for (Access& access : accesses)
        access = goingOn(access, writtenAfter);
    return accesses;
}

template <typename Operation>
Call query(Operation operation) {
    return [=](IDaxVibrator& vibrator) { return answerOf((vibrator.*operation)()); };
}
template <typename Effect, typename Interface, typename Callback>
Call effect(Return<void> (Interface::*operation)(Effect, EffectStrength, Callback)) {
    return [=](IDaxVibrator& vibrator) {
        return answerTo<StatusAndNumber>([&](const auto& callback) {
            return (vibrator.*operation)(Effect{0}, EffectStrength::MEDIUM, callback);
        });
    };
}
/** A call that returns its result. */
template <typename Operation>
Call calling(Operation operation) {
    return [=](IDaxVibrator& vibrator) { return answerOf(operation(vibrator)); };
}

std::string pathOf(Layout layout, const Access& access) {
    return sysfsDirectory(layout) + access.leaf;
}

/** What the primitive that makes an access logs before its outcome. */
Lines logBegin(Layout layout, const Access& access) {
    const std::string path = pathOf(layout, access);
    if (!access.textOf.empty()) return {};
    if (access.kind == Access::kWrite) {
        return {"D >> writeNode node:" + path +
                " val:" + access.text.substr(0, access.text.find('\n'))};
    }
    if (access.kind == Access::kRead) return {"D >> readNode node:" + path + " "};
    return {(access.mode == O_RDWR ? "D isNodeExist node:" : "D isNodeExistForRead node:") + path +
            " "};
}

Lines logSuccess(const Access& access) {
    if (!access.textOf.empty()) return {};
    if (access.kind == Access::kWrite) return {"D << writeNode node OK"};
    return {access.kind == Access::kRead ? "D << readNode done" : "D true"};
}

Lines logFailure(Layout layout, const Access& access, bool opens, int error) {
    const std::string number = std::to_string(error);
    const bool isText = !access.textOf.empty();
    if (access.kind == Access::kProbe) return {"D false"};
    if (isText && access.kind == Access::kWrite) {
        return opens ? Lines() : Lines{"E " + access.textOf + " is fail: " + number};
    }
    if (opens && access.kind == Access::kWrite) return {"D << writeNode node UNKNOWN_ERROR"};
    // A number that is cut short is none, and a text none at all.
    if (opens && error == 0 && !isText) return {"D << readNode done"};
    return {"E " + (isText ? access.textOf + " " : "") + "node: " + pathOf(layout, access) +
            (opens ? " read" : " open") + " failed. errno: " + number};
}

void append(Lines* lines, const Lines& more) {
    lines->insert(lines->end(), more.begin(), more.end());
}

/** What an operation logs up to an access that goes well. */
Lines logUpTo(Layout layout, const Operation& operation, size_t index) {
    Lines lines;
    for (size_t i = 0; i < index; ++i) {
        const Access& access = operation.accesses[i];
        append(&lines, access.before);
        append(&lines, logBegin(layout, access));
        append(&lines, logSuccess(access));
    }
    return lines;
}

}  // namespace

Lines undisturbedTrace(Layout layout, const Operation& operation) {
    Lines lines;
    for (const Access& access : operation.accesses) {
        const std::string node =
                (layout == Layout::kTimedOutput ? "timed_output/" : "leds/") + access.leaf;
        const std::string quoted = simulator::quote(access.text);
        const std::string size = std::to_string(access.text.size());
        lines.push_back(node + (access.mode == O_RDWR ? " open O_RDWR = 0" : " open O_RDONLY = 0"));
        if (access.kind == Access::kWrite)
            lines.push_back(node + " write " + quoted + " = " + size);
        if (access.kind == Access::kRead) {
            lines.push_back(node + " read " + std::to_string(access.size) + " = " + size + " " +
                            quoted);
        }
        lines.push_back(node + " close = 0");
    }
    return lines;
}

Lines undisturbedLog(Layout layout, const Operation& operation) {
    Lines lines = logUpTo(layout, operation, operation.accesses.size());
    append(&lines, operation.end);
    return lines;
}

Lines failedLog(Layout layout, const Operation& operation, size_t index, bool opens, int error,
                int result) {
    const Access& access = operation.accesses[index];
    Lines lines = logUpTo(layout, operation, index);
    append(&lines, access.before);
    append(&lines, logBegin(layout, access));
    append(&lines, logFailure(layout, access, opens, error));
    // A text that cannot be opened has said so already.
    const bool isSaid = !opens && !access.textOf.empty();
    for (std::string line : isSaid ? Lines() : access.logFailed) {
        for (const auto& [mark, shown] :
             {std::pair<const char*, std::string>{"%RESULT%", std::to_string(result)},
              {"%ERROR%", "(" + std::to_string(error) + "): " + strerror(error)}}) {
            const size_t place = line.find(mark);
            if (place != std::string::npos) line.replace(place, strlen(mark), shown);
        }
        lines.push_back(line);
    }
    return lines;
}

std::vector<Operation> allOperations(Layout layout) {
    const auto row = [](const std::string& operation, const Call& call, const std::string& answer,
                        const std::string& withoutDriver, const std::string& refused,
                        const Accesses& accesses, const Lines& end, size_t linesBeforeGate = 0,
                        const std::string& motor = "LINEAR_1040\n") {
        return Operation{operation, call, answer,          withoutDriver, refused,
                         accesses,  end,  linesBeforeGate, motor};
    };
    using I = IDaxVibrator;
    const bool isTimed = layout == Layout::kTimedOutput;
    const std::string error = "UNKNOWN_ERROR";
    const std::string unsupported = "UNSUPPORTED_OPERATION";
    const std::string none = "(UNSUPPORTED_OPERATION, 0)";
    const std::string noList = "false [ ]";
    const std::string click = "(OK, 20)";
    const std::string play = "D daxPerformPrebakedHapticPattern ";
    const std::string folder = "daxSupportsFolderStatusSetting";
    const std::string enhanced = "daxSupportsEnhancedVelmoraHapticPattern";
    const std::string count = "D daxGetNumberOfPrebakedHapticPattern ";
    const std::string name = "getMotorIndex";
    const std::string otherLadder = "true [ 0 3000 4000 6000 8000 10000 ]";
    const auto linesOf = [](const std::string& prefix, const std::string& text) {
        return Lines{"D " + prefix + " str has new-line char at the last",
                     "D " + prefix + " string : " + text + " ",
                     "D " + prefix + " string len : " + std::to_string(text.size()) + " "};
    };
    const auto before = [](Access access, const Lines& lines) {
        access.before = lines;
        return access;
    };
    const auto with = [](Lines lines, const Lines& more) {
        append(&lines, more);
        return lines;
    };
    const auto probing = [&](const std::string& operation, auto call, const std::string& leaf) {
        return Operation{operation, query(call), "true", "false", "false", {probe(leaf, "false")},
                         {}};
    };
    const auto setting = [&](const std::string& operation, auto call, const std::string& leaf,
                             const std::string& text) {
        return Operation{operation, calling(call), "OK", error, error, {write(leaf, text, error)},
                         {}};
    };
    const Access amplitudeProbe =
            probe("intensity", unsupported, {"E setAmplitude is impossible because of intensity"});
    const Access amplitudeWrite =
            write("intensity", "5001\n", error, {"E Failed to set amplitude %ERROR%"},
                  {"D Setting amplitude to: 5001"});
    return {
            row("on", calling([](I& v) { return v.on(500); }), "OK", error, "",
                switchOn(layout, "500", error), {}),
            row("off", calling([](I& v) { return v.off(); }), "OK", error, "",
                {isTimed ? write("enable", "0\n", error)
                         : write("activate", "0\n", error,
                                 {"E THE_DEVICE_ACTIVATE is impossible"})},
                {}),
            row("supportsAmplitudeControl", query(&I::supportsAmplitudeControl), "true", "false",
                "", {probe("intensity", "false", {"E supportsAmplitudeControl is impossible"})},
                {"D supportsAmplitudeControl is possible"}),
            row("setAmplitude", calling([](I& v) { return v.setAmplitude(128); }), "OK",
                unsupported, "", {amplitudeProbe, amplitudeWrite}, {}),
            // A click is reported as played whatever fails, and goes on to its strength.
            row("perform", effect(&I::perform), click, click, "",
                goingOn(switchOn(layout, "20", click, {},
                                 {"D perform start effect : 0, strength : 1"}),
                        {"intensity"}) +
                        Accesses{goingOn(probe("intensity", click)),
                                 goingOn(write("intensity", "5001\n", click, {},
                                               amplitudeWrite.before))},
                {"D perform end effect"}),
            row("perform_1_1", effect(&I::perform_1_1), none, none, "", {},
                {"D perform_1_1 start effect : 0, strength : 1"}),
            row("perform_1_2", effect(&I::perform_1_2), none, none, "", {},
                {"D perform_1_2 start effect : 0, strength : 1"}),
            row("supportsExternalControl", query(&I::supportsExternalControl), "true", "false", "",
                {probe("ext_control", "false")}, {}),
            // A motor that cannot be asked counts as idle.
            row("setExternalControl", calling([](I& v) { return v.setExternalControl(true); }),
                "OK", unsupported, "",
                {goingOn(read(isTimed ? "enable" : "duration", "0\n", 7, O_RDONLY, "OK", "OK", {},
                              ""),
                         {"ext_control"}),
                 write("ext_control", "1\n", unsupported,
                       {"E THE_DEVICE_EXT_CONTROL is impossible"},
                       {"D isVibrating : false",
                        "D setExternalControl external control set as true"})},
                {}),
            row("perform_1_3", effect(&I::perform_1_3), none, none, "", {},
                {"D perform_1_3 start effect : 0, strength : 1"}),
            probing("daxSupportsAmplitudeControl", &I::daxSupportsAmplitudeControl, "intensity"),
            probing("daxSupportsForceTouchAmplitudeControl",
                    &I::daxSupportsForceTouchAmplitudeControl, "force_touch_intensity"),
            probing("daxSupportsFrequencyControl", &I::daxSupportsFrequencyControl, "multi_freq"),
            probing("daxSupportsHapticEngine", &I::daxSupportsHapticEngine, "haptic_engine"),
            probing("daxSupportsPrebakedHapticPattern", &I::daxSupportsPrebakedHapticPattern,
                    "cp_trigger_index"),
            row(folder, query(&I::daxSupportsFolderStatusSetting), "true", "false", "false",
                {read("event_cmd", "FOLDER_OPEN\n", 511, O_RDWR, "false", "true",
                      {"D " + folder + " starts"}, folder)},
                with(linesOf(folder, "FOLDER_OPEN"), {"D " + folder + " TRUE"}), 1),
            // A motor without a name is judged by the haptic engine, which is there.
            row(enhanced, query(&I::daxSupportsEnhancedVelmoraHapticPattern), "true", "false",
                "false",
                {goingOn(probe("motor_type", "true", {}, O_RDONLY)),
                 read("motor_type", "LINEAR_1040\n", 31, O_RDONLY, "false", "false", {}, enhanced)},
                with(linesOf(enhanced, "LINEAR_1040"), {"D " + enhanced + " LINEAR_1040"})),
            setting(
                    "daxSetAmplitude", [](I& v) { return v.daxSetAmplitude(7000); }, "intensity",
                    "7000\n"),
            setting(
                    "daxSetForceTouchAmplitude",
                    [](I& v) { return v.daxSetForceTouchAmplitude(6000); }, "force_touch_intensity",
                    "6000\n"),
            setting(
                    "daxSetFrequencyType",
                    [](I& v) { return v.daxSetFrequencyType(DaxFrequencyType::TYPE_3); },
                    "multi_freq", "3\n"),
            row("daxSetFolderStatus",
                calling([](I& v) { return v.daxSetFolderStatus(DaxFolderStatus::FOLDER_CLOSE); }),
                "OK", error, error,
                {write("event_cmd", "FOLDER_CLOSE\n", error,
                       {"D ret : %RESULT%", "D daxSetFolderStatus error"},
                       {"D daxSetFolderStatus starts", "D FOLDER_CLOSE\\n", "D length : 13"},
                       "daxSetFolderStatus")},
                {"D ret : 13", "D daxSetFolderStatus end"}, 1),
            row("daxGetNumberOfPrebakedHapticPattern",
                [](I& v) {
                    return answerTo<StatusAndNumber>([&](const auto& callback) {
                        return v.daxGetNumberOfPrebakedHapticPattern(callback);
                    });
                },
                "(OK, 12)", none, "(UNKNOWN_ERROR, 0)",
                {probe("num_waves", none, {count + "unsupports"}, O_RDONLY),
                 [&] {
                     Access access = read("num_waves", "12\n", 7, O_RDONLY, "(UNKNOWN_ERROR, 0)",
                                          "(OK, 1)", {}, "");
                     access.logFailed = {count + "value : 4294967295"};
                     return access;
                 }()},
                {count + "value : 12"}),
            // That the motor is set off is no part of the answer.
            row("daxPerformHapticEngine", calling([](I& v) {
                    return v.daxPerformHapticEngine({{10, 5000, 150, 0}}, 5000);
                }),
                "OK", error, error,
                Accesses{write("haptic_engine", "4 10 2500 150 0\n", error,
                               {"D daxPerformHapticEngine UNKNOWN_ERROR"},
                               {"D daxPerformHapticEngine : 4 10 2500 150 0\\n"},
                               "daxPerformHapticEngine")} +
                        goingOn(switchOn(layout, "1", "OK")),
                {"D daxPerformHapticEngine OK"}),
            row("daxPerformPrebakedHapticPattern",
                calling([](I& v) { return v.daxPerformPrebakedHapticPattern(3, 5050, false); }),
                "OK", error, error,
                Accesses{write("intensity", "5050\n", error, {play + "intensity write fail"},
                               {play + "pattern : 3, amplitude : 5050", play + "one shoot starts"}),
                         write("cp_trigger_index", "3\n", error, {play + "pattern write fail"})} +
                        switchOn(layout, "1000", error, {play + "on fail"}),
                {play + "one shoot end"}, 1),
            row("daxPerformPrebakedHapticPattern/repeat",
                calling([](I& v) { return v.daxPerformPrebakedHapticPattern(3, 5050, true); }),
                "OK", error, error,
                Accesses{write("cp_trigger_index", "65534\n", error, {play + "write 0xFFFE fail"},
                               {play + "pattern : 3, amplitude : 5050", play + "repeat starts",
                                play + ": 3.50, 10, 0~ , 12"}),
                         write("cp_trigger_queue", std::string("3.50, 10, 0~") + '\0', error,
                               {"D ret : %RESULT%", play + "repeat error"}, {},
                               "daxPerformPrebakedHapticPattern")} +
                        switchOn(layout, "1000", error, {play + "on Trigger fail"}, {"D ret : 13"}),
                {play + "end"}, 1),
            // Without its name the motor is taken for a LINEAR_INDEX, which has another ladder.
            row(
                    "daxGetAmplitudeList",
                    [](I& v) {
                        return answerTo<LadderAnswer>([&](const auto& callback) {
                            return v.daxGetAmplitudeList(DaxAmplitudeType::TYPE_0, callback);
                        });
                    },
                    "true [ 0 1000 5000 9000 ]", noList, noList,
                    {goingOn(read("motor_type", "COINDC_PMIC\n", 31, O_RDWR, otherLadder,
                                  otherLadder, {"D getMotorIndex return motor type >>"}, name)),
                     goingOn(before(probe("cp_trigger_index", "true [ 0 1000 5000 9000 ]"),
                                    with(linesOf(name, "COINDC_PMIC"),
                                         {"D getMotorIndex return motor type : 3 <<",
                                          "D daxGetAmplitudeList type: 0 : 3"})))},
                    {"D daxGetAmplitudeList support index method",
                     "D daxGetAmplitudeList list size: 4",
                     "D daxGetAmplitudeList list_outputsize size: 4"},
                    0, "COINDC_PMIC\n"),
    };
}
