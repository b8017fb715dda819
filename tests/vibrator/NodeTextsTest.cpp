// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include <algorithm>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class NodeTextsTest : public BothLayoutsTest {};
INSTANTIATE_FOR_BOTH_LAYOUTS(NodeTextsTest);

TEST_P(NodeTextsTest, LeadingNumberOfSevenBytesIsTheCount) {
    const auto counts = [&](const std::string& text, const std::string& answer,
                            const std::string& value) {
        row(CALL(daxGetNumberOfPrebakedHapticPattern)(), answer,
            "num_waves?r; num_waves:7=\"" + text + "\"; D {name} value : " + value);
    };
    const std::pair<const char*, std::string> numbers[] = {
            {R"(  42\n)", "42"}, {R"(7\n)", "7"},        {"-5", "4294967291"},
            {"+3", "3"},         {R"(\n 8 9\n)", "8"},   {R"(12ms\n)", "12"},
            {"00012", "12"},     {"1234567", "1234567"}, {"-999999", "4293967297"},
            {"0x1F", "0"},       {"5.7", "5"},           {R"(-1\n)", "4294967295"}};
    for (const auto& [text, number] : numbers)
        counts(text, "(OK, " + number + ")", number);
    for (const char* text : {"", R"(\n)", R"(word\n)", "-", "+", "+-5", "- 5", "       ", R"(\05)"})
        counts(text, "(UNKNOWN_ERROR, 0)", "4294967295");
}

TEST_P(NodeTextsTest, OneOfFourLettersMeansFoldEvents) {
    const auto expectEvents = [&](const std::string& text, bool supported) {
        row(CALL(daxSupportsFolderStatusSetting)(), supported ? "true" : "false",
            "D {name} starts; event_cmd:511=\"" + text + "\"; D {name} " +
                    (supported ? "TRUE" : "FALSE"));
    };
    for (const char* text : {"OFF", R"(ON\n)", "D", R"(xFx\n)", "00L00", R"(0\nD\n)"})
        expectEvents(text, true);
    for (const char* text : {R"(0\n)", "1", R"(fold\n)", R"(\n)", R"(GEN\n)", R"(a\0D)"})
        expectEvents(text, false);
}

TEST_P(NodeTextsTest, OnlyTheExactNameMeansEnhancedPatterns) {
    const auto expectVerdict = [&](const std::string& name, bool supported) {
        row(CALL(daxSupportsEnhancedVelmoraHapticPattern)(), supported ? "true" : "false",
            "motor_type?r; motor_type:31r=\"" + name + "\"; D {name} " +
                    (supported ? name : "can not supports. Out of capability"));
    };
    expectVerdict("LINEAR_1040", true);
    for (const char* name : {R"(LINEAR_1040\n\n)", R"(linear_1040\n)", R"(LINEAR_1040 \n)",
                             R"(LINEAR_0832RC\n)", R"(LINEAR_104\n)", R"(\n)", "LINEAR_10400"})
        expectVerdict(name, false);
    row(CALL(daxSupportsEnhancedVelmoraHapticPattern)(), "false",
        "motor_type?r!ENOENT; haptic_engine?!ENOENT; E {name} not supports");
}

class LaddersTest : public BothLayoutsTest {
  protected:
    static constexpr char kNoList[] = "false [ ]";
    static constexpr char kW[] = "true [ 0 1000 5000 9000 ]";
    static constexpr char kX[] = "true [ 0 2000 4000 6000 8000 10000 ]";
    static constexpr char kY[] = "true [ 0 3400 4900 6500 8200 10000 ]";
    static constexpr char kZ[] = "true [ 0 3000 4000 6000 8000 10000 ]";

