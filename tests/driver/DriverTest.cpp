// SPDX-License-Identifier: Apache-2.0
#include "driver/RecordedMotor.h"
#include "support/Operations.h"
#include "support/Process.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <linux/input.h>
#include <sys/ioctl.h>
#include <sys/stat.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <memory>
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
constexpr char kNodes[] = "/run/vibrator-driver/class/timed_output/vibrator";
constexpr char kEnvironment[] = "/tmp/environment";

const Kind kPad{"rumble", {FF_RUMBLE, FF_PERIODIC, FF_SINE, FF_GAIN}, 16};
const Kind kKinds[] = {kPad,
                       {"sine", {FF_PERIODIC, FF_SINE, FF_GAIN}, 16},
                       {"constant", {FF_CONSTANT}, 16},
                       {"one slot", {FF_RUMBLE, FF_GAIN}, 1},
                       {"no gain", {FF_RUMBLE}, 4}};

void wait(int milliseconds) {
    std::this_thread::sleep_for(std::chrono::milliseconds(milliseconds));
}

/** A run at one strength, of the service's 10000, or a rest. */
struct Movement {
    int strength;
    double length;
};

class DriverTest : public ::testing::Test {
  protected:
    /** Plugs a motor in, and has the service run on it. */
    void serve(const Kind& kind, const char* layout, uid_t uid = 0) {
        mKind = kind;
        plugIn();
        unlink(kEnvironment);
        const std::string script =
                "echo $HWBINDER_DIR >" + std::string(kEnvironment) + "; exec sleep 1000";
        mSession.startProgram({kDriver, "run", "--layout", layout, "/bin/sh", "-c", script}, kLog,
                              {}, uid);
        ASSERT_TRUE(eventually([] { return !readFile(kEnvironment).empty(); })) << readFile(kLog);
        std::string directory = readFile(kEnvironment);
        directory.pop_back();
        setenv("HWBINDER_DIR", directory.c_str(), 1);
        mVibrator = IDaxVibrator::getService();
        ASSERT_NE(mVibrator, nullptr);
        mMotor->takeChanges();
    }
    void plugIn() {
        mMotor.reset();
        mMotor = std::make_unique<RecordedMotor>(mKind);
    }

    /** @return the process of the service, the session's first that has its name. */
    pid_t service() const {
        const std::string pid = std::to_string(mSession.pid());
        std::istringstream children(readFile("/proc/" + pid + "/task/" + pid + "/children"));
        for (pid_t child = 0; children >> child;) {
            if (readFile("/proc/" + std::to_string(child) + "/comm").find("vendor") == 0)
                return child;
        }
        return -1;
    }

    /** Compares what the motor did with runs that began at a time and end in rest. */
    void expectRuns(double start, const std::vector<Movement>& runs) {
        double end = start;
        for (const Movement& run : runs)
            end += run.length;
        wait(static_cast<int>(end - nowInMs()) + 30);
        const auto changes = mMotor->takeChanges();
        ASSERT_EQ(changes.size(), runs.size() + 1);
        EXPECT_LT(changes[0].time - start, 5);
        EXPECT_EQ(changes.back().strength, 0);
        for (size_t i = 0; i < runs.size(); ++i) {
            EXPECT_EQ(changes[i].strength, inItsUnits(runs[i].strength)) << i;
            EXPECT_NEAR(changes[i + 1].time - changes[i].time, runs[i].length, 10) << i;
        }
    }
    /** @return a strength as the motor is told it. */
    int inItsUnits(int strength) const {
        const bool isConstant = mKind.bits[0] == FF_CONSTANT;
        const int scaled = (strength * (isConstant ? 0x7fff : 0xffff) + 5000) / 10000;
        // The kernel makes a sine wave of a rumble.
        return mKind.bits[0] == FF_PERIODIC ? scaled / 3 + scaled / 6 : scaled;
    }
    template <typename Result>
    static std::string inWords(const ::android::hardware::Return<Result>& result) {
        return answerOf(result).inWords();
    }

    Kind mKind;
    std::unique_ptr<RecordedMotor> mMotor;
    ChildProcess mSession;
    ::android::sp<IDaxVibrator> mVibrator;
};

class MovementTest : public DriverTest,
                     public ::testing::WithParamInterface<std::tuple<Kind, const char*>> {};

