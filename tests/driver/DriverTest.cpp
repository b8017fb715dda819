// SPDX-License-Identifier: Apache-2.0
#include "driver/RecordedMotor.h"
#include "support/Operations.h"

#include <algorithm>
#include <csignal>
#include <cstdlib>
#include <fstream>
#include <memory>
#include <numeric>
#include <sstream>

/**
 * The daemon, unmodified, on motors of the kernel's real input core, as a program of a virtual
 * machine. Each motor writes down what it was told, and when.
 */
namespace tests {
namespace {

using Kind = RecordedMotor::Kind;
using Packets = std::vector<::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket>;

constexpr char kDriver[] = "/bin/vibrator-driver";
constexpr char kLog[] = "/tmp/driver.log";
constexpr char kEnvironment[] = "/tmp/environment";
constexpr char kFailed[] = "UNKNOWN_ERROR";

const Kind kPad{"rumble", {FF_RUMBLE, FF_PERIODIC, FF_SINE, FF_GAIN}, 16};
const Kind kController{"controller", {}, 16};
const Kind kOneSlot{"one slot", {FF_RUMBLE}, 1};
const Kind kKinds[] = {kPad,
                       kController,
                       kOneSlot,
                       {"sine", {FF_PERIODIC, FF_SINE, FF_GAIN}, 16},
                       {"constant", {FF_CONSTANT}, 16}};

void wait(int milliseconds) {
    std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
}

Outcome runShell(const std::string& script, uid_t uid = 0) {
    return runProgram({"/bin/sh", "-c", script}, uid);
}

/** A run at one strength, of the service's 10000, or a rest. */
struct Movement {
    int strength;
    int length;
};

class DriverTest : public ::testing::Test {
  protected:
    /** Plugs a motor in, and has the service run on it. */
    void serve(const Kind& kind, const char* layout) {
        plugIn(kind);
        unlink(kEnvironment);
        const std::string script =
                "echo $HWBINDER_DIR >" + std::string(kEnvironment) + "; exec sleep 1000";
        mSession.startProgram({kDriver, "run", "--layout", layout, "/bin/sh", "-c", script}, kLog);
        ASSERT_TRUE(eventually([] { return !readFile(kEnvironment).empty(); })) << readFile(kLog);
        std::string directory = readFile(kEnvironment);
        directory.pop_back();
        setenv("HWBINDER_DIR", directory.c_str(), 1);
        mVibrator = IDaxVibrator::getService();
        ASSERT_NE(mVibrator, nullptr) << readFile(kLog);
        mMotor->takeChanges();
    }
    void plugIn(const Kind& kind) {
        mMotor.reset();
        mKind = kind;
        mMotor = std::make_unique<RecordedMotor>(kind);
    }
    std::string call(const Call& made) const { return made(*mVibrator).inWords(); }

    /** Compares what the motor did with runs that began at a time and end in rest. */
    void expectRuns(double start, const std::vector<Movement>& runs) {
        const int length =
                std::accumulate(runs.begin(), runs.end(), 0,
                                [](int sum, const Movement& run) { return sum + run.length; });
        wait(static_cast<int>(start - nowInMs()) + length + 30);
        const auto changes = mMotor->takeChanges();
        ASSERT_EQ(changes.size(), runs.empty() ? 0 : runs.size() + 1);
        if (runs.empty()) return;
        EXPECT_LT(changes[0].time - start, 5);
        EXPECT_EQ(changes.back().strength, 0);
        for (size_t i = 0; i < runs.size(); ++i) {
            EXPECT_EQ(changes[i].strength, inItsUnits(runs[i].strength)) << i;
            EXPECT_NEAR(changes[i + 1].time - changes[i].time, runs[i].length, 10) << i;
        }
    }
    /** @return a strength as the motor is told it. */
    int inItsUnits(int strength) const {
        const int effect = mKind.bits.empty() ? 0 : mKind.bits[0];
        const int scaled = (strength * (effect == FF_CONSTANT ? 0x7fff : 0xffff) + 5000) / 10000;
        // The kernel makes a sine wave of a rumble, and the controller's driver a part of 100.
        if (effect == FF_PERIODIC) return scaled / 3 + scaled / 6;
        return effect == 0 ? scaled * 100 / 0xffff : scaled;
    }

