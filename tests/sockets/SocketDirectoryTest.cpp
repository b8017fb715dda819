// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/SocketDirectory.h"
#include "libhwbinder/SocketPublication.h"
#include "support/Process.h"
#include "support/TemporaryDirectory.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/prctl.h>
#include <sys/resource.h>
#include <sys/socket.h>
#include <sys/stat.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <filesystem>

namespace {

namespace fs = std::filesystem;
using ::android::Error;
using ::android::UniqueFd;
using ::android::hardware::ListeningSocket;
using ::android::hardware::SocketDirectory;
using ::android::hardware::SocketPublication;

constexpr uid_t kStranger = 2000;

class SocketDirectoryTest : public ::testing::Test {
  protected:
    SocketDirectoryTest() { setenv("HWBINDER_DIR", mDirectory.c_str(), 1); }
    ~SocketDirectoryTest() override { unsetenv("HWBINDER_DIR"); }

    static bool isRoot() { return geteuid() == 0; }
    /** Makes a directory, or a link where it has a target. @return its path. */
    std::string make(const std::string& name, mode_t mode, uid_t owner = geteuid(),
                     const char* target = nullptr) const {
        const std::string path = mParent.path() + "/" + name;
        if (target != nullptr) {
            fs::create_symlink(target, path);
        } else {
            fs::create_directory(path);
            EXPECT_EQ(chmod(path.c_str(), mode), 0);
        }
        EXPECT_EQ(lchown(path.c_str(), owner, static_cast<gid_t>(-1)), 0);
        return path;
    }
    static Error publish(ListeningSocket* listener, const std::string& instance = "x") {
        return listenUnderNames(SocketPublication{nullptr, {"a@1.0::IA", "base"}, instance},
                                listener);
    }

