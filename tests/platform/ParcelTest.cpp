// SPDX-License-Identifier: Apache-2.0
#include "hwservicemanager/ServiceManager.h"
#include "libhwbinder/Packet.h"

#include <gtest/gtest.h>
#include <hidl/HidlBinderSupport.h>
#include <hwbinder/ProcessState.h>
#include <vendor/velmora/hardware/vibrator/2.1/IDaxVibrator.h>

#include <cstdint>
#include <string>

namespace {

using ::android::sp;
using ::android::hardware::getOrCreateCachedBinder;
using ::android::hardware::hidl_string;
using ::android::hardware::hidl_vec;
using ::android::hardware::IBinder;
using ::android::hardware::Parcel;
using ::android::hardware::ProcessState;
using ::android::hardware::Status;

TEST(ParcelTest, WhatIsReadIsWhatWasWritten) {
    Parcel parcel;
    parcel.writeUint8(2);
    parcel.writeString16("t\x80xt", 4);
    parcel.writeUint64(5);
    writeToParcel(Status::fromExceptionCode(Status::EX_NULL_POINTER, "why"), &parcel);
    parcel.setDataPosition(0);
    bool flag = false;
    EXPECT_EQ(parcel.readBool(&flag), android::OK);
    EXPECT_TRUE(flag) << "any byte but 0";
    std::string text = "older";
    EXPECT_EQ(parcel.readString16(&text), android::OK);
    EXPECT_EQ(text, "t?xt");
    uint64_t number = 0;
    EXPECT_EQ(parcel.readUint64(&number), android::OK);
    EXPECT_EQ(number, 5U);
    Status status;
    EXPECT_EQ(readFromParcel(&status, parcel), android::OK);
    EXPECT_EQ(status.description(), "why");
    uint8_t more = 0;
    EXPECT_EQ(parcel.readUint8(&more), android::NOT_ENOUGH_DATA);
    android::sp<android::hardware::IBinder> object;
    EXPECT_EQ(parcel.readNullableStrongBinder(&object), android::NOT_ENOUGH_DATA);
    parcel.writeInt32(-1);
    EXPECT_EQ(parcel.readString16(&text), android::BAD_VALUE);
    parcel.writeInt32(Status::EX_ILLEGAL_ARGUMENT);
    EXPECT_EQ(readFromParcel(&status, parcel), android::NOT_ENOUGH_DATA) << "its text is missing";
}

TEST(ParcelTest, ObjectsAreReadAsWhatTheyAre) {
    const sp<IBinder> objects[] = {getOrCreateCachedBinder(new android::hardware::ServiceManager),
                                   ProcessState::self()->getStrongProxyForHandle(4'000'000'002),
                                   nullptr};
    Parcel parcel;
    // So many that the parcel grows more than once.
    for (size_t i = 0; i < 60; ++i)
        parcel.writeStrongBinder(objects[i % 3]);
    EXPECT_EQ(parcel.offsetCount(), 40U) << "none for no object";
    const native_handle_t descriptors{};
    EXPECT_EQ(parcel.writeNativeHandleNoDup(&descriptors), android::INVALID_OPERATION);
    const std::string text(20'000, 'x');
    size_t parent = 0;
    parcel.writeBuffer(text.data(), 24, &parent);
    parcel.writeEmbeddedBuffer(text.data(), 8, nullptr, parent, 0);
    parcel.writeString16(text.data(), text.size());
    parcel.setDataPosition(0);
    for (size_t i = 0; i < 60; ++i) {
        sp<IBinder> object = objects[0];
        EXPECT_EQ(parcel.readNullableStrongBinder(&object), android::OK);
        EXPECT_EQ(object, objects[i % 3]);
    }
    const void* buffer = nullptr;
    EXPECT_EQ(parcel.readBuffer(24, nullptr, &buffer), android::OK);
    EXPECT_EQ(parcel.readBuffer(8, nullptr, &buffer), android::BAD_VALUE) << "it has a parent";
    std::string read;
    EXPECT_EQ(parcel.readString16(&read), android::OK);
    EXPECT_EQ(read, text);
}

TEST(ParcelTest, ListWithoutElementsIsWrittenAsOnADevice) {
    // One that has been emptied has an address all the same.
    for (const size_t listed : {size_t{0}, size_t{1}}) {
        const hidl_vec<int32_t> list = listed == 0 ? hidl_vec<int32_t>() : hidl_vec<int32_t>(0);
        Parcel parcel;
        size_t parent = 0;
        size_t child = 0;
        parcel.writeBuffer(&list, sizeof(list), &parent);
        EXPECT_EQ(writeEmbeddedToParcel(list, &parcel, parent, 0, &child), android::OK);
        EXPECT_EQ(parcel.dataSize(), 2 * sizeof(binder_buffer_object));
        EXPECT_EQ(parcel.offsetCount(), 1 + listed);
        parcel.setDataPosition(0);
        const void* read = nullptr;
        EXPECT_EQ(parcel.readBuffer(sizeof(list), &parent, &read), android::OK);
        EXPECT_EQ(readEmbeddedFromParcel(list, parcel, parent, 0, &child), android::OK);
        uint32_t more = 0;
        EXPECT_EQ(parcel.readUint32(&more), android::NOT_ENOUGH_DATA);
    }
}

TEST(ParcelTest, WhatWasReceivedIsGivenBackAndNotWrittenTo) {
    const uint8_t data[4] = {};
    int givenBack = 0;
    {
        Parcel parcel;
        for (int i = 0; i < 2; ++i) {
            const auto count = [](const uint8_t*, void* owner) { ++*static_cast<int*>(owner); };
            parcel.ipcSetDataReference(data, sizeof(data), nullptr, 0, count, &givenBack);
            uint32_t number = 0;
            EXPECT_EQ(parcel.readUint32(&number), android::OK) << "from the beginning";
            EXPECT_EQ(parcel.writeUint32(1), android::NO_MEMORY);
        }
        parcel.clear();
        for (uint32_t i = 0; i < 100; ++i)
            EXPECT_EQ(parcel.writeUint32(i), android::OK);
    }
    EXPECT_EQ(givenBack, 2);
}

TEST(TypesTest, OfferWhatADevicesDo) {
    using ::android::hardware::vibrator::V1_3::Effect;
    using ::vendor::velmora::hardware::vibrator::V2_0::DaxHapticEnginePacket;
    EXPECT_EQ(toString(static_cast<Effect>(0x9abcdef)), "0x9abcdef");
    int effects = 0;
    for (const Effect effect : ::android::hardware::hidl_enum_range<Effect>())
        effects += static_cast<int>(effect);
    EXPECT_EQ(effects, 21 * 22 / 2);
    const DaxHapticEnginePacket packet{1, 2, 3, 4};
    EXPECT_EQ(toString(packet), "{.param0 = 1, .intensity = 2, .param2 = 3, .param3 = 4}");
    EXPECT_EQ(toString(hidl_vec<hidl_string>{"a", ""}), "[2]{\"a\", \"\"}");
    hidl_vec<DaxHapticEnginePacket> packets = {packet};
    packets.resize(2);
    EXPECT_EQ(packets, (hidl_vec<DaxHapticEnginePacket>{packet, {}}));
    EXPECT_NE(packets, hidl_vec<DaxHapticEnginePacket>{packet});
    EXPECT_LT(hidl_string(static_cast<const char*>(nullptr)), hidl_string("ab", 1));
}

TEST(PacketTest, EmbeddedBufferMustLieInOneBeforeIt) {
    const struct {
        size_t parent;
        size_t offset;
        android::status_t status;
    } cases[] = {
            {0, 0, android::OK},
            {0, 16, android::OK},
            {0, 17, android::FAILED_TRANSACTION},
            {0, 25, android::FAILED_TRANSACTION},
            {1, 0, android::FAILED_TRANSACTION},
    };
    const char bytes[24] = {};
    for (const auto& [parent, offset, status] : cases) {
        Parcel parcel;
        size_t first = 0;
        parcel.writeBuffer(bytes, sizeof(bytes), &first);
        parcel.writeEmbeddedBuffer(bytes, sizeof(bytes), nullptr, first + parent, offset);
        android::hardware::Packet packet;
        EXPECT_EQ(packet.pack(1, 0, parcel), status) << parent << ' ' << offset;
    }
}

}  // namespace
