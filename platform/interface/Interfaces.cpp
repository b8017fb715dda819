// SPDX-License-Identifier: Apache-2.0
#include "interface/Stubs.h"

#include "interface/Proxies.h"
#include "transport/Connection.h"
#include "transport/TransactionCodes.h"

#include <cstddef>
#include <cstdint>
#include <string>

namespace android::hardware::details {
namespace {

/** The receiving side of each interface: one line for each operation. */
constexpr Operation kBaseOperations[] = {
        {kInterfaceChain, handle<&IBase::interfaceChain>},
        {kDebug, handle<&IBase::debug>},
        {kInterfaceDescriptor, handle<&IBase::interfaceDescriptor>},
        {kGetHashChain, handle<&IBase::getHashChain>},
        {kSetHALInstrumentation, handle<&IBase::setHALInstrumentation>},
        {kPing, handle<&IBase::ping>},
        {kGetDebugInfo, handle<&IBase::getDebugInfo>},
        {kNotifySyspropsChanged, handle<&IBase::notifySyspropsChanged>},
};
constexpr Operation kVibrator10Operations[] = {
        {kOn, handle<&V10::on>},
        {kOff, handle<&V10::off>},
        {kSupportsAmplitudeControl, handle<&V10::supportsAmplitudeControl>},
        {kSetAmplitude, handle<&V10::setAmplitude>},
        {kPerform, handle<&V10::perform>},
};
constexpr Operation kVibrator11Operations[] = {
        {kPerform_1_1, handle<&V11::perform_1_1>},
};
constexpr Operation kVibrator12Operations[] = {
        {kPerform_1_2, handle<&V12::perform_1_2>},
};
constexpr Operation kVibrator13Operations[] = {
        {kSupportsExternalControl, handle<&V13::supportsExternalControl>},
        {kSetExternalControl, handle<&V13::setExternalControl>},
        {kPerform_1_3, handle<&V13::perform_1_3>},
};
constexpr Operation kDax20Operations[] = {
        {kDaxSupportsAmplitudeControl, handle<&V20::daxSupportsAmplitudeControl>},
        {kDaxSupportsForceTouchAmplitudeControl,
         handle<&V20::daxSupportsForceTouchAmplitudeControl>},
        {kDaxSupportsFrequencyControl, handle<&V20::daxSupportsFrequencyControl>},
        {kDaxSupportsHapticEngine, handle<&V20::daxSupportsHapticEngine>},
        {kDaxSupportsPrebakedHapticPattern, handle<&V20::daxSupportsPrebakedHapticPattern>},
        {kDaxSupportsFolderStatusSetting, handle<&V20::daxSupportsFolderStatusSetting>},
        {kDaxSupportsEnhancedVelmoraHapticPattern,
         handle<&V20::daxSupportsEnhancedVelmoraHapticPattern>},
        {kDaxSetAmplitude, handle<&V20::daxSetAmplitude>},
        {kDaxSetForceTouchAmplitude, handle<&V20::daxSetForceTouchAmplitude>},
        {kDaxSetFrequencyType, handle<&V20::daxSetFrequencyType>},
        {kDaxSetFolderStatus, handle<&V20::daxSetFolderStatus>},
        {kDaxGetNumberOfPrebakedHapticPattern, handle<&V20::daxGetNumberOfPrebakedHapticPattern>},
        {kDaxPerformHapticEngine, handle<&V20::daxPerformHapticEngine>},
        {kDaxPerformPrebakedHapticPattern, handle<&V20::daxPerformPrebakedHapticPattern>},
};
constexpr Operation kDax21Operations[] = {
        {kDaxGetAmplitudeList, handle<&V21::daxGetAmplitudeList>},
};

template <size_t N>
constexpr Stub makeStub(const char* descriptor, const Operation (&operations)[N],
                        const Stub* parent) {
    return {descriptor, operations, N, parent};
}

constexpr Stub kBaseStub = makeStub("android.hidl.base@1.0::IBase", kBaseOperations, nullptr);
constexpr Stub kVibrator10Stub =
        makeStub("android.hardware.vibrator@1.0::IVibrator", kVibrator10Operations, &kBaseStub);
constexpr Stub kVibrator11Stub = makeStub("android.hardware.vibrator@1.1::IVibrator",
                                          kVibrator11Operations, &kVibrator10Stub);
constexpr Stub kVibrator12Stub = makeStub("android.hardware.vibrator@1.2::IVibrator",
                                          kVibrator12Operations, &kVibrator11Stub);
constexpr Stub kVibrator13Stub = makeStub("android.hardware.vibrator@1.3::IVibrator",
                                          kVibrator13Operations, &kVibrator12Stub);
constexpr Stub kDax20Stub = makeStub("vendor.velmora.hardware.vibrator@2.0::IDaxVibrator",
                                     kDax20Operations, &kVibrator13Stub);
}  // namespace

constexpr Stub kDax21Stub = makeStub("vendor.velmora.hardware.vibrator@2.1::IDaxVibrator",
                                     kDax21Operations, &kDax20Stub);

namespace {

Return<void> chainOf(const Stub& stub, const IBase::interfaceChain_cb& callback) {
    std::vector<hidl_string> descriptors;
    for (const Stub* each = &stub; each != nullptr; each = each->parent) {
        descriptors.emplace_back(each->descriptor);
    }
    callback(descriptors);
    return Void();
}

template <typename Interface, typename InterfaceProxy>
Return<sp<Interface>> castInterface(const sp<IBase>& parent) {
    if (parent == nullptr) return sp<Interface>();
    bool implements = false;
    const Return<void> asked = parent->interfaceChain([&](const auto& chain) {
        for (const hidl_string& descriptor : chain) {
            implements = implements || descriptor == Interface::descriptor;
        }
    });
    if (!asked.isOk()) return Status::fromStatusT(DEAD_OBJECT, asked.description());
    if (!implements) return sp<Interface>();
    if (!parent->isRemote()) return sp<Interface>(static_cast<Interface*>(parent.get()));
    auto* proxy = dynamic_cast<Proxy*>(parent.get());
    return sp<Interface>(new InterfaceProxy(proxy->connection()));
}

}  // namespace
}  // namespace android::hardware::details

