// SPDX-License-Identifier: Apache-2.0
#include "support/LogCapture.h"
#include "transport/TransportTest.h"

#include <hidl/Host.h>
#include <sys/stat.h>

#include <filesystem>

namespace {

namespace fs = std::filesystem;
namespace host = ::android::hardware::host;

constexpr char kName[] = "vendor.velmora.hardware.vibrator@2.1::IDaxVibrator.default";
constexpr char kInheritedName[] = "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator.default";

class PublicationTest : public TransportTest {
  protected:
    void SetUp() override {
        if (isKernel()) GTEST_SKIP() << "there are no sockets";
    }
    /** @return why a client finds no service. */
    static std::string whyNot() {
        ::android::sp<::android::hidl::base::V1_0::IBase> found;
        return host::findService(IDaxVibrator::descriptor, "default", &found);
    }
    /** Expects that a daemon that is started, as somebody, has a text in its log. */
    void expectLog(const std::string& text, const std::vector<std::string>& command = {SERVICE},
                   uid_t uid = geteuid()) const {
        std::filesystem::remove(logFile());
        ChildProcess daemon;
        daemon.startProgram(command, logFile(), {}, uid);
        EXPECT_TRUE(eventually([&] { return log().find(text) != std::string::npos; })) << log();
    }
};

TEST_F(PublicationTest, SearchSaysEveryPlaceThatItHasLookedAt) {
    LogCapture ownLog;
    EXPECT_EQ(whyNot(),
              "vendor.velmora.hardware.vibrator@2.1::IDaxVibrator/default is not there: " +
                      mDirectory.path() + "/" + kName + ": No such file or directory");
    EXPECT_EQ(ownLog.takeText(), "") << "a try does not wait";
    if (geteuid() != 0) return;
    unsetenv("HWBINDER_DIR");
    setenv("XDG_RUNTIME_DIR", (mDirectory.path() + "/own").c_str(), 1);
    ASSERT_EQ(chmod(mDirectory.path().c_str(), 0755), 0);
    // Its own place first, then root's.
    const int code = runAs(2000, [&] {
        const std::string why = whyNot();
        const size_t own = why.find(mDirectory.path() + "/own/hwbinder");
        return own != std::string::npos && why.find("; /run/hwbinder", own) != std::string::npos
                       ? 0
                       : 1;
    });
    EXPECT_EQ(code, 0);
    unsetenv("XDG_RUNTIME_DIR");
}

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

TEST_F(PublicationTest, LogSaysWhatTheCallsGoOver) {
    expectLog("calls go over sockets in " + mDirectory.path() + ", as HWBINDER_DIR says");
    setenv("HWBINDER_DEVICE", "/dev/null", 1);
    expectLog("not registered: the service manager is not there: /dev/null: not a binder device");
    unsetenv("HWBINDER_DEVICE");
}

}  // namespace
