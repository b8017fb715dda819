// SPDX-License-Identifier: Apache-2.0
#include "NodePathTable.h"
#include "support/Process.h"

#include <gtest/gtest.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <filesystem>
#include <nlohmann/json.hpp>
#include <pugixml.hpp>
#include <regex>
#include <set>
#include <sstream>

/** What a device's build, init and policy are told of the service is what the code says. */
namespace {

using namespace ::vendor::velmora::hardware::vibrator::V2_1::implementation;
using nlohmann::json;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

const std::string kSource = SOURCE_DIRECTORY;
const std::string kBinary = std::filesystem::path(SERVICE).filename();
const std::string kInstalled = "/vendor/bin/hw/" + kBinary;

/**
 * Reads a blueprint by turning it into JSON: names get quotation marks, a module's type becomes its
 * first member, and commas before a closing bracket go.
 */
json parseBlueprint(const std::string& file) {
    std::string text = std::regex_replace(readFile(kSource + "/" + file), std::regex("//.*"), "");
    text = std::regex_replace(text, std::regex(R"((\w+)\s*:(?!:))"), "\"$1\":");
    text = std::regex_replace(text, std::regex(R"((\w+)\s*\{)"), "{\"module\": \"$1\",");
    text = std::regex_replace(text, std::regex(R"(,(\s*[\]}]))"), "$1");
    text = std::regex_replace(text, std::regex(R"(\}(\s*\{))"), "},$1");
    return json::parse("[" + text + "]");
}

/** @return the parts of an interface's name: package, version and name. */
std::vector<std::string> partsOf(const std::string& descriptor) {
    std::smatch parts;
    EXPECT_TRUE(std::regex_match(descriptor, parts, std::regex(R"((.*)@(.*)::(.*))")));
    return {parts[1], parts[2], parts[3]};
}

/** @return all node paths of both layouts, with their directories. */
std::set<std::string> nodePaths() {
    std::set<std::string> paths = {THE_DEVICE_ENABLE, THE_DEVICE_ACTIVATE, THE_DEVICE_DURATION,
                                   THE_DEVICE_STATE};
    for (const uint8_t mode : {kTimedOutputMode, kLedTriggerMode}) {
        setDriverMode(mode);
        paths.insert({THE_DEVICE_INTENSITY, THE_DEVICE_FORCE_TOUCH_INTENSITY, THE_DEVICE_MULTI_FREQ,
                      THE_DEVICE_HAPTIC_ENGINE, THE_DEVICE_HAPTIC_ENGINE_INDEX,
                      THE_DEVICE_HAPTIC_PLAYBACK_QUEUE, THE_DEVICE_HAPTIC_ENGINE_NUM_WAVES,
                      THE_DEVICE_MOTOR_TYPE, THE_DEVICE_EVENT_CMD, THE_DEVICE_PATTERN_LENGTH,
                      THE_DEVICE_EXT_CONTROL});
    }
    return paths;
}

TEST(DeviceTest, BlueprintsBuildTheServiceAndItsInterfaces) {
    const json modules = parseBlueprint("Android.bp");
    ASSERT_EQ(modules.size(), 1U);
    const json& binary = modules[0];
    EXPECT_EQ(binary["module"], "cc_binary");
    EXPECT_EQ(binary["name"], kBinary);
    EXPECT_EQ(binary["vendor"], true);
    EXPECT_EQ(binary["relative_install_path"], "hw");
    for (const char* list : {"init_rc", "vintf_fragments"}) {
        ASSERT_EQ(binary[list].size(), 1U);
        EXPECT_TRUE(std::filesystem::exists(kSource + "/" + binary[list][0].get<std::string>()));
    }
    EXPECT_EQ(binary["cppflags"], (json{"-fno-exceptions", "-fno-rtti"}));
    const json& flags = binary["cflags"];
    EXPECT_NE(std::find(flags.begin(), flags.end(), "-Werror"), flags.end());
    for (const json& pattern : binary["srcs"]) {
        const std::filesystem::path sources = pattern.get<std::string>();
        EXPECT_EQ(sources.filename(), "*.cpp");
        EXPECT_TRUE(std::filesystem::is_directory(kSource / sources.parent_path()));
    }

    // The service links every interface of its chain, and each of the two of ours has its module.
    std::set<std::string> needed;
    for (const std::string version : {"2.0", "2.1"}) {
        const json interface = parseBlueprint("interface/" + version + "/Android.bp").at(0);
        EXPECT_EQ(interface["module"], "hidl_interface");
        EXPECT_EQ(interface["name"], "vendor.velmora.hardware.vibrator@" + version);
        needed.insert(interface["name"].get<std::string>());
        for (const std::string each : interface["interfaces"]) {
            if (each != "android.hidl.base@1.0") needed.insert(each);
        }
        EXPECT_EQ(interface["root"], parseBlueprint("interface/Android.bp").at(0)["name"]);
        for (const std::string source : interface["srcs"]) {
            const std::string path = kSource + "/interface/" + version + "/" + source;
            EXPECT_TRUE(std::filesystem::exists(path)) << path;
        }
    }
    std::set<std::string> linked;
    for (const std::string library : binary["shared_libs"]) {
        if (library.find('@') != std::string::npos) linked.insert(library);
    }
    EXPECT_EQ(linked, needed);
}

TEST(DeviceTest, InitStartsTheServiceAndGivesItTheNodes) {
    std::istringstream file(readFile(kSource + "/device/" + kBinary + ".rc"));
    const std::set<std::string> options = {"class hal", "user system", "group system"};
    std::string section;
    std::set<std::string> seenOptions;
    std::set<std::string> given;
    std::vector<std::string> order;
    for (std::string line; std::getline(file, line);) {
        if (line.empty() || line[0] == '#') continue;
        if (line[0] != ' ') {
            section = line;
            order.push_back(line);
            continue;
        }
        const std::string command = line.substr(4);
        std::smatch words;
        if (section.find("service ") == 0) {
            EXPECT_EQ(options.count(command), 1U) << command;
            seenOptions.insert(command);
        } else if (std::regex_match(command, words, std::regex("chown system system (\\S+)"))) {
            EXPECT_TRUE(given.insert(words[1]).second) << command << " is there twice";
        } else {
            // The trigger makes the nodes that are given away after it.
            EXPECT_EQ(command, "write /sys/class/leds/vibrator/trigger transient");
            EXPECT_TRUE(given.empty());
        }
    }
    EXPECT_EQ(order, (std::vector<std::string>{"service vendor.vibrator-2-1 " + kInstalled,
                                               // Class hal is started on boot, after this.
                                               "on early-boot"}));
    EXPECT_EQ(seenOptions, options);
    EXPECT_EQ(given, nodePaths());
}

/** What a manifest or matrix in device/ says of each interface: package, version and name. */
std::vector<std::vector<std::string>> interfacesIn(const std::string& file, const char* type) {
    pugi::xml_document document;
    const pugi::xml_parse_result result = document.load_file((kSource + "/device/" + file).c_str());
    EXPECT_TRUE(result) << file << ": " << result.description();
    const pugi::xml_node root = document.document_element();
    EXPECT_STREQ(root.attribute("type").value(), type);

    std::vector<std::vector<std::string>> interfaces;
    for (const pugi::xml_node& hal : root.children("hal")) {
        EXPECT_STREQ(hal.attribute("format").value(), "hidl");
        EXPECT_STREQ(hal.child("interface").child_value("instance"), "default");
        // A manifest says how the interface is reached; a matrix, whether it must be there.
        const std::string manner = hal.child_value("transport");
        EXPECT_EQ(manner + hal.attribute("optional").value(),
                  type == std::string("device") ? "hwbinder" : "true");
        interfaces.push_back({hal.child_value("name"), hal.child_value("version"),
                              hal.child("interface").child_value("name")});
    }
    return interfaces;
}

TEST(DeviceTest, ManifestDeclaresWhatIsRegisteredAndMatrixAllowsIt) {
    using ::android::hardware::vibrator::V1_3::IVibrator;
    using Interfaces = std::vector<std::vector<std::string>>;
    const std::vector<std::string> ours = partsOf(IDaxVibrator::descriptor);
    EXPECT_EQ(interfacesIn(kBinary + ".xml", "device"),
              (Interfaces{ours, partsOf(IVibrator::descriptor)}));
    // The platform's own matrix has the platform's interface.
    EXPECT_EQ(interfacesIn("framework_compatibility_matrix.xml", "framework"), Interfaces{ours});
}

TEST(DeviceTest, PolicyNamesTheBinaryTheInterfaceAndTheDirectories) {
    const std::string policy = kSource + "/device/sepolicy/";
    const std::string types = readFile(policy + "hal_vibrator_velmora.te");
    // Each context is a pattern and a label; the label's type is declared here or the platform's.
    const auto label = [&](const std::string& file, const std::string& subject) {
        std::istringstream lines(readFile(policy + file));
        for (std::string line; std::getline(lines, line);) {
            std::smatch parts;
            if (std::regex_match(
                        line, parts,
                        std::regex(R"((?:genfscon sysfs )?(\S+)\s+u:object_r:(\w+):s0)")) &&
                std::regex_match(subject, std::regex(parts[1].str() + "(/.*)?"))) {
                return parts[2].str();
            }
        }
        return std::string("none");
    };
    EXPECT_EQ(label("file_contexts", kInstalled), "hal_vibrator_velmora_exec");
    EXPECT_NE(types.find("type hal_vibrator_velmora_exec,"), std::string::npos);
    const std::vector<std::string> interface = partsOf(IDaxVibrator::descriptor);
    EXPECT_EQ(label("hwservice_contexts", interface[0] + "::" + interface[2]),
              "hal_vibrator_hwservice");
    EXPECT_EQ(label("genfs_contexts", "/devices/virtual/timed_output/vibrator/enable"),
              "sysfs_vibrator");
    EXPECT_EQ(label("genfs_contexts", "/devices/platform/leds/leds/vibrator/state"),
              "sysfs_vibrator");
    EXPECT_NE(types.find("allow hal_vibrator_velmora sysfs_vibrator:file rw_file_perms;"),
              std::string::npos);
}

}  // namespace