    /** Expects a list, after the steps that find out the motor. */
    void expectList(const std::string& finding, int motor, int type, const std::string& list,
                    bool hasIndex = true) {
        const auto size = std::to_string(std::count(list.begin(), list.end(), ' ') - 2);
        row(CALL(daxGetAmplitudeList)(type), list,
            finding + "; D {name} type: " + std::to_string(type) + " : " + std::to_string(motor) +
                    "; cp_trigger_index?" + (hasIndex ? "; D {name} " : "!ENOENT; D {name} NOT ") +
                    "support index method; D {name} " +
                    (list == kNoList
                             ? "false"
                             : "list size: " + size + "; D {name} list_outputsize size: " + size));
    }
    static std::string named(const std::string& text, int motor) {
        return "(getMotorIndex; D getMotorIndex return motor type >>; motor_type:31=\"" + text +
               "\"; D getMotorIndex return motor type : " + std::to_string(motor) + " <<; )";
    }
    /** @return the steps that infer a motor from its features, where its name says nothing. */
    static std::string inferred(const std::string& naming, const std::string& probes, int motor) {
        const std::string number = std::to_string(motor);
        return naming + "; D getMotorIndexbyMethod >> ; " + probes +
               "; D getMotorIndexbyMethod : " + number +
               " <<; D Vibrator motor type is NONE. but ran vib method fallback : " + number;
    }
};
INSTANTIATE_FOR_BOTH_LAYOUTS(LaddersTest);

TEST_P(LaddersTest, NameAndTypeSelectTheList) {
    const std::tuple<std::string, std::string, std::string> motors[] = {
            {"COINDC", kNoList, kNoList}, {"LINEAR", kX, kY},
            {"COINDC_PMIC", kW, kW},      {"COINDC_INDEX", kNoList, kNoList},
            {"LINEAR_INDEX", kZ, kX},     {"LINEAR_0832RC", kZ, kX},
            {"LINEAR_1040", kZ, kX},      {"LINEAR_RCVMOT", kX, kY},
            {"LINEAR_1030", kX, kX}};
    int motor = 0;
    for (const auto& [name, type0, type1] : motors) {
        ++motor;
        expectList(named(name + "\\n", motor), motor, 0, type0);
        expectList(named(name, motor), motor, 1, type1);
    }
    // For the last motor it matters whether patterns can be selected by index.
    expectList(named("LINEAR_1030", 9), 9, 0, kX, false);
    expectList(named("LINEAR_1030", 9), 9, 1, kY, false);
    // What follows a zero byte is not looked at.
    expectList(named(R"(LINEAR\0_1040\n)", 2), 2, 0, kX);
}

TEST_P(LaddersTest, FeaturesSelectTheListOfAnUnknownMotor) {
    const std::string unreadable =
            R"((getMotorIndex; D getMotorIndex return motor type >>; motor_type!EACCES:31=""; ))";
    const std::string noIndex = "cp_trigger_index?!ENOENT; ";
    for (const char* name : {R"(NONE\n)", R"(LINEAR_1040\n\n)", R"(linear_1040\n)", R"( LINEAR\n)",
                             R"(LINEAR_104\n)", R"(\n)", R"(9\n)"}) {
        expectList(inferred(named(name, 0), "cp_trigger_index?; haptic_engine?", 5), 5, 0, kZ);
    }
    expectList(inferred(unreadable, "cp_trigger_index?; haptic_engine?!ENOENT", 9), 9, 1, kX);
    const auto enhanced = [&](const std::string& name, const std::string& verdict) {
        return noIndex +
               "haptic_engine?; (daxSupportsEnhancedVelmoraHapticPattern; motor_type?r; "
               "motor_type:31r=\"" +
               name + "\"; D daxSupportsEnhancedVelmoraHapticPattern " + verdict + "; )";
    };
    expectList(inferred(unreadable, enhanced("LINEAR_1040", "LINEAR_1040"), 7), 7, 0, kZ, false);
    expectList(inferred(unreadable, enhanced("LINEAR", "can not supports. Out of capability"), 6),
               6, 1, kX, false);
    expectList(inferred(unreadable, noIndex + "haptic_engine?!ENOENT; intensity?", 2), 2, 1, kY,
               false);
    expectList(inferred(unreadable, noIndex + "haptic_engine?!ENOENT; intensity?!ENOENT", 1), 1, 0,
               kNoList, false);
}

TEST_P(LaddersTest, UnknownTypeIsRefusedAfterTheMotorIsKnown) {
    for (const int type : {2, -1}) {
        const std::string number = std::to_string(type);
        row(CALL(daxGetAmplitudeList)(type), kNoList,
            named("LINEAR_1040", 7) + "; D {name} type: " + number + " : 7; E {name} is abnormal " +
                    number);
    }
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
