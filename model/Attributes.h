// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <sys/types.h>

#include <cstddef>
#include <cstdint>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

/**
 * The model of the kernel vibrator driver: its sysfs attributes, what each takes and shows, and
 * what a write asks of the motor. It opens no files and moves nothing: a State does.
 */
namespace model {

enum class Layout { kTimedOutput, kLedTrigger };
inline constexpr Layout kLayouts[] = {Layout::kLedTrigger, Layout::kTimedOutput};

/** @return where the kernel has the attributes of a layout; ends in a slash. */
const char* sysfsDirectory(Layout layout);

/** @return all features that a driver can have; each stands for one or more attributes. */
std::vector<std::string> featureNames();

/** What a driver offers besides running its motor. */
struct Features {
    std::vector<std::string> names = featureNames();
    /** Text of the motor_type attribute. */
    std::string motor = "LINEAR_1040";
    /** Number of patterns stored in the driver. */
    int waves = 12;
};

/** Starts the motor. milliseconds: 0 stops it; a one-shot timer that is running is replaced. */
struct RunMotor {
    uint64_t milliseconds;
};
/** Sets the strength, from 0 to 10000, of this run and later ones. */
struct SetIntensity {
    int value;
};
/** A haptic engine packet, as the service's interface has it. */
struct Packet {
    int param0;
    int intensity;
    int param2;
    int param3;
};
/** Takes the packets that the next start of the motor plays. */
struct SetPackets {
    std::vector<Packet> packets;
};
/** Chooses the stored pattern, from 0 to 65535, that the next start of the motor plays. */
struct SetPattern {
    int index;
};
/** Takes the stored pattern that the next start of the motor repeats. */
struct SetQueue {
    int pattern;
    int percent;
    int repeats;
    int delay;
};
/** Hands the motor over to something else, or takes it back. */
struct SetExternalControl {
    bool isOn;
};
/** What an accepted write asks for; the first: nothing but to show the value from now on. */
using Action = std::variant<std::monostate, RunMotor, SetIntensity, SetPackets, SetPattern,
                            SetQueue, SetExternalControl>;

/** What is behind the attributes: where their texts are kept, and a motor. */
class State {
  public:
    virtual ~State() = default;
    /** @return the text that was set last, "" if none was. */
    virtual std::string text(const std::string& leaf) const = 0;
    /** Sets the text that an attribute shows. @return 0, or a negative errno. */
    virtual int setText(const std::string& leaf, std::string_view text) = 0;
    /** @return the ms until the motor's one-shot timer ends, rounded up; 0 when it does not run. */
    virtual uint64_t timeLeft() const = 0;
    /**
     * Does what an accepted write asks for. Called before setText.
     *
     * @return 0, or the negative errno that the write fails with; the text then stays as it was.
     */
    virtual int perform(const Action& action) = 0;
};

/** An attribute of the driver. */
struct Attribute {
    /** Its name, like "intensity". */
    const char* leaf;
    /** The layout, or else the feature, that it comes with. */
    std::variant<Layout, std::string_view> origin;
    /** Its permissions. */
    mode_t mode;
    /** The text that it shows at first; nullptr: one of the features says it. */
    const char* initial;
    /** Takes a text. @return 0, or a negative errno. */
    int (*store)(State& state, const std::string& leaf, std::string_view text);
    /** nullptr: shows the state's text. */
    std::string (*show)(const State& state) = nullptr;

    /** @return whether a driver has it. */
    bool isIn(Layout layout, const Features& features) const;
    /** @return the text that it shows at first. */
    std::string initialText(const Features& features) const;
};

/** @return the attributes of all layouts and features. */
const std::vector<Attribute>& attributes();

/** The size that an attribute has, and the most bytes that it takes in one write. */
constexpr size_t kPageSize = 4096;

/**
 * @param flags as open takes them.
 * @return 0, or the negative errno of what an attribute's permissions rule out, for root, too.
 */
int checkAccess(mode_t mode, int flags);

/** @return what reading an attribute yields now. */
std::string show(const State& state, const std::string& leaf);

/**
 * Writes to an attribute, whatever its mode. One that the model does not know keeps any text.
 *
 * @return the number of bytes taken, or a negative errno.
 */
ssize_t store(State& state, const std::string& leaf, std::string_view bytes);

}  // namespace model