TEST_P(MovementTest, MovesAsItWasAsked) {
    const auto& [kind, layout] = GetParam();
    ASSERT_NO_FATAL_FAILURE(serve(kind, layout));
    IDaxVibrator& vibrator = *mVibrator;

    EXPECT_EQ(inWords(vibrator.daxSetAmplitude(5000)), "OK");
    double start = nowInMs();
    EXPECT_EQ(inWords(vibrator.on(300)), "OK");
    expectRuns(start, {{5000, 300}});

    // A change of the strength goes on without a gap, and off ends it.
    start = nowInMs();
    vibrator.on(60000);
    wait(100);
    EXPECT_EQ(inWords(vibrator.setAmplitude(255)), "OK");
    wait(100);
    EXPECT_EQ(inWords(vibrator.off()), "OK");
    expectRuns(start, {{5000, 100}, {10000, 100}});

    start = nowInMs();
    vibrator.perform({}, ::android::hardware::vibrator::V1_0::EffectStrength::STRONG,
                     [](auto status, uint32_t) { EXPECT_EQ(status, VibratorStatus::OK); });
    expectRuns(start, {{10000, 20}});

    start = nowInMs();
    vibrator.daxPerformHapticEngine(
            Packets{{40, 4000, 150, 0}, {60, 10000, 0, 0}, {50, 0, 0, 0}, {30, 6000, -1, 7}}, 5000);
    expectRuns(start, {{2000, 40}, {5000, 60}, {0, 50}, {3000, 30}});

    // The third of the shipped patterns, once and again and again; packets take its place.
    start = nowInMs();
    vibrator.daxPerformPrebakedHapticPattern(3, 5000, false);
    expectRuns(start, {{5000, 60}, {3000, 60}, {1500, 60}});
    start = nowInMs();
    vibrator.daxPerformPrebakedHapticPattern(3, 5050, true);
    wait(330);
    vibrator.daxPerformHapticEngine(Packets{{40, 900, 0, 0}}, 10000);
    expectRuns(start,
               {{5000, 60}, {3000, 60}, {1500, 60}, {5000, 60}, {3000, 60}, {1500, 30}, {900, 40}});
    EXPECT_EQ(inWords(vibrator.daxPerformPrebakedHapticPattern(13, 5000, false)), "UNKNOWN_ERROR");
    EXPECT_EQ(inWords(vibrator.daxPerformPrebakedHapticPattern(13, 5000, true)), "UNKNOWN_ERROR");

    // The time is longer than the kernel counts in one effect.
    start = nowInMs();
    vibrator.on(70000);
    expectRuns(start, {{5000, 70000}});

    // What only is set moves nothing, and something else has the motor while it is asked to.
    vibrator.on(0);
    EXPECT_EQ(inWords(vibrator.setExternalControl(true)), "OK");
    EXPECT_EQ(inWords(vibrator.on(50)), "UNKNOWN_ERROR");
    EXPECT_EQ(inWords(vibrator.setExternalControl(false)),
              layout[0] == 'l' ? "UNSUPPORTED_OPERATION" : "OK");
    EXPECT_EQ(inWords(vibrator.daxSetForceTouchAmplitude(1)), "OK");
    EXPECT_EQ(inWords(vibrator.daxSetFrequencyType({})), "OK");
    EXPECT_EQ(mMotor->takeChanges().size(), 0U);
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
            if (operation.name() == "daxGetAmplitudeList") continue;
            EXPECT_EQ(operation.call(*mVibrator).inWords(), operation.answer) << operation.name();
            mVibrator->off();
            mVibrator->on(0);
            mVibrator->setExternalControl(false);
        }
        mSession.kill();
    }
}

TEST_F(DriverTest, StopsWhenAnyProcessIsKilled) {
    for (const bool isService : {true, false}) {
        ASSERT_NO_FATAL_FAILURE(serve(kPad, "timed"));
        mVibrator->on(60000);
        EXPECT_TRUE(eventually([&] { return mMotor->isMoving(); }));
        ::kill(isService ? service() : mSession.pid(), SIGKILL);
        wait(100);
        EXPECT_FALSE(mMotor->isMoving()) << isService;
        mSession.kill();
    }
}

