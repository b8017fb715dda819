// SPDX-License-Identifier: Apache-2.0
#include "support/VibratorTest.h"

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <climits>
#include <filesystem>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {
namespace {

class NodePrimitivesTest : public VibratorTest {
  protected:
    NodePrimitivesTest() { start(Layout::kLedTrigger); }

    Status write(const std::string& leaf, int value) {
        return VibratorPeer::writeNode(*mVibrator, path(leaf), value);
    }
    int32_t readNumber(const std::string& leaf) {
        return VibratorPeer::readNode(*mVibrator, path(leaf));
    }
};

TEST_F(NodePrimitivesTest, WritesDecimalTextAndNewline) {
    // A node that the driver does not know takes any text.
    setNode("scratch", "");
    const std::pair<int, std::string> cases[] = {{0, "0\n"},
                                                 {-1, "-1\n"},
                                                 {500, "500\n"},
                                                 {INT_MAX, "2147483647\n"},
                                                 {INT_MIN, "-2147483648\n"}};
    for (const auto& [value, text] : cases) {
        EXPECT_EQ(write("scratch", value), Status::OK) << value;
        EXPECT_EQ(trace(), written("scratch", text));
        EXPECT_EQ(log(), writeLog("scratch", value));
    }
}

TEST_F(NodePrimitivesTest, EmptyPathIsAMissingNode) {
    errno = 0;
    EXPECT_EQ(Status(VibratorPeer::writeNode(*mVibrator, "", 1)), Status::UNKNOWN_ERROR);
    EXPECT_EQ(errno, ENOENT);
    EXPECT_EQ(log(), (Lines{"D >> writeNode node: val:1", "E node:  open failed. errno: 2"}));
    EXPECT_EQ(VibratorPeer::readNode(*mVibrator, ""), -1);
    EXPECT_EQ(log(), (Lines{"D >> readNode node: ", "E node:  open failed. errno: 2"}));
}

struct Number {
    std::string text;
    int32_t value;
};

TEST_F(NodePrimitivesTest, ReadsTheLeadingNumberOfSevenBytes) {
    const Number cases[] = {
            {"  42\n", 42},
            {"7\n", 7},
            {"-5", -5},
            {"+3\n", 3},
            {"\t\n 8 9\n", 8},
            {"12ms\n", 12},
            {"00012", 12},
            {"12345678", 1234567},
            {"-1\n", -1},
            {"1 2", 1},
            {"0x1F", 0},
            {"5.7", 5},
            // No number at all.
            {"", -1},
            {"\n", -1},
            {"word\n", -1},
            {"-", -1},
            {"+", -1},
            {"+-5", -1},
            {"- 5", -1},
            {"       5", -1},
            {std::string("\0005", 2), -1},
    };
    for (const auto& [text, value] : cases) {
        setNode("intensity", text);
        EXPECT_EQ(readNumber("intensity"), value) << testing::PrintToString(text);
        EXPECT_EQ(trace(), read("intensity", text.substr(0, 7), 7));
        EXPECT_EQ(log(), readLog("intensity"));
    }
}

TEST_F(NodePrimitivesTest, WhateverStandsInANodesPlaceIsJudgedByTheKernel) {
    const std::string place = mDirectory.path() + "/";
    ASSERT_EQ(mkdir((place + "directory").c_str(), 0755), 0);
    ASSERT_EQ(symlink("loop", (place + "loop").c_str()), 0);
    ASSERT_EQ(symlink("nowhere", (place + "dangling").c_str()), 0);
    const struct {
        std::string path;
        Status write;
        int32_t read;
        bool forWriting;
        bool forReading;
    } cases[] = {
            {place + "directory", Status::UNKNOWN_ERROR, -1, false, true},
            {place + "loop", Status::UNKNOWN_ERROR, -1, false, false},
            {place + "dangling", Status::UNKNOWN_ERROR, -1, false, false},
            {place + std::string(5000, 'x'), Status::UNKNOWN_ERROR, -1, false, false},
            {"/proc/version/x", Status::UNKNOWN_ERROR, -1, false, false},
            {"/dev/full", Status::UNKNOWN_ERROR, -1, true, true},
            {"/dev/null", Status::OK, -1, true, true},
    };
    for (const auto& [path, write, read, forWriting, forReading] : cases) {
        SCOPED_TRACE(path);
        EXPECT_EQ(Status(VibratorPeer::writeNode(*mVibrator, path, 5)), write);
        EXPECT_EQ(VibratorPeer::readNode(*mVibrator, path), read);
        EXPECT_EQ(VibratorPeer::isNodeExist(*mVibrator, path), forWriting);
        EXPECT_EQ(VibratorPeer::isNodeExistForRead(*mVibrator, path), forReading);
    }
    EXPECT_FALSE(std::filesystem::exists(place + "nowhere")) << "a node is never created";
    // A pipe without a reader is no obstacle to a writer that opens it for reading, too. Only a
    // reader would wait, as open says it does, and sysfs has no pipes.
    ASSERT_EQ(mkfifo((place + "pipe").c_str(), 0600), 0);
    EXPECT_EQ(Status(VibratorPeer::writeNode(*mVibrator, place + "pipe", 5)), Status::OK);
    EXPECT_TRUE(VibratorPeer::isNodeExist(*mVibrator, place + "pipe"));
}

TEST_F(NodePrimitivesTest, ProbesTellWhetherTheNodeOpensInTheirMode) {
    const struct {
        unsigned mode;
        bool forWriting;
        bool forReading;
    } cases[] = {{0644, true, true}, {0444, false, true}, {0200, false, false}};
    for (const auto& [mode, forWriting, forReading] : cases) {
        setMode("intensity", mode);
        EXPECT_EQ(VibratorPeer::isNodeExist(*mVibrator, path("intensity")), forWriting) << mode;
        EXPECT_EQ(log(), probeLog("intensity", forWriting));
        EXPECT_EQ(VibratorPeer::isNodeExistForRead(*mVibrator, path("intensity")), forReading);
        EXPECT_EQ(log(), (Lines{"D isNodeExistForRead node:" + path("intensity") + " ",
                                forReading ? "D true" : "D false"}));
    }
    setMode("intensity", 0644);
    trace();
    VibratorPeer::isNodeExist(*mVibrator, path("intensity"));
    VibratorPeer::isNodeExistForRead(*mVibrator, path("intensity"));
    VibratorPeer::isNodeExist(*mVibrator, path("absent"));
    EXPECT_EQ(trace(),
              join({probed("intensity"), probed("intensity", "O_RDONLY"), missing("absent")}));
}

}  // namespace
}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
