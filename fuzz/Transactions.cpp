// SPDX-License-Identifier: Apache-2.0
#include "Vibrator.h"
#include "libhwbinder/Packet.h"

#include <android/hidl/manager/1.2/BpHwServiceManager.h>
#include <hidl/HidlBinderSupport.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>

using namespace ::android::hardware;
using ::android::status_t;
using ::vendor::velmora::hardware::vibrator::V2_1::implementation::Vibrator;

namespace {

/** The input as a packet from a socket. */
std::unique_ptr<Packet> packetOf(const uint8_t* data, size_t size) {
    auto packet = std::unique_ptr<Packet>(new Packet);
    memcpy(packet->bytes, data, size);
    packet->size = size;
    return packet;
}

/** A remote object that answers every call with the same bytes. */
class Answering : public IBinder {
  public:
    Answering(const uint8_t* data, size_t size) : mData(data), mSize(size) {}
    status_t transact(uint32_t /* code */, const Parcel& /* data */, Parcel* reply,
                      uint32_t /* flags */, TransactCallback /* callback */) override {
        mPacket = packetOf(mData, mSize);
        Packet::Header header;
        return mPacket->unpack(&header, reply);
    }
    status_t linkToDeath(const ::android::sp<DeathRecipient>&) override { return ::android::OK; }
    status_t unlinkToDeath(const ::android::sp<DeathRecipient>&) override { return ::android::OK; }

  private:
    const uint8_t* const mData;
    const size_t mSize;
    std::unique_ptr<Packet> mPacket;
};

/** The input as a request to the service object, which gives an answer that can be sent. */
void request(const uint8_t* data, size_t size) {
    static const ::android::sp<Vibrator> vibrator = new Vibrator;
    static const ::android::sp<IBinder> stub = getOrCreateCachedBinder(vibrator.get());
    const auto packet = packetOf(data, size);
    Packet::Header header;
    Parcel arguments;
    if (packet->unpack(&header, &arguments) != ::android::OK) return;
    const auto answer = std::unique_ptr<Packet>(new Packet);
    bool isSent = false;
    const auto send = [&](Parcel& results) {
        isSent = true;
        if (answer->pack(0, 0, results) != ::android::OK) abort();
    };
    Parcel results;
    const status_t status =
            stub->transact(header.code, arguments, &results, header.flags & TF_ONE_WAY, send);
    if (status == ::android::OK && !isSent) send(results);
}

/** The input as the reply to calls, whose results can be used. */
void reply(const uint8_t* data, size_t size) {
    const ::android::sp<::android::hidl::manager::V1_2::IServiceManager> manager =
            new ::android::hidl::manager::V1_2::BpHwServiceManager(new Answering(data, size));
    size_t used = 0;
    manager->interfaceChain([&](const auto& chain) {
        for (const hidl_string& each : chain)
            used += strlen(each.c_str());
    });
    manager->getHashChain([&](const auto& hashes) {
        for (const auto& each : hashes)
            used += each[31];
    });
    manager->debugDump([&](const auto& infos) {
        for (const auto& each : infos) {
            used += strlen(each.interfaceName.c_str()) + toString(each.clientPids).size();
        }
    });
    manager->ping().description();
    if (used > 64 * Packet::kMaxSize) abort();
}

}  // namespace

/** The first byte says how the others are used. */
extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    [[maybe_unused]] static const int quiet = setenv("ANDROID_LOG_TAGS", "*:S", 1);
    if (size == 0 || size > Packet::kMaxSize) return 0;
    if (data[0] % 2 == 0) {
        request(data + 1, size - 1);
    } else {
        reply(data + 1, size - 1);
    }
    return 0;
}