    TemporaryDirectory mParent;
    const std::string mDirectory = mParent.path() + "/sockets";
};

TEST_F(SocketDirectoryTest, OnlyDirectoriesThatTheRightOnesCanWriteToAreOpened) {
    const uid_t stranger = isRoot() ? kStranger : geteuid();
    make("good", 0755);
    make("open", 0775);
    make("anybodys", 01757);
    make("mine", 0, geteuid(), "good");
    make("loop", 0, geteuid(), "loop");
    make("his", 0, stranger, "good");
    make("his parent", 0, stranger, ".");
    const struct {
        const char *name, *complaint;
    } rows[] = {
            {"good", ""},
            {"mine/", ""},
            {"./mine/../good//", ""},
            {"a/b", "No such file or directory"},
            {"../../../proc/version", "is not a directory"},
            {"open", "others than its owner may write to it"},
            {"anybodys", "others than its owner may write to it"},
            {"loop", "Too many levels of symbolic links"},
            {"his", "\"his\" is a link of uid 2000"},
            {"his/", "\"his\" is a link of uid 2000"},
            {"his parent/good", "\"his parent\" is a link of uid 2000"},
    };
    for (const auto& [name, complaint] : rows) {
        if (!isRoot() && std::string(name).find("his") == 0) continue;
        const std::string path = mParent.path() + "/" + name;
        SocketDirectory directory;
        const Error error = directory.open(path, false);
        EXPECT_EQ(error.text(), *complaint == '\0' ? "" : path + ": " + complaint);
        setenv("HWBINDER_DIR", path.c_str(), 1);
        ListeningSocket listener;
        EXPECT_EQ(publish(&listener).text(), error.text());
    }
    if (!isRoot()) return;
    const std::string his = make("a stranger's", 0755, kStranger);
    setenv("HWBINDER_DIR", his.c_str(), 1);
    ListeningSocket listener;
    EXPECT_EQ(publish(&listener).text().find(his + ": belongs to uid 2000"), 0U);
}

TEST_F(SocketDirectoryTest, NameOfAnotherIsTakenWhateverHappensToErrno) {
    ListeningSocket first;
    const mode_t before = umask(0077);
    ASSERT_TRUE(publish(&first).isOk());
    EXPECT_EQ(umask(before), 0077U);
    // Everybody may connect.
    EXPECT_EQ(fs::status(mDirectory).permissions(), fs::perms(0755));
    EXPECT_EQ(fs::status(mDirectory + "/a@1.0::IA.x").permissions(), fs::perms(0777));
    ListeningSocket second;
    const Error taken = publish(&second);
    EXPECT_EQ(taken.code(), -EWOULDBLOCK);
    EXPECT_EQ(taken.text(), "another process has the name");
    first = {};
    EXPECT_TRUE(publish(&second).isOk());
}

TEST_F(SocketDirectoryTest, NamesThatNoSocketCanHaveAreRefused) {
    using std::string_literals::operator""s;
    ListeningSocket listener;
    for (const std::string& name : {"a/b"s, "x\0y"s, "x~"s, "x.lock"s, std::string(100, 'x')})
        EXPECT_EQ(publish(&listener, name).text().find("\"a@1.0::IA."), 0U) << name;
}

TEST_F(SocketDirectoryTest, FilesThatAreInTheWayAreSaid) {
    make("sockets", 0755);
    // What another service had.
    fs::create_symlink("another", mDirectory + "/b@1.0::IB.x");
    ListeningSocket listener;
    const SocketPublication publication{nullptr, {"a@1.0::IA", "b@1.0::IB", "base"}, "x"};
    for (const auto& [name, complaint] : {std::pair("b@1.0::IB.x", "File exists"),
                                          std::pair("a@1.0::IA.x", "Address already in use")}) {
        const std::string temporary = mDirectory + "/" + name + "~";
        fs::create_directory(temporary);
        EXPECT_EQ(listenUnderNames(publication, &listener).text(),
                  mDirectory + "/" + name + ": " + complaint);
        fs::remove(temporary);
    }
    // What a service that died in its start has left.
    for (const char* name : {"/b@1.0::IB.x~", "/a@1.0::IA.x~"})
        fs::create_symlink("another", mDirectory + name);
    EXPECT_TRUE(listenUnderNames(publication, &listener).isOk());
    EXPECT_EQ(fs::read_symlink(mDirectory + "/b@1.0::IB.x"), "a@1.0::IA.x");
    EXPECT_FALSE(fs::exists(mDirectory + "/base.x")) << "every object has that one";
}

TEST_F(SocketDirectoryTest, MissingDescriptorsAreSaid) {
    rlimit before{};
    getrlimit(RLIMIT_NOFILE, &before);
    /** Allows ever more descriptors, until a call succeeds. */
    const auto expectComplaints = [&](const auto& call) {
        int complaints = 0;
        for (rlimit limit{3, before.rlim_max}; limit.rlim_cur < 1000; ++limit.rlim_cur) {
            setrlimit(RLIMIT_NOFILE, &limit);
            const Error error = call();
            setrlimit(RLIMIT_NOFILE, &before);
            if (error.isOk()) break;
            EXPECT_LT(error.text().find(": Too many open files"), 200U) << error.text();
            ++complaints;
        }
        EXPECT_GT(complaints, 0);
        EXPECT_LT(complaints, 900);
    };
    ListeningSocket listener;
    expectComplaints([&] { return publish(&listener); });
    SocketDirectory directory;
    UniqueFd connection;
    ASSERT_TRUE(directory.open(mDirectory, false).isOk());
    expectComplaints([&] { return directory.connect("a@1.0::IA.x", &connection); });
}

TEST_F(SocketDirectoryTest, LockThatOthersCouldHoldIsRefused) {
    make("sockets", 0755);
    const std::string lock = mDirectory + "/a@1.0::IA.x.lock";
    ListeningSocket listener;
    for (const mode_t mode : {0644U, 0600U}) {
        UniqueFd(open(lock.c_str(), O_CREAT | O_CLOEXEC, mode));
        if (mode == 0600 && (!isRoot() || chown(lock.c_str(), kStranger, kStranger) != 0)) break;
        EXPECT_EQ(publish(&listener).text(),
                  lock + ": others may open it, and hold the name; remove it");
        fs::remove(lock);
    }
    EXPECT_TRUE(publish(&listener).isOk());
    EXPECT_EQ(fs::status(lock).permissions(), fs::perms::owner_read | fs::perms::owner_write);
}

TEST_F(SocketDirectoryTest, OwnerIsTrustedWhereNobodyElseCouldHavePutTheDirectory) {
    if (!isRoot()) GTEST_SKIP() << "only root can become somebody else";
    // Of the server that is asked for: whose the parent is, its mode, and whose the directory is.
    const struct {
        uid_t parentsOwner;
        mode_t mode;
        uid_t owner, server;
        const char* complaint;
    } rows[] = {
            {0, 0755, 0, 0, ""},
            {0, 0755, kStranger, kStranger, ""},
            {0, 0755, 2001, kStranger, ", to whom the directory does not belong"},
            {0, 0755, 0, kStranger, ", to whom the directory does not belong"},
            {0, 01777, kStranger, kStranger, ", whose directory others than root can exchange"},
            {0, 0777, kStranger, kStranger, ", whose directory others than root can exchange"},
            {kStranger, 0755, kStranger, kStranger,
             ", whose directory others than root can exchange"},
            {0, 01777, 0, 0, ""},
            {0, 01777, kStranger, 0, ""},
    };
    for (const auto& row : rows) {
        const std::string parent = make("parent", row.mode, row.parentsOwner);
        const std::string path = make("parent/sockets", 0755);
        SocketDirectory directory;
        ASSERT_TRUE(directory.open(path, false).isOk());
        sockaddr_un address;
        ASSERT_TRUE(directory.addressOf("a", &address).isOk());
        const UniqueFd listener(socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0));
        ASSERT_EQ(bind(listener.get(), reinterpret_cast<sockaddr*>(&address), sizeof(address)), 0);
        ASSERT_EQ(seteuid(row.server), 0);
        EXPECT_EQ(listen(listener.get(), 8), 0);
        ASSERT_EQ(seteuid(0), 0);
        ASSERT_EQ(chown(path.c_str(), row.owner, row.owner), 0);
        const std::string by = "/a: served by uid " + std::to_string(row.server);
        ASSERT_TRUE(directory.open(path, false).isOk());
        UniqueFd connection;
        const std::string whyNot = directory.connect("a", &connection).text();
        EXPECT_EQ(whyNot, *row.complaint == '\0' ? "" : path + by + row.complaint);
        // Nobody knows who could change the path to the directory that this process is in.
        fs::current_path(parent);
        ASSERT_TRUE(directory.open("sockets", false).isOk());
        EXPECT_EQ(directory.connect("a", &connection).isOk(), row.server == 0);
        fs::current_path("/");
        fs::remove_all(parent);
    }
}

