// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <hidl/HidlBinderSupport.h>

#include <cstdint>
#include <string>

namespace {

using ::android::hardware::Parcel;
using ::android::hardware::Status;

TEST(ParcelTest, WhatIsReadIsWhatWasWritten) {
    Parcel parcel;
    parcel.writeUint8(2);
    parcel.writeString16("t\x80xt", 4);
    parcel.writeInt64(-5);
    writeToParcel(Status::fromExceptionCode(Status::EX_NULL_POINTER, "why"), &parcel);
    parcel.setDataPosition(0);
    bool flag = false;
    EXPECT_EQ(parcel.readBool(&flag), android::OK);
    EXPECT_TRUE(flag) << "any byte but 0";
    std::string text;
    EXPECT_EQ(parcel.readString16(&text), android::OK);
    EXPECT_EQ(text, "t?xt");
    uint64_t number = 0;
    EXPECT_EQ(parcel.readUint64(&number), android::OK);
    EXPECT_EQ(static_cast<int64_t>(number), -5);
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

}  // namespace
