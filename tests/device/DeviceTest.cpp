// SPDX-License-Identifier: Apache-2.0
#include "Attributes.h"
#include "NodePathTable.h"
#include "support/Process.h"

#include <gtest/gtest.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <filesystem>
#include <numeric>
#include <regex>
#include <set>
#include <sstream>

/** What a device's build, init and policy are told of the service is what the code says. */
namespace {

namespace fs = std::filesystem;
using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using ::android::hardware::vibrator::V1_3::IVibrator;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;
using Texts = std::vector<std::string>;

const std::string kSource = SOURCE_DIRECTORY;
const std::string kBinary = fs::path(SERVICE).filename();
const std::string kInstalled = "/vendor/bin/hw/" + kBinary;

/** @return the lines of a file, without comments and blanks at their begin. */
Texts linesOf(const std::string& file) {
    std::istringstream text(readFile(kSource + "/" + file));
    Texts lines;
    for (std::string line; std::getline(text, line);) {
        line.erase(0, line.find_first_not_of(' '));
        if (!line.empty() && line[0] != '#' && line.rfind("<!--", 0) != 0) lines.push_back(line);
    }
    return lines;
}

std::string textOf(const std::string& file) {
    const Texts lines = linesOf(file);
    return std::accumulate(lines.begin(), lines.end(), std::string());
}

TEST(DeviceTest, BlueprintNamesWhatThereIs) {
    const std::string text = readFile(kSource + "/Android.bp");
    for (const std::string& line :
         {"name: \"" + kBinary + "\"", std::string("vendor: true"),
          std::string("relative_install_path: \"hw\""), std::string("\"-Werror\""),
          std::string("\"-fno-exceptions\""), std::string("\"-fno-rtti\"")}) {
        EXPECT_NE(text.find(line + ","), std::string::npos) << line;
    }
    // The interfaces that it links, and the files that it is made of.
    std::set<std::string> linked;
    const std::regex quoted("\"([^\"]*)\"");
    for (std::sregex_iterator i(text.begin(), text.end(), quoted), end; i != end; ++i) {
        const std::string name = (*i)[1];
        const fs::path path = kSource + "/" + name;
        if (name.find('/') != std::string::npos) {
            EXPECT_TRUE(path.filename() == "*.cpp" ? fs::is_directory(path.parent_path())
                                                   : fs::is_regular_file(path))
                    << name;
        } else if (name.find('@') != std::string::npos && name != kBinary) {
            linked.insert(name);
        }
    }
    EXPECT_EQ(linked, (std::set<std::string>{
                              "android.hardware.vibrator@1.0", "android.hardware.vibrator@1.1",
                              "android.hardware.vibrator@1.2", "android.hardware.vibrator@1.3",
                              "vendor.velmora.hardware.vibrator@2.0",
                              "vendor.velmora.hardware.vibrator@2.1"}));
}

TEST(DeviceTest, EveryListOfNodesIsTheTables) {
    // Class hal is started on boot, after this; the trigger makes the nodes that are given away.
    Texts init = {"service vendor.vibrator-2-1 " + kInstalled,
                  "class hal",
                  "user system",
                  "group system",
                  "on early-boot",
                  "write /sys/class/leds/vibrator/trigger transient"};
    const std::string guide = readFile(kSource + "/docs/device.md");
    for (const uint8_t mode : {kTimedOutputMode, kLedTriggerMode}) {
        EXPECT_NE(guide.find("`" + std::string(kNodeDirectories[mode]) + "`"), std::string::npos);
        for (const NodeInfo& node : NodePathTable) {
            if (node.isIn(mode)) init.push_back("chown system system " + node.pathIn(mode));
        }
    }
    EXPECT_EQ(linesOf("device/" + kBinary + ".rc"), init);

    std::string given = "for node in";
    std::set<std::string> expected;
    for (const NodeInfo& node : NodePathTable) {
        given += std::string(" ") + node.leaf;
        expected.insert(std::string(node.onlyMode ? kNodeDirectories[*node.onlyMode] : "") +
                        node.leaf + (node.isOnlyRead ? " r" : " rw"));
        if (!node.onlyMode) continue;
        EXPECT_NE(guide.find("`" + std::string(node.leaf) + "`"), std::string::npos) << node.leaf;
    }
    EXPECT_NE(readFile(NODES_SCRIPT).find(given + "; do\n"), std::string::npos);

    // Each string is logged under its own name.
    const std::string table = readFile(kSource + "/vibrator/NodePathTable.cpp");
    const std::regex row(R"re(&(THE_DEVICE_\w+),\s+"Vibrator \1 %s")re");
    EXPECT_EQ(std::distance(std::sregex_iterator(table.begin(), table.end(), row), {}),
              std::count_if(std::begin(NodePathTable), std::end(NodePathTable),
                            [](const NodeInfo& node) { return node.path != nullptr; }));

    std::set<std::string> simulated;
    for (const model::Attribute& attribute : model::attributes()) {
        const auto* layout = std::get_if<model::Layout>(&attribute.origin);
        simulated.insert(std::string(layout != nullptr ? model::sysfsDirectory(*layout) : "") +
                         attribute.leaf + ((attribute.mode & 0222) == 0 ? " r" : " rw"));
    }
    EXPECT_EQ(simulated, expected);
}

TEST(DeviceTest, ManifestDeclaresWhatIsRegisteredAndMatrixAllowsIt) {
    const auto hal = [](const std::string& attribute, const std::string& transport,
                        const std::string& descriptor) {
        static const std::regex parts("(.*)@(.*)::(.*)");
        return std::regex_replace(descriptor, parts,
                                  "<hal format=\"hidl\"" + attribute + "><name>$1</name>" +
                                          transport + "<version>$2</version><interface><name>$3" +
                                          "</name><instance>default</instance></interface></hal>");
    };
    const std::string hwbinder = "<transport>hwbinder</transport>";
    EXPECT_EQ(textOf("device/" + kBinary + ".xml"),
              "<manifest version=\"1.0\" type=\"device\">" +
                      hal("", hwbinder, IDaxVibrator::descriptor) +
                      hal("", hwbinder, IVibrator::descriptor) + "</manifest>");
    // The platform's own matrix has the platform's interface.
    EXPECT_EQ(textOf("device/framework_compatibility_matrix.xml"),
              "<compatibility-matrix version=\"1.0\" type=\"framework\">" +
                      hal(" optional=\"true\"", "", IDaxVibrator::descriptor) +
                      "</compatibility-matrix>");
}

TEST(DeviceTest, PolicyLabelsTheBinaryTheInterfaceAndTheNodes) {
    const std::string types = readFile(kSource + "/device/sepolicy/hal_vibrator_velmora.te");
    EXPECT_NE(types.find("type hal_vibrator_velmora_exec,"), std::string::npos);
    EXPECT_NE(types.find("allow hal_vibrator_velmora sysfs_vibrator:file rw_file_perms;"),
              std::string::npos);
    // Each context is a pattern and a label.
    const std::tuple<const char*, std::string, const char*> labels[] = {
            {"file_contexts", kInstalled, "hal_vibrator_velmora_exec"},
            {"hwservice_contexts", "vendor.velmora.hardware.vibrator::IDaxVibrator",
             "hal_vibrator_hwservice"},
            {"genfs_contexts", "/devices/virtual/timed_output/vibrator/enable", "sysfs_vibrator"},
            {"genfs_contexts", "/devices/platform/leds/leds/vibrator/state", "sysfs_vibrator"},
    };
    const std::regex context(R"((?:genfscon sysfs )?(\S+)\s+u:object_r:(\w+):s0)");
    for (const auto& [file, subject, type] : labels) {
        std::string found;
        for (const std::string& line : linesOf(std::string("device/sepolicy/") + file)) {
            std::smatch parts;
            ASSERT_TRUE(std::regex_match(line, parts, context)) << line;
            if (std::regex_match(subject, std::regex(parts[1].str() + "(/.*)?"))) found = parts[2];
        }
        EXPECT_EQ(found, type) << subject;
    }
}

}  // namespace