TEST_F(SocketDirectoryTest, ExchangeOfTheDirectoryLeadsNobodyElsewhere) {
    if (!isRoot()) GTEST_SKIP() << "only root can become somebody else";
    ASSERT_EQ(chmod(mParent.path().c_str(), 0777), 0);
    const std::string roots = make("sockets", 0755);
    const std::string victim = make("victim", 0755);
    const std::string his = make("his", 0755, kStranger);
    const std::string link = make("link", 0, kStranger, "victim");
    Child attacker;
    attacker.start([&] {
        if (setuid(kStranger) != 0 || prctl(PR_SET_PDEATHSIG, SIGKILL) != 0) _exit(1);
        while (getppid() != 1) {
            for (const std::string& other : {his, link}) {
                for (int i = 0; i < 2; ++i)
                    renameat2(AT_FDCWD, roots.c_str(), AT_FDCWD, other.c_str(), RENAME_EXCHANGE);
            }
        }
    });
    int published = 0;
    int refused = 0;
    const auto isDone = [&] {
        for (int i = 0; i < 200; ++i) {
            ListeningSocket listener;
            ++(publish(&listener).isOk() ? published : refused);
        }
        return published >= 100 && refused >= 100;
    };
    EXPECT_TRUE(eventually(isDone)) << published << " and " << refused;
    attacker.kill();
    // Whichever names they have now.
    for (const fs::directory_entry& each : fs::directory_iterator(mParent.path())) {
        struct stat info;
        if (lstat(each.path().c_str(), &info) == 0 && S_ISDIR(info.st_mode) &&
            (info.st_uid == kStranger || each.path() == victim)) {
            EXPECT_TRUE(fs::is_empty(each.path())) << each.path();
        }
    }
}

}  // namespace
