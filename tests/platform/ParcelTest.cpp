// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Packet.h"

#include <gtest/gtest.h>
#include <hwbinder/Parcel.h>

#include <cstdint>
#include <cstring>
#include <memory>

namespace {

using ::android::hardware::Packet;
using ::android::hardware::Parcel;

void keep(const uint8_t* /* bytes */, void* /* packet */) {}

TEST(ParcelTest, WhatIsReadIsWhatWasWritten) {
    Parcel parcel;
    parcel.writeUint8(2);
    parcel.writeString16("text", 4);
    parcel.writeInt64(-5);
    parcel.setDataPosition(0);
    bool flag = false;
    EXPECT_EQ(parcel.readBool(&flag), android::OK);
    EXPECT_TRUE(flag) << "any byte but 0";
    std::string text;
    EXPECT_EQ(parcel.readString16(&text), android::OK);
    EXPECT_EQ(text, "text");
    uint64_t number = 0;
    EXPECT_EQ(parcel.readUint64(&number), android::OK);
    EXPECT_EQ(static_cast<int64_t>(number), -5);
    uint8_t more = 0;
    EXPECT_EQ(parcel.readUint8(&more), android::NOT_ENOUGH_DATA);
}

/** A list as it is received, with objects behind it that nobody asks for. */
class ReceivedListTest : public ::testing::Test {
  protected:
    void receive(const Parcel& sent, Parcel* parcel) {
        ASSERT_EQ(mPacket->pack(1, 0, sent), android::OK);
        Packet::Header header;
        ASSERT_EQ(mPacket->unpack(&header, parcel, keep, nullptr), android::OK);
    }

    const std::unique_ptr<Packet> mPacket{new Packet};
    const uint64_t mList[2] = {0, 4};
    const uint8_t mElements[16] = {1, 2, 3};
};

TEST_F(ReceivedListTest, AddressThatAnotherObjectHasReplacedIsRefused) {
    for (const bool isReplaced : {false, true}) {
        Parcel sent;
        size_t handle = 0;
        sent.writeBuffer(mList, sizeof(mList), &handle);
        sent.writeEmbeddedBuffer(mElements, sizeof(mElements), nullptr, handle, 0);
        if (isReplaced) sent.writeEmbeddedBuffer("short", 6, nullptr, handle, 0);
        Parcel parcel;
        receive(sent, &parcel);
        const void* list = nullptr;
        ASSERT_EQ(parcel.readBuffer(sizeof(mList), &handle, &list), android::OK);
        const void* elements = nullptr;
        EXPECT_EQ(parcel.readEmbeddedBuffer(sizeof(mElements), nullptr, handle, 0, &elements),
                  isReplaced ? android::BAD_VALUE : android::OK);
        if (!isReplaced) {
            EXPECT_EQ(memcmp(elements, mElements, sizeof(mElements)), 0);
        }
    }
}

TEST_F(ReceivedListTest, ObjectIsNotReadAsNumbersNorAsAnotherKind) {
    Parcel sent;
    sent.writeBuffer(mList, sizeof(mList), nullptr);
    Parcel parcel;
    receive(sent, &parcel);
    uint64_t number = 0;
    EXPECT_EQ(parcel.readUint64(&number), android::NOT_ENOUGH_DATA);
    android::sp<android::hardware::IBinder> binder;
    EXPECT_EQ(parcel.readNullableStrongBinder(&binder), android::BAD_TYPE);
    const void* buffer = nullptr;
    EXPECT_EQ(parcel.readBuffer(sizeof(mList) - 1, nullptr, &buffer), android::BAD_VALUE);
}

}  // namespace