    Kind mKind;
    std::unique_ptr<RecordedMotor> mMotor;
    Child mSession;
    ::android::sp<IDaxVibrator> mVibrator;
};

class MovementTest : public DriverTest,
                     public ::testing::WithParamInterface<std::tuple<Kind, const char*>> {};

TEST_P(MovementTest, MovesAsItWasAsked) {
    const auto& [kind, layout] = GetParam();
    ASSERT_NO_FATAL_FAILURE(serve(kind, layout));
    const struct {
        Call call;
        const char* answer;
        std::vector<Movement> runs = {};
        /** When the next call follows, whatever still runs then; 0: after its runs. */
        int pause = 0;
    } steps[] = {
            {CALL(daxSetAmplitude)(5000), "OK"},
            {CALL(on)(300), "OK", {{5000, 300}}},
            // A change of the strength goes on without a gap, and off ends it.
            {CALL(on)(60000), "OK", {}, 100},
            {CALL(setAmplitude)(255), "OK", {}, 100},
            {CALL(off)(), "OK", {{5000, 100}, {10000, 100}}},
            {CALL(perform)(0, 2), "(OK, 20)", {{10000, 20}}},
            {CALL(daxPerformHapticEngine)(Packets{{40, 4000, 150, 0},
                                                  {60, 10000, 0, 0},
                                                  {50, 0, 0, 0},
                                                  {30, 6000, -1, 7}},
                                          5000),
             "OK",
             {{2000, 40}, {5000, 60}, {0, 50}, {3000, 30}}},
            // The third of the shipped patterns, once and again and again; packets take its place.
            {CALL(daxPerformPrebakedHapticPattern)(3, 5000, false),
             "OK",
             {{5000, 60}, {3000, 60}, {1500, 60}}},
            {CALL(daxPerformPrebakedHapticPattern)(3, 5050, true), "OK", {}, 330},
            {CALL(daxPerformHapticEngine)(Packets{{40, 900, 0, 0}}, 10000),
             "OK",
             {{5000, 60}, {3000, 60}, {1500, 60}, {5000, 60}, {3000, 60}, {1500, 30}, {900, 40}}},
            {CALL(daxPerformPrebakedHapticPattern)(13, 5000, false), kFailed},
            {CALL(daxPerformPrebakedHapticPattern)(13, 5000, true), kFailed},
            // The time is longer than the kernel counts in one effect.
            {CALL(on)(70000), "OK", {{5000, 70000}}},
            // What only is set moves nothing, and something else has the motor while it is asked
            // to.
            {CALL(on)(0), "OK"},
            {CALL(setExternalControl)(true), "OK"},
            {CALL(on)(50), kFailed},
            {CALL(setExternalControl)(false), layout[0] == 'l' ? "UNSUPPORTED_OPERATION" : "OK"},
            {CALL(daxSetForceTouchAmplitude)(1), "OK"},
            {CALL(daxSetFrequencyType)(0), "OK"},
    };
    double start = 0;
    for (const auto& step : steps) {
        SCOPED_TRACE(step.call.name);
        if (start == 0) start = nowInMs();
        EXPECT_EQ(call(step.call), step.answer);
        wait(step.pause);
        if (step.pause > 0) continue;
        expectRuns(start, step.runs);
        start = 0;
    }
    // The controller's driver in the kernel has its own effects and gain.
    if (kind.bits.empty()) return;
    EXPECT_EQ(mMotor->effects(), 1U);
    EXPECT_EQ(mMotor->gain(), kind.bits.back() == FF_GAIN ? 0xffff : -1);
}

INSTANTIATE_TEST_SUITE_P(, MovementTest,
                         ::testing::Combine(::testing::ValuesIn(kKinds),
                                            ::testing::Values("timed", "led")));

TEST_F(DriverTest, AnswersEveryOperation) {
    for (const char* layout : {"led", "timed"}) {
        ASSERT_NO_FATAL_FAILURE(serve(kPad, layout));
        for (const Operation& operation : allOperations()) {
            // The table's motor has another name.
            const bool isNamed = operation.name() == "daxGetAmplitudeList";
            EXPECT_EQ(call(operation.call),
                      isNamed ? "true [ 0 3000 4000 6000 8000 10000 ]" : operation.answer)
                    << operation.name();
            for (const Call& made : {CALL(off)(), CALL(on)(0), CALL(setExternalControl)(false)})
                call(made);
        }
        mSession.kill();
    }
}

TEST_F(DriverTest, StopsWhenAnyProcessIsKilled) {
    for (const bool isService : {true, false}) {
        ASSERT_NO_FATAL_FAILURE(serve(kPad, "timed"));
        const std::string driver = std::to_string(mSession.pid());
        mVibrator->on(60000);
        EXPECT_TRUE(eventually([&] { return mMotor->isMoving(); }));
        runShell("kill -9 " +
                 (isService ? "$(pidof vendor.velmora.hardware.vibrator@2.1-service)" : driver));
        wait(100);
        EXPECT_FALSE(mMotor->isMoving()) << isService;
        mSession.kill();
    }
}

TEST_F(DriverTest, WorksAgainWhenTheMotorIsBack) {
    for (const Kind& kind : {kPad, kController}) {
        // A running LED trigger ignores a start; one without its motor must not.
        ASSERT_NO_FATAL_FAILURE(serve(kind, "led"));
        for (int i = 0; i < 3; ++i) {
            mVibrator->on(60000);
            EXPECT_TRUE(eventually([&] { return mMotor->isMoving(); }));
            mMotor.reset();
            wait(50);
            EXPECT_EQ(call(CALL(on)(50)), kFailed);
            EXPECT_EQ(call(CALL(off)()), "OK");
            plugIn(kOneSlot);
            EXPECT_EQ(call(CALL(on)(50)), kFailed) << "another motor";
            plugIn(kind);
            EXPECT_TRUE(eventually([&] { return call(CALL(on)(50)) == "OK"; }));
            wait(100);
            EXPECT_EQ(mMotor->takeChanges().size(), 2U);
        }
        EXPECT_NE(readFile(kLog).find("\": No such device"), std::string::npos) << readFile(kLog);
        mSession.kill();
    }
}

TEST_F(DriverTest, RestsAfterASuspension) {
    ASSERT_NO_FATAL_FAILURE(serve(kController, "timed"));
    mVibrator->on(3000);
    const double start = nowInMs();
    const Outcome slept =
            runShell("echo +5 >/sys/class/rtc/rtc0/wakealarm && echo mem >/sys/power/state");
    EXPECT_EQ(slept.exitCode, 0) << slept.errors;
    wait(50);
    EXPECT_FALSE(mMotor->isMoving()) << "its time is over, on the clock that goes on";
    EXPECT_LT(nowInMs() - start, 3000);
    mMotor->takeChanges();
    const double again = nowInMs();
    mVibrator->on(50);
    expectRuns(again, {{10000, 50}});
}

TEST_F(DriverTest, SharesItsMotor) {
    // The only place for an effect is another program's.
    ASSERT_NO_FATAL_FAILURE(serve(kOneSlot, "timed"));
    const int file = open(mMotor->path().c_str(), O_RDWR | O_CLOEXEC);
    ff_effect effect{};
    effect.type = FF_RUMBLE;
    effect.id = -1;
    ASSERT_EQ(ioctl(file, EVIOCSFF, &effect), 0);
    EXPECT_EQ(call(CALL(on)(50)), kFailed);
    EXPECT_NE(readFile(kLog).find("\"one slot\": other programs use all of its effects"),
              std::string::npos)
            << readFile(kLog);
    EXPECT_EQ(ioctl(file, EVIOCRMFF, effect.id), 0);
    // A program that has grabbed it gets all its events, and does not keep anybody from playing.
    EXPECT_EQ(ioctl(file, EVIOCGRAB, 1), 0);
    const double start = nowInMs();
    EXPECT_EQ(call(CALL(on)(50)), "OK");
    expectRuns(start, {{10000, 50}});
    close(file);
    // What takes the motor over at its node, past the service, finds it at rest.
    mVibrator->on(60000);
    EXPECT_TRUE(eventually([&] { return mMotor->isMoving(); }));
    std::ofstream("/proc/" + std::to_string(mSession.pid()) +
                  "/root/sys/class/timed_output/vibrator/ext_control")
            << "1\n";
    EXPECT_FALSE(mMotor->isMoving());
}

TEST_F(DriverTest, RunsForAnOrdinaryUser) {
    const RecordedMotor motor(kPad);
    const auto second = std::make_unique<RecordedMotor>(kOneSlot);
    const std::string choice = "--device " + second->path() + " ";
    constexpr char kNamespaces[] = "/proc/sys/user/max_user_namespaces";
    const struct {
        /** What root does first. */
        std::string preparation;
        std::string arguments;
        int exitCode;
        /** What the output or the error has in it. */
        std::string text;
        uid_t uid = 1000;
    } rows[] = {
            {"", "true", 1, "choose a motor with --device: " + motor.path()},
            {"", "--device /dev/null true", 1, "\"/dev/null\" is no motor that can be used"},
            {"", choice + "vibratorctl on 50", 0, "on 50: OK\n"},
            {"", choice + "vibratorctl intensity 5000", 0, ""},
            {"", choice + "sh -c 'vibratorctl on 50; vibratorctl plot'", 0, "  on 50\n"},
            {"", choice + "sh -c 'vibratorctl on 50; vibratorctl watch --once'", 0, "/enable"},
            {"", choice + "sh -c 'exit 7'", 7, ""},
            {"printf '# Mine.\n[short]\n30,5000,0,0  20,0,0,0\n[long]\n' >/tmp/patterns",
             choice + "--patterns /tmp/patterns vibratorctl pattern count", 0,
             "pattern count: OK, 2 patterns\n"},
            {"printf '[bad]\n30,5000,0,0 30,x,0,0\n' >/tmp/patterns",
             choice + "--patterns /tmp/patterns true", 2,
             "run: \"/tmp/patterns\": line 2: \"30,x,0,0\" is not a packet of a pattern, "},
            {"echo '# None.' >/tmp/patterns", choice + "--patterns /tmp/patterns true", 2,
             "run: \"/tmp/patterns\": there is no pattern in it\n"},
            {"", choice + "--patterns / true", 2, "\"/\" cannot be read"},
            {"chmod 0600 " + second->path(), choice + "true", 1, "Permission denied; log in at"},
            {"", "vibratorctl on 50", 0, "on 50: OK\n"},
            {"chmod 0600 /dev/fuse", "true", 1,
             "vibrator-driver: run: this user needs access to /dev/fuse, of the kernel's module "
             "fuse: Permission denied\n"},
            {"chmod 0666 /dev/fuse; echo 0 >" + std::string(kNamespaces), "true", 1,
             "user.max_user_namespaces"},
            {"", choice + "true", 0, "", 0},
    };
    for (const auto& row : rows) {
        runShell(row.preparation);
        const Outcome outcome = runShell(kDriver + (" run " + row.arguments), row.uid);
        const std::string all = outcome.output + outcome.errors;
        EXPECT_EQ(outcome.exitCode, row.exitCode) << row.arguments;
        EXPECT_NE(all.find(row.text), std::string::npos) << row.arguments << ": " << all;
    }
    runShell("echo 700 >" + std::string(kNamespaces));
}

TEST_F(DriverTest, RestsWithTheMotor) {
    ASSERT_NO_FATAL_FAILURE(serve(kPad, "timed"));
    mVibrator->on(50);
    wait(200);
    const auto switches = [&] {
        const std::string tasks = "/proc/" + std::to_string(mSession.pid()) + "/task/*/status";
        return std::stoi(runShell("awk '/ctxt/ { n += $2 } END { print n }' " + tasks).output);
    };
    const int before = switches();
    wait(10000);
    EXPECT_LE(switches() - before, 2);
}

/** Prints rows for scripts/bench. */
TEST_F(DriverTest, CostsLittle) {
    ASSERT_NO_FATAL_FAILURE(serve(kPad, "timed"));
    const auto write1000 = [](const std::string& path) {
        const double start = nowInMs();
        for (int i = 0; i < 1000; ++i) {
            const int file = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
            EXPECT_EQ(write(file, "5000\n", 5), 5);
            close(file);
        }
        return (nowInMs() - start) * 1000;
    };
    const double node = write1000("/proc/" + std::to_string(mSession.pid()) +
                                  "/root/sys/class/timed_output/vibrator/intensity");
    const double file = write1000("/dev/shm/file");
    printf("%-49s %9.0f ns  %9.0f ns  %6.2f\n", "write of a motor's node : of a file on tmpfs",
           node, file, node / file);
    std::vector<double> calls;
    for (int i = 0; i < 200; ++i) {
        const double start = nowInMs();
        mVibrator->on(3);
        wait(6);
        calls.push_back((mMotor->takeChanges().at(0).time - start) * 1e6);
    }
    std::sort(calls.begin(), calls.end());
    printf("%-49s %9.0f ns  %9.0f ns\n", "call of on to the motor's event: median, greatest",
           calls[100], calls.back());
}

}  // namespace
}  // namespace tests