TEST_F(DriverTest, WorksAgainWhenTheMotorIsBack) {
    // A running LED trigger ignores a start; one without its motor must not.
    ASSERT_NO_FATAL_FAILURE(serve(kPad, "led"));
    for (int i = 0; i < 3; ++i) {
        mVibrator->on(60000);
        EXPECT_TRUE(eventually([&] { return mMotor->isMoving(); }));
        mMotor.reset();
        wait(50);
        EXPECT_EQ(inWords(mVibrator->on(50)), "UNKNOWN_ERROR");
        EXPECT_EQ(inWords(mVibrator->off()), "OK");
        plugIn();
        EXPECT_TRUE(eventually([&] { return answerOf(mVibrator->on(50)).inWords() == "OK"; }));
        wait(100);
        EXPECT_EQ(mMotor->takeChanges().size(), 2U);
    }
}

TEST_F(DriverTest, SharesItsMotor) {
    // The only place for an effect is another program's.
    ASSERT_NO_FATAL_FAILURE(serve({"one slot", {FF_RUMBLE}, 1}, "timed"));
    const int file = open(mMotor->path().c_str(), O_RDWR | O_CLOEXEC);
    ff_effect effect{};
    effect.type = FF_RUMBLE;
    effect.id = -1;
    ASSERT_EQ(ioctl(file, EVIOCSFF, &effect), 0);
    EXPECT_EQ(inWords(mVibrator->on(50)), "UNKNOWN_ERROR");
    EXPECT_NE(readFile(kLog).find("\"one slot\": other programs use all of its effects"),
              std::string::npos)
            << readFile(kLog);
    EXPECT_EQ(ioctl(file, EVIOCRMFF, effect.id), 0);
    // A program that has grabbed it gets all its events, and does not keep anybody from playing.
    EXPECT_EQ(ioctl(file, EVIOCGRAB, 1), 0);
    const double start = nowInMs();
    EXPECT_EQ(inWords(mVibrator->on(50)), "OK");
    expectRuns(start, {{10000, 50}});
    close(file);
}

TEST_F(DriverTest, RunsForAnOrdinaryUser) {
    const RecordedMotor motor(kPad);
    const auto run = [](std::vector<std::string> words) {
        words.insert(words.begin(), {kDriver, "run"});
        return runProgram(words, 1000);
    };
    EXPECT_EQ(run({"vibratorctl", "on", "50"}).output, "on 50: OK\n");
    EXPECT_EQ(run({"vibratorctl", "intensity", "5000"}).exitCode, 0);
    const std::string plot = run({"sh", "-c", "vibratorctl on 50; vibratorctl plot"}).output;
    EXPECT_NE(plot.find("  on 50\n"), std::string::npos) << plot;
    EXPECT_EQ(run({"sh", "-c", "exit 7"}).exitCode, 7);
    const auto count = [&](const std::string& patterns) {
        std::ofstream("/tmp/patterns") << patterns;
        const Outcome outcome =
                run({"--patterns", "/tmp/patterns", "vibratorctl", "pattern", "count"});
        return outcome.output + outcome.errors;
    };
    EXPECT_EQ(count("# Mine.\n[short]\n30,5000,0,0  20,0,0,0\n[long]\n"),
              "pattern count: OK, 2 patterns\n");
    EXPECT_EQ(count("[bad]\n30,5000,0,0 30,x,0,0\n"),
              "vibrator-driver: run: \"/tmp/patterns\": line 2: \"30,x,0,0\" is not a packet of a "
              "pattern, "
              "PARAM0,INTENSITY,PARAM2,PARAM3\n");
    EXPECT_EQ(count("# None.\n"),
              "vibrator-driver: run: \"/tmp/patterns\": there is no pattern in it\n");
    EXPECT_NE(run({"--patterns", "/", "true"}).errors.find("\"/\" cannot be read"),
              std::string::npos);
    const RecordedMotor second({"second", {FF_RUMBLE}, 1});
    EXPECT_NE(run({"true"}).errors.find("choose a motor with --device: " + motor.path()),
              std::string::npos);
    EXPECT_EQ(run({"--device", second.path(), "true"}).exitCode, 0);
    chmod(second.path().c_str(), 0600);
    EXPECT_NE(run({"--device", second.path(), "true"}).errors.find("Permission denied; log in at"),
              std::string::npos);
    EXPECT_EQ(run({"vibratorctl", "on", "50"}).output, "on 50: OK\n");

    chmod("/dev/fuse", 0600);
    EXPECT_EQ(run({"true"}).errors,
              "vibrator-driver: run: this user needs access to /dev/fuse, of the kernel's module "
              "fuse: "
              "Permission denied\n");
    chmod("/dev/fuse", 0666);
    runProgram({"/bin/sh", "-c", "echo 0 >/proc/sys/user/max_user_namespaces"});
    EXPECT_NE(run({"true"}).errors.find("user.max_user_namespaces"), std::string::npos);
    EXPECT_EQ(runProgram({kDriver, "run", "--device", motor.path(), "true"}).exitCode, 0);
    runProgram({"/bin/sh", "-c", "echo 700 >/proc/sys/user/max_user_namespaces"});
}

