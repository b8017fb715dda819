// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include <map>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

constexpr char kNoDriver[] =
        "D Vibrator driver does not exist. Remove VIB HAL or Setup Vibrator Driver";

/** The lines that show where the nodes are; an empty directory is for no driver. */
std::string pathLines(const std::string& directory) {
    std::string lines;
    for (const NodeInfo& node : NodePathTable) {
        if (node.path == nullptr) continue;
        const std::string format = node.logFormat;
        lines += "; D " + format.substr(0, format.find('%'));
        if (!directory.empty()) lines += directory + node.leaf;
    }
    return lines;
}

class DriverModeTest : public VibratorTest {
  protected:
    DriverModeTest() { construct(); }

    /** Expects of a construction certain probes, a verdict, and the paths in a directory. */
    void expectConstruction(const std::string& probes, const std::string& verdict,
                            const std::string& directory) {
        const auto construction = [this](IDaxVibrator&) {
            construct();
            return Answer{true, 1, true};
        };
        trace();
        log();
        const Operation operation{
                {"construction", construction},
                "true",
                "D !@QOR VIB HAL init; " + probes + "; " + verdict + pathLines(directory),
                ""};
        const Steps steps = parseSteps(mLayout, operation.steps);
        prepareNodes(mDirectory.path(), mLayout, steps);
        expectBehaviour(operation, steps);
    }
};

TEST_F(DriverModeTest, WithoutADriverEveryOperationFails) {
    mLayout = Layout::kTimedOutput;
    expectConstruction("enable?!ENOENT; activate?!ENOENT", kNoDriver, "");
    const std::map<std::string, std::string> others = {
            {"setAmplitude", "UNSUPPORTED_OPERATION"},
            {"daxGetNumberOfPrebakedHapticPattern", "(UNSUPPORTED_OPERATION, 0)"}};
    for (const Operation& operation : allOperations()) {
        const auto other = others.find(operation.name());
        const std::string& failed = other == others.end() ? operation.answerFailed : other->second;
        EXPECT_EQ(operation.call(*mVibrator).inWords(), failed.empty() ? operation.answer : failed)
                << operation.name();
    }
    trace();
    log();
    for (const Operation& operation :
         {Operation{CALL(on)(5), "UNKNOWN_ERROR", "enable!ENOENT=5", ""},
          Operation{CALL(daxSetAmplitude)(5), "UNKNOWN_ERROR",
                    "D >> writeNode node: val:5; E node:  open failed. errno: 2", ""}})
        expectBehaviour(operation, parseSteps(mLayout, operation.steps));
}

TEST_F(DriverModeTest, ProbingStopsAtTheFirstMissingNode) {
    createDriver();
    expectConstruction("enable?!ENOENT; activate?; duration?!EACCES", kNoDriver, "");
    expectConstruction("enable?!ENOENT; activate?; duration?; state?!EACCES", kNoDriver, "");
}

TEST_F(DriverModeTest, LedTriggerNeedsItsThreeNodes) {
    createDriver();
    expectConstruction("enable?!EACCES; activate?; duration?; state?",
                       "D Vibrator using LED trigger", "/sys/class/leds/vibrator/");
}

TEST_F(DriverModeTest, TimedOutputWinsAfterASingleProbe) {
    createDriver();
    mLayout = Layout::kTimedOutput;
    createDriver();
    expectConstruction("enable?", "D Vibrator using timed_output",
                       "/sys/class/timed_output/vibrator/");
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
