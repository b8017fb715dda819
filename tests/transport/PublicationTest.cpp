// SPDX-License-Identifier: Apache-2.0
#include "support/TransportTest.h"

#include <sys/stat.h>

#include <filesystem>

namespace {

namespace fs = std::filesystem;

constexpr char kName[] = "vendor.velmora.hardware.vibrator@2.1::IDaxVibrator.default";
constexpr char kInheritedName[] = "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator.default";

class PublicationTest : public TransportTest {};

TEST_F(PublicationTest, NameGoesToTheNextWhenItsHolderHasGone) {
    // An inherited interface's name that another service had.
    const std::string inherited = mDirectory.path() + "/" + kInheritedName;
    fs::create_symlink("another", inherited);
    // What a daemon that died in its start has left.
    for (const std::string& each : {mDirectory.path() + "/" + kName, inherited})
        fs::create_symlink("another", each + "~");
    serve();
    EXPECT_EQ(fs::read_symlink(inherited), kName);
    EXPECT_FALSE(fs::is_symlink(mDirectory.path() + "/android.hidl.base@1.0::IBase.default"));
    ChildProcess second;
    second.startProgram({SERVICE}, mDirectory.path() + "/second", {});
    const auto secondsLog = [&] { return readFile(mDirectory.path() + "/second"); };
    EXPECT_TRUE(eventually([&] {
        return secondsLog().find("is not registered yet: another process has the name") !=
               std::string::npos;
    }));
    EXPECT_TRUE(answers());
    EXPECT_EQ(secondsLog().find("is registered now"), std::string::npos);
    mServer.kill();
    EXPECT_TRUE(eventually(answers));
    EXPECT_NE(secondsLog().find(std::string(kName) + " is registered now"), std::string::npos);
    EXPECT_EQ(fs::read_symlink(inherited), kName);
}

TEST_F(PublicationTest, EverybodyMayConnectWhateverTheUmask) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    ASSERT_EQ(chmod(mDirectory.path().c_str(), 0755), 0);
    const std::string directory = mDirectory.path() + "/new";
    setenv("HWBINDER_DIR", directory.c_str(), 1);
    serve("umask 0077");
    EXPECT_EQ(runAs(2000, [] { return answers() ? 0 : 1; }), 0);
}

TEST_F(PublicationTest, LogSaysWhyADaemonIsNotRegistered) {
    setenv("HWBINDER_DEVICE", "/dev/null", 1);
    startDaemon(mServer);
    unsetenv("HWBINDER_DEVICE");
    constexpr char kSaid[] =
            "not registered: the service manager is not there: /dev/null: not a binder device";
    EXPECT_TRUE(eventually([&] { return log().find(kSaid) != std::string::npos; })) << log();
}

}  // namespace