TEST_F(DriverTest, RestsWithTheMotor) {
    ASSERT_NO_FATAL_FAILURE(serve(kPad, "timed"));
    mVibrator->on(50);
    wait(200);
    const auto switches = [&] {
        int sum = 0;
        for (const auto& task : std::filesystem::directory_iterator(
                     "/proc/" + std::to_string(mSession.pid()) + "/task")) {
            std::ifstream status(task.path() / "status");
            for (std::string line; std::getline(status, line);) {
                const size_t label = line.find("ctxt_switches:");
                if (label != std::string::npos) sum += std::stoi(line.substr(label + 14));
            }
        }
        return sum;
    };
    const int before = switches();
    wait(10000);
    EXPECT_LE(switches() - before, 2);
}

/** Prints rows for scripts/bench. */
TEST_F(DriverTest, CostsLittle) {
    ASSERT_NO_FATAL_FAILURE(serve(kPad, "timed"));
    const std::string root = "/proc/" + std::to_string(mSession.pid()) + "/root";
    double times[2];
    for (const bool isNode : {true, false}) {
        const std::string path =
                isNode ? root + "/sys/class/timed_output/vibrator/intensity" : "/dev/shm/file";
        const double start = nowInMs();
        for (int i = 0; i < 1000; ++i) {
            const int file = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
            EXPECT_EQ(write(file, "5000\n", 5), 5);
            close(file);
        }
        times[isNode ? 0 : 1] = (nowInMs() - start) * 1000;
    }
    printf("%-49s %9.0f ns  %9.0f ns  %6.2f\n", "write of a motor's node : of a file on tmpfs",
           times[0], times[1], times[0] / times[1]);
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

/** As the units do: the driver has no rights, root mounts, and the service sees the mount alone. */
TEST_F(DriverTest, ServesAnotherUsersService) {
    mKind = kPad;
    plugIn();
    ChildProcess driver;
    driver.startProgram({kDriver, "serve", "--device", mMotor->path()}, kLog, {}, 1500);
    const Outcome mounted = runProgram({"/bin/sh", "-c",
                                        "umask 0077; exec vibrator-driver mount " +
                                                std::to_string(driver.pid()) + " " + kNodes});
    ASSERT_EQ(mounted.exitCode, 0) << mounted.errors;
    runProgram({"/bin/sh", "-c",
                "chown 1000 " + std::string(kNodes) +
                        "/*; mkdir -p /run/sockets; chown 1000:1000 /run/sockets"});
    setenv("HWBINDER_DIR", "/run/sockets", 1);
    mSession.startProgram({"/bin/unshare", "-m", "/bin/sh", "-c",
                           "mount --rbind /run/vibrator-driver/class /sys/class; exec "
                           "start-stop-daemon -S -c system "
                           "-x /sbin/vendor.velmora.hardware.vibrator@2.1-service"},
                          kLog, {});
    mVibrator = IDaxVibrator::getService();
    ASSERT_NE(mVibrator, nullptr) << readFile(kLog);
    mMotor->takeChanges();
    const double start = nowInMs();
    EXPECT_EQ(inWords(mVibrator->on(50)), "OK");
    expectRuns(start, {{10000, 50}});
    for (const char* command : {"doctor", "status"})
        EXPECT_NE(runProgram({"/bin/vibratorctl", command})
                          .output.find("vibrator-driver, " + mMotor->path()),
                  std::string::npos);
    // Others may read the nodes.
    const std::string write = "echo 5 >" + std::string(kNodes) + "/enable";
    EXPECT_EQ(runProgram({"/bin/sh", "-c", write}, 1000).exitCode, 0);
    EXPECT_EQ(runProgram({"/bin/sh", "-c", write}, 2000).exitCode, 1);
    EXPECT_EQ(runProgram({"/bin/cat", kNodes + std::string("/input_device")}, 2000).output,
              mMotor->path() + " rumble\n");
    mSession.kill();
    EXPECT_EQ(runProgram({"/bin/umount", kNodes}).exitCode, 0);
    EXPECT_TRUE(eventually([&] { return !driver.isAlive(); })) << "without files to serve it ends";
}

}  // namespace
}  // namespace tests
