// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "transport/Proxy.h"
#include "transport/TransactionCodes.h"

#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

/**
 * The remote side of each interface: one layer for each version, put around the interface that the
 * client asked for, and in it one line for each operation.
 */
namespace android::hardware::details {

using ::android::hidl::base::V1_0::DebugInfo;
using ::android::hidl::base::V1_0::IBase;
using V10 = ::android::hardware::vibrator::V1_0::IVibrator;
using V11 = ::android::hardware::vibrator::V1_1::IVibrator;
using V12 = ::android::hardware::vibrator::V1_2::IVibrator;
using V13 = ::android::hardware::vibrator::V1_3::IVibrator;
using V20 = ::vendor::velmora::hardware::vibrator::V2_0::IDaxVibrator;
using V21 = ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

using ::android::hardware::vibrator::V1_0::EffectStrength;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxFrequencyType;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
using VibratorStatus = ::android::hardware::vibrator::V1_0::Status;

// clang-format off

template <typename Interface>
class BaseProxy : public Interface, public Proxy {
public:
    using Proxy::Proxy;
    using Options = hidl_vec<hidl_string>;
    using Recipient = sp<hidl_death_recipient>;

    bool isRemote() const override { return true; }
    Return<void> interfaceChain(IBase::interfaceChain_cb cb) override { return callBack(IBase::descriptor, kInterfaceChain, cb); }
    Return<void> debug(const hidl_handle& fd, const Options& options) override { return call<void>(IBase::descriptor, kDebug, fd, options); }
    Return<void> interfaceDescriptor(IBase::interfaceDescriptor_cb cb) override { return callBack(IBase::descriptor, kInterfaceDescriptor, cb); }
    Return<void> getHashChain(IBase::getHashChain_cb cb) override { return callBack(IBase::descriptor, kGetHashChain, cb); }
    Return<void> setHALInstrumentation() override { return call<void>(IBase::descriptor, kSetHALInstrumentation); }
    Return<void> ping() override { return call<void>(IBase::descriptor, kPing); }
    Return<void> getDebugInfo(IBase::getDebugInfo_cb cb) override { return callBack(IBase::descriptor, kGetDebugInfo, cb); }
    Return<void> notifySyspropsChanged() override { return call<void>(IBase::descriptor, kNotifySyspropsChanged); }
    // This transport tells nobody of a death, so it promises nobody that it will.
    Return<bool> linkToDeath(const Recipient&, uint64_t) override { return false; }
    Return<bool> unlinkToDeath(const Recipient&) override { return false; }
};

template <typename Interface>
class Vibrator10Proxy : public BaseProxy<Interface> {
public:
    using BaseProxy<Interface>::BaseProxy;
    Return<VibratorStatus> on(uint32_t timeoutMs) override { return this->template call<VibratorStatus>(V10::descriptor, kOn, timeoutMs); }
    Return<VibratorStatus> off() override { return this->template call<VibratorStatus>(V10::descriptor, kOff); }
    Return<bool> supportsAmplitudeControl() override { return this->template call<bool>(V10::descriptor, kSupportsAmplitudeControl); }
    Return<VibratorStatus> setAmplitude(uint8_t amplitude) override { return this->template call<VibratorStatus>(V10::descriptor, kSetAmplitude, amplitude); }
    Return<void> perform(::android::hardware::vibrator::V1_0::Effect effect, EffectStrength strength, V10::perform_cb cb) override { return this->callBack(V10::descriptor, kPerform, cb, effect, strength); }
};

template <typename Interface>
class Vibrator11Proxy : public Vibrator10Proxy<Interface> {
public:
    using Vibrator10Proxy<Interface>::Vibrator10Proxy;
    Return<void> perform_1_1(::android::hardware::vibrator::V1_1::Effect_1_1 effect, EffectStrength strength, V11::perform_1_1_cb cb) override { return this->callBack(V11::descriptor, kPerform_1_1, cb, effect, strength); }
};

template <typename Interface>
class Vibrator12Proxy : public Vibrator11Proxy<Interface> {
public:
    using Vibrator11Proxy<Interface>::Vibrator11Proxy;
    Return<void> perform_1_2(::android::hardware::vibrator::V1_2::Effect effect, EffectStrength strength, V12::perform_1_2_cb cb) override { return this->callBack(V12::descriptor, kPerform_1_2, cb, effect, strength); }
};

template <typename Interface>
class Vibrator13Proxy : public Vibrator12Proxy<Interface> {
public:
    using Vibrator12Proxy<Interface>::Vibrator12Proxy;
    Return<bool> supportsExternalControl() override { return this->template call<bool>(V13::descriptor, kSupportsExternalControl); }
    Return<VibratorStatus> setExternalControl(bool enabled) override { return this->template call<VibratorStatus>(V13::descriptor, kSetExternalControl, enabled); }
    Return<void> perform_1_3(::android::hardware::vibrator::V1_3::Effect effect, EffectStrength strength, V13::perform_1_3_cb cb) override { return this->callBack(V13::descriptor, kPerform_1_3, cb, effect, strength); }
};

template <typename Interface>
class Dax20Proxy : public Vibrator13Proxy<Interface> {
public:
    using Vibrator13Proxy<Interface>::Vibrator13Proxy;
    Return<bool> daxSupportsAmplitudeControl() override { return this->template call<bool>(V20::descriptor, kDaxSupportsAmplitudeControl); }
    Return<bool> daxSupportsForceTouchAmplitudeControl() override { return this->template call<bool>(V20::descriptor, kDaxSupportsForceTouchAmplitudeControl); }
    Return<bool> daxSupportsFrequencyControl() override { return this->template call<bool>(V20::descriptor, kDaxSupportsFrequencyControl); }
    Return<bool> daxSupportsHapticEngine() override { return this->template call<bool>(V20::descriptor, kDaxSupportsHapticEngine); }
    Return<bool> daxSupportsPrebakedHapticPattern() override { return this->template call<bool>(V20::descriptor, kDaxSupportsPrebakedHapticPattern); }
    Return<bool> daxSupportsFolderStatusSetting() override { return this->template call<bool>(V20::descriptor, kDaxSupportsFolderStatusSetting); }
    Return<bool> daxSupportsEnhancedVelmoraHapticPattern() override { return this->template call<bool>(V20::descriptor, kDaxSupportsEnhancedVelmoraHapticPattern); }
    Return<VibratorStatus> daxSetAmplitude(uint32_t amplitude) override { return this->template call<VibratorStatus>(V20::descriptor, kDaxSetAmplitude, amplitude); }
    Return<VibratorStatus> daxSetForceTouchAmplitude(uint32_t amplitude) override { return this->template call<VibratorStatus>(V20::descriptor, kDaxSetForceTouchAmplitude, amplitude); }
    Return<VibratorStatus> daxSetFrequencyType(DaxFrequencyType type) override { return this->template call<VibratorStatus>(V20::descriptor, kDaxSetFrequencyType, type); }
    Return<VibratorStatus> daxSetFolderStatus(DaxFolderStatus status) override { return this->template call<VibratorStatus>(V20::descriptor, kDaxSetFolderStatus, status); }
    Return<void> daxGetNumberOfPrebakedHapticPattern(V20::daxGetNumberOfPrebakedHapticPattern_cb cb) override { return this->callBack(V20::descriptor, kDaxGetNumberOfPrebakedHapticPattern, cb); }
    Return<VibratorStatus> daxPerformHapticEngine(const hidl_vec<DaxHapticEnginePacket>& packets, uint32_t amplitude) override { return this->template call<VibratorStatus>(V20::descriptor, kDaxPerformHapticEngine, packets, amplitude); }
    Return<VibratorStatus> daxPerformPrebakedHapticPattern(uint32_t pattern, uint32_t amplitude, bool repeat) override { return this->template call<VibratorStatus>(V20::descriptor, kDaxPerformPrebakedHapticPattern, pattern, amplitude, repeat); }
};

template <typename Interface>
class Dax21Proxy : public Dax20Proxy<Interface> {
public:
    using Dax20Proxy<Interface>::Dax20Proxy;
    Return<void> daxGetAmplitudeList(DaxAmplitudeType type, V21::daxGetAmplitudeList_cb cb) override { return this->callBack(V21::descriptor, kDaxGetAmplitudeList, cb, type); }
};

// clang-format on

}  // namespace android::hardware::details
