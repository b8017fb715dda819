// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdint>
#include <optional>
#include <string>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

using ::android::hardware::hidl_vec;
using ::android::hardware::Return;
using ::android::hardware::Void;
using ::android::hardware::vibrator::V1_0::EffectStrength;
using ::android::hardware::vibrator::V1_0::Status;
using ::android::hardware::vibrator::V1_1::Effect_1_1;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;

/** Verdicts of checkCallerPermission. */
constexpr uint32_t kCallerPermitted = 0;
constexpr uint32_t kCallerRefused = 1;

/** What readNode answers where there is no number to answer. */
constexpr int32_t kReadFailed = -1;

/**
 * The vibrator service object. It holds no state: every call becomes accesses of the kernel
 * driver's nodes, and every answer is read back from the driver. The transport status of every
 * result is OK; failures are in the value.
 *
 * Operations named dax serve only the system user and root; to anybody else a query, and
 * daxGetAmplitudeList, answers false, and every other operation Status::UNKNOWN_ERROR.
 */
class Vibrator : public IDaxVibrator {
  public:
    /** Finds out which layout the driver has. Without a driver every operation just fails. */
    Vibrator();

    // android.hardware.vibrator@1.0

    /**
     * Starts the motor.
     *
     * @param timeoutMs how long it runs, in ms; above INT32_MAX the driver gets the negative
     *     number of the same bits.
     * @return OK, or UNKNOWN_ERROR when a node did not take its value.
     */
    Return<Status> on(uint32_t timeoutMs) override;
    /** Stops the motor. @return OK, or UNKNOWN_ERROR when the node did not take its value. */
    Return<Status> off() override;
    /** @return whether setAmplitude works, for this caller too. */
    Return<bool> supportsAmplitudeControl() override;
    /**
     * Sets the strength of the vibration.
     *
     * @param amplitude 1 (weakest) to 255 (strongest).
     * @return OK; UNSUPPORTED_OPERATION without amplitude control; BAD_VALUE for 0; UNKNOWN_ERROR
     *     when the node did not take its value.
     */
    Return<Status> setAmplitude(uint8_t amplitude) override;
    /**
     * Plays the click; all other effects are answered with (UNSUPPORTED_OPERATION, 0).
     *
     * @param _hidl_cb called once with the status and the effect's length in ms.
     */
    Return<void> perform(::android::hardware::vibrator::V1_0::Effect effect,
                         EffectStrength strength, perform_cb _hidl_cb) override;

    // android.hardware.vibrator@1.1 to 1.3

    /** Plays nothing: every effect is answered with (UNSUPPORTED_OPERATION, 0). */
    Return<void> perform_1_1(Effect_1_1 effect, EffectStrength strength,
                             perform_1_1_cb _hidl_cb) override;
    /** Plays nothing: every effect is answered with (UNSUPPORTED_OPERATION, 0). */
    Return<void> perform_1_2(::android::hardware::vibrator::V1_2::Effect effect,
                             EffectStrength strength, perform_1_2_cb _hidl_cb) override;
    /** @return whether the driver can leave the motor to an external control. */
    Return<bool> supportsExternalControl() override;
    /** @return OK, or UNSUPPORTED_OPERATION while the motor runs or when the driver refuses. */
    Return<Status> setExternalControl(bool enabled) override;
    /** Plays nothing: every effect is answered with (UNSUPPORTED_OPERATION, 0). */
    Return<void> perform_1_3(::android::hardware::vibrator::V1_3::Effect effect,
                             EffectStrength strength, perform_1_3_cb _hidl_cb) override;

    // vendor.velmora.hardware.vibrator@2.0