namespace android::hidl::base::V1_0 {

using ::android::hardware::hidl_array;
using ::android::hardware::hidl_vec;
using ::android::hardware::Return;
using ::android::hardware::Void;

const char* IBase::descriptor = ::android::hardware::details::kBaseStub.descriptor;

Return<void> IBase::interfaceChain(interfaceChain_cb _hidl_cb) {
    return ::android::hardware::details::chainOf(::android::hardware::details::kBaseStub, _hidl_cb);
}

Return<void> IBase::debug(const ::android::hardware::hidl_handle& /* fd */,
                          const hidl_vec<::android::hardware::hidl_string>& /* options */) {
    return Void();
}

Return<void> IBase::interfaceDescriptor(interfaceDescriptor_cb _hidl_cb) {
    return interfaceChain([&](const auto& chain) { _hidl_cb(chain[0]); });
}

Return<void> IBase::getHashChain(getHashChain_cb _hidl_cb) {
    return interfaceChain([&](const auto& chain) {
        hidl_vec<hidl_array<uint8_t, 32>> hashes;
        hashes.resize(chain.size());
        _hidl_cb(hashes);
    });
}

Return<void> IBase::setHALInstrumentation() {
    return Void();
}

Return<bool> IBase::linkToDeath(
        const ::android::sp<::android::hardware::hidl_death_recipient>& recipient,
        uint64_t /* cookie */) {
    return recipient != nullptr;
}

Return<void> IBase::ping() {
    return Void();
}

Return<void> IBase::getDebugInfo(getDebugInfo_cb _hidl_cb) {
    constexpr auto kArchitecture = sizeof(void*) == 8 ? DebugInfo::Architecture::IS_64BIT
                                                      : DebugInfo::Architecture::IS_32BIT;
    _hidl_cb({-1, 0, kArchitecture});
    return Void();
}

Return<void> IBase::notifySyspropsChanged() {
    return Void();
}

Return<bool> IBase::unlinkToDeath(
        const ::android::sp<::android::hardware::hidl_death_recipient>& recipient) {
    return recipient != nullptr;
}

}  // namespace android::hidl::base::V1_0

// NOLINTBEGIN(bugprone-macro-parentheses): the arguments are names

/** What an interface class has beside its operations, the same for all but for the names. */
#define DEFINE_INTERFACE(Namespace, Interface, InterfaceProxy, stub)                          \
    namespace Namespace {                                                                     \
    namespace details = ::android::hardware::details;                                         \
    const char* Interface::descriptor = details::stub.descriptor;                             \
    ::android::hardware::Return<void> Interface::interfaceChain(interfaceChain_cb _hidl_cb) { \
        return details::chainOf(details::stub, _hidl_cb);                                     \
    }                                                                                         \
    ::android::hardware::Return<::android::sp<Interface>> Interface::castFrom(                \
            const ::android::sp<::android::hidl::base::V1_0::IBase>& parent) {                \
        return details::castInterface<Interface, details::InterfaceProxy<Interface>>(parent); \
    }                                                                                         \
    ::android::sp<Interface> Interface::getService(const std::string& serviceName) {          \
        return new details::InterfaceProxy<Interface>(                                        \
                details::Connection::open(descriptor, serviceName));                          \
    }                                                                                         \
    ::android::status_t Interface::registerAsService(const std::string& serviceName) {        \
        return details::registerService(this, details::stub, serviceName);                    \
    }                                                                                         \
    }

DEFINE_INTERFACE(android::hardware::vibrator::V1_0, IVibrator, Vibrator10Proxy, kVibrator10Stub)
DEFINE_INTERFACE(android::hardware::vibrator::V1_1, IVibrator, Vibrator11Proxy, kVibrator11Stub)
DEFINE_INTERFACE(android::hardware::vibrator::V1_2, IVibrator, Vibrator12Proxy, kVibrator12Stub)
DEFINE_INTERFACE(android::hardware::vibrator::V1_3, IVibrator, Vibrator13Proxy, kVibrator13Stub)
DEFINE_INTERFACE(vendor::velmora::hardware::vibrator::V2_0, IDaxVibrator, Dax20Proxy, kDax20Stub)
DEFINE_INTERFACE(vendor::velmora::hardware::vibrator::V2_1, IDaxVibrator, Dax21Proxy, kDax21Stub)

// NOLINTEND(bugprone-macro-parentheses)
