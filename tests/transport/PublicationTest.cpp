// SPDX-License-Identifier: Apache-2.0
#include "support/LogCapture.h"
#include "transport/TransportTest.h"

#include <sys/stat.h>
#include <utils/Errors.h>

#include <csignal>
#include <filesystem>
#include <fstream>

namespace {

namespace fs = std::filesystem;

class PublicationTest : public TransportTest {
  protected:
    /** @return what registering in this process gives. */
    android::status_t tryToRegister(const std::string& instance = "default") {
        const android::sp<IDaxVibrator> vibrator = new Vibrator;
        // In a child: what is registered stays so for the life of the process.
        const int code = runAs(geteuid(), [&] {
            const android::status_t status = vibrator->registerAsService(instance);
            return status == android::OK ? 0 : -status;
        });
        return -code;
    }
};

TEST_F(PublicationTest, MissingServiceIsADeadObject) {
    const LogCapture log;
    const auto vibrator = IDaxVibrator::getService();
    ASSERT_NE(vibrator.get(), nullptr);
    for (int i = 0; i < 2; ++i) {
        const auto result = vibrator->on(1);
        EXPECT_FALSE(result.isOk());
        EXPECT_TRUE(result.isDeadObject());
        EXPECT_EQ(result.description(),
                  mDirectory.path() +
                          "/vendor.velmora.hardware.vibrator@2.1::IDaxVibrator.default"
                          ": No such file or directory");
    }
    EXPECT_EQ(vibrator->off().withDefault(Status::BAD_VALUE), Status::BAD_VALUE);
}

TEST_F(PublicationTest, DeadServiceIsInNobodysWay) {
    serve();
    const auto vibrator = IDaxVibrator::getService();
    EXPECT_TRUE(call(*vibrator).isOk);
    mServer.kill();
    EXPECT_TRUE(vibrator->ping().isDeadObject());
    EXPECT_EQ(IDaxVibrator::getService()->ping().description().find(mDirectory.path()), 0U);
    serve();
    EXPECT_TRUE(answers());
    EXPECT_FALSE(vibrator->ping().isOk());
}

TEST_F(PublicationTest, LivingServiceIsNotReplaced) {
    serve();
    const LogCapture log;
    EXPECT_EQ(tryToRegister(), android::ALREADY_EXISTS);
    EXPECT_TRUE(answers());
    EXPECT_EQ(tryToRegister("second"), android::OK);
    mServer.kill();
    EXPECT_EQ(tryToRegister(), android::OK);
}

TEST_F(PublicationTest, EverybodyMayConnectWhateverTheUmask) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    const mode_t before = umask(0077);
    setenv("HWBINDER_DIR", (mDirectory.path() + "/new").c_str(), 1);
    serve();
    umask(before);
    EXPECT_EQ(runAs(2000, [] { return answers() ? 0 : 1; }), 0);
}

TEST_F(PublicationTest, UnusableSurroundingsAreAClearError) {
    const struct {
        std::string directory;
        std::string instance;
        std::string complaint;
    } cases[] = {
            {mDirectory.path() + "/a/b", "default", "No such file or directory"},
            {"/proc/version", "default", "no directory"},
            {"/proc/self", "default", "/proc/self"},
            {mDirectory.path(), "a/b", "is no name for a socket"},
            {mDirectory.path() + "/" + std::string(120, 'x'), "default",
             "characters of a socket address"},
    };
    for (const auto& [directory, instance, complaint] : cases) {
        SCOPED_TRACE(directory);
        setenv("HWBINDER_DIR", directory.c_str(), 1);
        LogCapture log;
        EXPECT_NE(tryToRegister(instance), android::OK);
        const std::string text = log.takeText();
        EXPECT_NE(text.find("E/hwbinder"), std::string::npos) << text;
        EXPECT_NE(text.find(complaint), std::string::npos) << text;
        // The client is told as well.
        EXPECT_TRUE(IDaxVibrator::getService(instance)->off().isDeadObject());
    }
}

TEST_F(PublicationTest, DirectoryOfAnotherUserIsNotUsed) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can give a directory away";
    ASSERT_EQ(chown(mDirectory.path().c_str(), 2000, 2000), 0);
    LogCapture log;
    EXPECT_EQ(tryToRegister(), android::PERMISSION_DENIED);
    EXPECT_NE(log.takeText().find("belongs to uid 2000"), std::string::npos);
}

TEST_F(PublicationTest, DirectoryThatCannotBeWrittenIsAClearError) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    LogCapture log;
    EXPECT_EQ(runAs(2000, [&] { return tryToRegister() == -EACCES ? 0 : 1; }), 0);
    EXPECT_NE(log.takeText().find("Permission denied"), std::string::npos);
}

TEST_F(PublicationTest, UserWithoutADirectoryIsToldSo) {
    if (geteuid() != 0) GTEST_SKIP() << "only root can become somebody else";
    unsetenv("HWBINDER_DIR");
    const LogCapture log;
    EXPECT_EQ(runAs(2000,
                    [] {
                        unsetenv("XDG_RUNTIME_DIR");
                        const auto result = IDaxVibrator::getService()->off();
                        return result.description() ==
                                               "neither HWBINDER_DIR nor XDG_RUNTIME_DIR is set"
                                       ? 0
                                       : 1;
                    }),
              0);
    const std::string runtime = mDirectory.path();
    ASSERT_EQ(chown(runtime.c_str(), 2000, 2000), 0);
    EXPECT_EQ(runAs(2000,
                    [&] {
                        setenv("XDG_RUNTIME_DIR", runtime.c_str(), 1);
                        const android::sp<IDaxVibrator> vibrator = new Vibrator;
                        return vibrator->registerAsService() == android::OK ? 0 : 1;
                    }),
              0);
    EXPECT_TRUE(fs::is_socket(
            runtime + "/hwbinder/vendor.velmora.hardware.vibrator@2.1::IDaxVibrator.default"));
}

}  // namespace
