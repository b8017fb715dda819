// SPDX-License-Identifier: Apache-2.0

// A client as it is written for a device: only what is published, and nothing of this platform's
// own. It runs where there is no service.

#include <android/hidl/manager/1.0/IServiceNotification.h>
#include <hidl/HidlTransportSupport.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <string>

using ::android::sp;
using ::android::wp;
using ::android::hardware::hidl_death_recipient;
using ::android::hardware::hidl_enum_range;
using ::android::hardware::hidl_string;
using ::android::hardware::hidl_vec;
using ::android::hardware::Return;
using ::android::hardware::Void;
using ::android::hardware::vibrator::V1_0::IVibrator;
using ::android::hardware::vibrator::V1_0::Status;
using ::android::hardware::vibrator::V1_3::Effect;
using ::android::hidl::base::V1_0::IBase;
using ::android::hidl::manager::V1_0::IServiceNotification;
using ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;
using ::vendor::velmora::hardware::vibrator::V2_1::DaxAmplitudeType;
using ::vendor::velmora::hardware::vibrator::V2_1::IDaxVibrator;

#undef NDEBUG
#include <cassert>
namespace {

struct Recipient : hidl_death_recipient {
    void serviceDied(uint64_t /* cookie */, const wp<IBase>& /* who */) override {}
};

struct Notification : IServiceNotification {
    Return<void> onRegistration(const hidl_string& /* interface */, const hidl_string& /* name */,
                                bool /* preexisting */) override {
        return Void();
    }
};

/** What the generated headers offer for types. */
void useTypes() {
    assert(toString(Status::BAD_VALUE) == "BAD_VALUE");
    assert(toString(static_cast<Effect>(0x9abcdef)) == "0x9abcdef");
    int effects = 0;
    for (const Effect effect : hidl_enum_range<Effect>())
        effects += static_cast<int>(effect);
    assert(effects == 21 * 22 / 2);
    const DaxHapticEnginePacket packet{1, 2, 3, 4};
    assert(toString(packet) == "{.param0 = 1, .intensity = 2, .param2 = 3, .param3 = 4}");
    assert(toString(hidl_vec<hidl_string>{"a", ""}) == "[2]{\"a\", \"\"}");
    assert(packet == packet && !(packet != packet));
    hidl_vec<DaxHapticEnginePacket> packets = {packet};
    packets.resize(2);
    assert(packets[0] == packet && packets[1] == DaxHapticEnginePacket{} && packets.size() == 2 &&
           packets != hidl_vec{packet});
    assert(hidl_string(static_cast<const char*>(nullptr)) < hidl_string("ab", 1));
}

/** What a client does with a service, whether it is there or not. */
void use(const sp<IVibrator>& vibrator) {
    if (!vibrator || !vibrator->on(10).isOk()) return;
    const sp<IDaxVibrator> extended = IDaxVibrator::castFrom(vibrator);
    if (!extended) return;
    extended->linkToDeath(new Recipient, 0);
    extended->daxGetAmplitudeList(DaxAmplitudeType::TYPE_0,
                                  [](bool /* supported */, const hidl_vec<uint32_t>& list) {
                                      for (const uint32_t each : list)
                                          assert(each <= 10000);
                                  });
}

}  // namespace

int main() {
    ::android::hardware::configureRpcThreadpool(1, false);
    useTypes();
    use(IVibrator::tryGetService());
    use(IDaxVibrator::tryGetService("default"));
    assert(IDaxVibrator::registerForNotifications("default", new Notification));
    const sp<IServiceNotification> local = new Notification;
    assert(IDaxVibrator::castFrom(sp<IBase>(local)).withDefault(nullptr) == nullptr);
    assert(IDaxVibrator::castFrom(sp<IBase>()).withDefault(nullptr) == nullptr);
    assert(IServiceNotification::castFrom(sp<IBase>(local)).withDefault(nullptr) == local);
    return 0;
}