    /** @return whether the driver has a separate intensity setting. */
    Return<bool> daxSupportsAmplitudeControl() override;
    /** @return whether the driver has a separate force-touch intensity setting. */
    Return<bool> daxSupportsForceTouchAmplitudeControl() override;
    /** @return whether the driver lets the frequency be chosen. */
    Return<bool> daxSupportsFrequencyControl() override;
    /** @return whether the driver plays haptic engine packets. */
    Return<bool> daxSupportsHapticEngine() override;
    /** @return whether the driver plays stored patterns selected by number. */
    Return<bool> daxSupportsPrebakedHapticPattern() override;
    /** @return whether the driver takes the fold state of the device. */
    Return<bool> daxSupportsFolderStatusSetting() override;
    /** @return whether the motor can play the enhanced haptic patterns. */
    Return<bool> daxSupportsEnhancedVelmoraHapticPattern() override;
    /**
     * Sets the intensity of the vibration.
     *
     * @param amplitude 1 to 10000.
     * @return OK, BAD_VALUE out of range, or UNKNOWN_ERROR.
     */
    Return<Status> daxSetAmplitude(uint32_t amplitude) override;
    /** Sets the intensity of force-touch feedback; see daxSetAmplitude. */
    Return<Status> daxSetForceTouchAmplitude(uint32_t amplitude) override;
    /** @param type 0 to 4. @return OK, BAD_VALUE out of range, or UNKNOWN_ERROR. */
    Return<Status> daxSetFrequencyType(DaxFrequencyType type) override;
    /** Tells the driver the fold state. @return OK, BAD_VALUE for another, or UNKNOWN_ERROR. */
    Return<Status> daxSetFolderStatus(DaxFolderStatus status) override;
    /**
     * Counts the stored patterns.
     *
     * @param _hidl_cb called once with OK and the count; with (UNSUPPORTED_OPERATION, 0) when the
     *     driver does not tell it; with (UNKNOWN_ERROR, 0) when what it tells is no number.
     */
    Return<void> daxGetNumberOfPrebakedHapticPattern(
            daxGetNumberOfPrebakedHapticPattern_cb _hidl_cb) override;
    /**
     * Plays a waveform.
     *
     * @param packets at most 339.
     * @param amplitude 1 to 10000; scales the packets' intensities, 10000 leaves them unchanged.
     * @return OK; BAD_VALUE for too many packets, an amplitude out of range or a value of more
     *     than 8 characters; UNKNOWN_ERROR when the driver did not take the waveform.
     */
    Return<Status> daxPerformHapticEngine(const hidl_vec<DaxHapticEnginePacket>& packets,
                                          uint32_t amplitude) override;
    /**
     * Plays a stored pattern.
     *
     * @param pattern number of the pattern; 0 played once selects without moving the motor.
     * @param amplitude 1 to 10000.
     * @param repeat whether the pattern is played through the driver's queue.
     * @return OK, BAD_VALUE for an amplitude out of range, or UNKNOWN_ERROR.
     */
    Return<Status> daxPerformPrebakedHapticPattern(uint32_t pattern, uint32_t amplitude,
                                                   bool repeat) override;

    // vendor.velmora.hardware.vibrator@2.1

    /**
     * Gives the ladder of intensities that suits the motor.
     *
     * @param _hidl_cb called once with true and the ladder, valid until the callback returns, or
     *     with false and an empty list.
     */
    Return<void> daxGetAmplitudeList(DaxAmplitudeType type,
                                     daxGetAmplitudeList_cb _hidl_cb) override;

    // What the operations are made of: the driver's nodes, and what they say of the motor.

    /** Writes a number and a newline. @return OK, or UNKNOWN_ERROR when not all of it was taken. */
    Return<Status> writeNode(std::string node, int value);
    /** @return the number at the beginning of the node's first 7 bytes, or kReadFailed. */
    Return<int32_t> readNode(std::string node);
    /** @return whether the node can be opened for reading and writing. */
    Return<bool> isNodeExist(std::string node);
    /** @return whether the node can be opened for reading. */
    Return<bool> isNodeExistForRead(std::string node);

    /** @return whether the driver says that the motor runs. */
    Return<bool> isVibrating();

    /** @return the motor type number, 1 to 9, by the driver's name for it; 0 for none known. */
    Return<int32_t> getMotorIndex();
    /** @return the motor type number, 1, 2, 5, 6, 7 or 9, by the features that the driver offers.
     */
    Return<int32_t> getMotorIndexbyMethod();

  private:
    /** Judges the caller, and logs a refusal. @return kCallerPermitted or kCallerRefused. */
    Return<uint32_t> checkCallerPermission();

    /**
     * Does what writeNode does.
     *
     * @param error set to errno as the open that failed, or else the write, left it; errno itself
     *     may have changed by the time that the caller has the result.
     */
    Status writeNumber(const std::string& node, int value, int* error);
    /** Does what readNode does. @return the number, if the node could be read and holds one. */
    std::optional<int32_t> readNumber(const std::string& node);
};

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
