// SPDX-License-Identifier: Apache-2.0
#include "support/Operations.h"

namespace tests {
namespace {

constexpr char kUnknown[] = "UNKNOWN_ERROR";
constexpr char kUnsupported[] = "UNSUPPORTED_OPERATION";
constexpr char kNone[] = "(UNSUPPORTED_OPERATION, 0)";

}  // namespace

std::vector<Operation> allOperations() {
    using Packets = std::vector<::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket>;
    return {
            {CALL(on)(500), "OK", "on=500", kUnknown},
            {CALL(off)(), "OK", "off", kUnknown},
            {CALL(supportsAmplitudeControl)(), "true", R"(
                (daxSupportsAmplitudeControl; @; intensity?; )
                !E supportsAmplitudeControl is impossible
                D supportsAmplitudeControl is possible)",
             "false"},
            {CALL(setAmplitude)(128), "OK", R"(
                (daxSupportsAmplitudeControl; @; intensity?; )
                !E setAmplitude is impossible because of intensity
                !=UNSUPPORTED_OPERATION
                D Setting amplitude to: 5001
                intensity=5001
                !E Failed to set amplitude {error})",
             kUnknown},
            // A click is reported as played whatever fails, and goes on to its strength.
            {CALL(perform)(0, 1), "(OK, 20)", R"(
                D perform start effect : 0, strength : 1
                ~on=20
                ~(setAmplitude
                (daxSupportsAmplitudeControl; @; intensity?; )
                !E setAmplitude is impossible because of intensity
                D Setting amplitude to: 5001
                intensity=5001
                !E Failed to set amplitude {error}
                )
                D perform end effect)",
             ""},
            {CALL(perform_1_1)(0, 1), kNone, "D perform_1_1 start effect : 0, strength : 1", ""},
            {CALL(perform_1_2)(0, 1), kNone, "D perform_1_2 start effect : 0, strength : 1", ""},
            {CALL(supportsExternalControl)(), "true", "ext_control?", "false"},
            // A motor that cannot be asked counts as idle.
            {CALL(setExternalControl)(true), "OK", R"(
                running?
                D isVibrating : false
                D setExternalControl external control set as true
                ext_control=1
                !E THE_DEVICE_EXT_CONTROL is impossible)",
             kUnsupported},
            {CALL(perform_1_3)(0, 1), kNone, "D perform_1_3 start effect : 0, strength : 1", ""},
            {CALL(daxSupportsAmplitudeControl)(), "true", "@; intensity?", "false"},
            {CALL(daxSupportsForceTouchAmplitudeControl)(), "true", "@; force_touch_intensity?",
             "false"},
            {CALL(daxSupportsFrequencyControl)(), "true", "@; multi_freq?", "false"},
            {CALL(daxSupportsHapticEngine)(), "true", "@; haptic_engine?", "false"},
            {CALL(daxSupportsPrebakedHapticPattern)(), "true", "@; cp_trigger_index?", "false"},
            {CALL(daxSupportsFolderStatusSetting)(), "true", R"(
                D daxSupportsFolderStatusSetting starts
                @
                event_cmd:511="FOLDER_OPEN\n"
                D daxSupportsFolderStatusSetting TRUE)",
             "false"},
            // A motor whose name cannot be read is judged by the haptic engine.
            {CALL(daxSupportsEnhancedVelmoraHapticPattern)(), "true", R"(
                @
                motor_type?r
                !haptic_engine?
                !E daxSupportsEnhancedVelmoraHapticPattern Enhanced supports motor
                !=true
                motor_type:31r="LINEAR_1040\n"
                D daxSupportsEnhancedVelmoraHapticPattern LINEAR_1040)",
             "false"},
            {CALL(daxSetAmplitude)(7000), "OK", "@; intensity=7000", kUnknown},
            {CALL(daxSetForceTouchAmplitude)(6000), "OK", "@; force_touch_intensity=6000",
             kUnknown},
            {CALL(daxSetFrequencyType)(3), "OK", "@; multi_freq=3", kUnknown},
            {CALL(daxSetFolderStatus)(1), "OK", R"(
                D daxSetFolderStatus starts
                @
                D FOLDER_CLOSE\n
                D length : 13
                event_cmd="FOLDER_CLOSE\n"
                !D ret : {result}
                !D daxSetFolderStatus error
                D ret : 13
                D daxSetFolderStatus end)",
             kUnknown},
            {CALL(daxGetNumberOfPrebakedHapticPattern)(), "(OK, 12)", R"(
                @
                num_waves?r
                !D daxGetNumberOfPrebakedHapticPattern unsupports
                !=(UNSUPPORTED_OPERATION, 0)
                num_waves:7="12\n"
                !D daxGetNumberOfPrebakedHapticPattern value : 4294967295
                D daxGetNumberOfPrebakedHapticPattern value : 12)",
             "(UNKNOWN_ERROR, 0)"},
            // That the motor is set off is no part of the answer.
            {CALL(daxPerformHapticEngine)(Packets{{10, 5000, 150, 0}, {20, 10000, 200, 1}}, 5000),
             "OK", R"(
                @
                D daxPerformHapticEngine : 8 10 2500 150 0 20 5000 200 1\n
                haptic_engine="8 10 2500 150 0 20 5000 200 1\n"
                !D daxPerformHapticEngine UNKNOWN_ERROR
                ~on=1
                D daxPerformHapticEngine OK)",
             kUnknown},
            {CALL(daxPerformPrebakedHapticPattern)(3, 5050, false), "OK", R"(
                D daxPerformPrebakedHapticPattern pattern : 3, amplitude : 5050
                @
                D daxPerformPrebakedHapticPattern one shoot starts
                intensity=5050
                !D daxPerformPrebakedHapticPattern intensity write fail
                cp_trigger_index=3
                !D daxPerformPrebakedHapticPattern pattern write fail
                on=1000
                !D daxPerformPrebakedHapticPattern on fail
                D daxPerformPrebakedHapticPattern one shoot end)",
             kUnknown},
            {CALL(daxPerformPrebakedHapticPattern)(3, 5050, true), "OK", R"(
                D daxPerformPrebakedHapticPattern pattern : 3, amplitude : 5050
                @
                D daxPerformPrebakedHapticPattern repeat starts
                D daxPerformPrebakedHapticPattern : 3.50, 10, 0~ , 12
                cp_trigger_index=65534
                !D daxPerformPrebakedHapticPattern write 0xFFFE fail
                cp_trigger_queue="3.50, 10, 0~\0"
                !D ret : {result}
                !D daxPerformPrebakedHapticPattern repeat error
                D ret : 13
                on=1000
                !D daxPerformPrebakedHapticPattern on Trigger fail
                D daxPerformPrebakedHapticPattern end)",
             kUnknown, "/repeat"},
            // Without its name the motor is taken for a LINEAR_INDEX, which has another ladder.
            {CALL(daxGetAmplitudeList)(0), "true [ 0 1000 5000 9000 ]",
             R"(
                @
                (getMotorIndex
                D getMotorIndex return motor type >>
                motor_type:31="COINDC_PMIC\n"
                D getMotorIndex return motor type : 3 <<
                )
                !D getMotorIndexbyMethod >> ; !cp_trigger_index?; !haptic_engine?
                !D getMotorIndexbyMethod : 5 <<
                !D Vibrator motor type is NONE. but ran vib method fallback : 5
                !D daxGetAmplitudeList type: 0 : 5
                !cp_trigger_index?
                !D daxGetAmplitudeList support index method
                !D daxGetAmplitudeList list size: 6
                !D daxGetAmplitudeList list_outputsize size: 6
                !=true [ 0 3000 4000 6000 8000 10000 ]
                D daxGetAmplitudeList type: 0 : 3
                cp_trigger_index?
                !D daxGetAmplitudeList NOT support index method
                !D daxGetAmplitudeList list size: 4
                !D daxGetAmplitudeList list_outputsize size: 4
                !=true [ 0 1000 5000 9000 ]
                D daxGetAmplitudeList support index method
                D daxGetAmplitudeList list size: 4
                D daxGetAmplitudeList list_outputsize size: 4)",
             "false [ ]"},
    };
}

}  // namespace tests
