// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cutils/native_handle.h>
#include <hwbinder/Binder.h>
#include <hwbinder/InlineArray.h>
#include <linux/android/binder.h>
#include <utils/Errors.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <vector>

namespace android::hardware {

/**
 * The content of a call or a reply: values one after the other, and among them objects that refer
 * to buffers elsewhere in memory, or to other objects of any process. The driver knows from the
 * list of offsets where the objects lie.
 *
 * A written parcel refers to its buffers until it has been sent. A received one refers to memory of
 * the driver, which it gives back in the end. Reading past the end, or an object of another kind
 * than the next one, is an error and changes nothing outside the parcel.
 */
class Parcel {
  public:
    /** Gives memory back to the driver. */
    using ReleaseBuffer = void (*)(const uint8_t* data, void* owner);

    Parcel() = default;
    ~Parcel() { giveBack(); }
    Parcel(const Parcel&) = delete;
    Parcel& operator=(const Parcel&) = delete;

    // Writing. Fails with NO_MEMORY if there is no memory left.

    /** Begins a request: names the interface that declares the operation. */
    status_t writeInterfaceToken(const char* interface);
    status_t writeBool(bool value) { return writePadded(uint8_t{value}); }
    status_t writeUint8(uint8_t value) { return writePadded(value); }
    status_t writeInt32(int32_t value) { return writePadded(value); }
    status_t writeUint32(uint32_t value) { return writePadded(value); }
    status_t writeUint64(uint64_t value) { return writePadded(value); }
    /** Writes text as UTF-16; only for ASCII. */
    status_t writeString16(const char* text, size_t length);
    /** Refers to a buffer. @param handle its number, for buffers embedded in it; may be nullptr. */
    status_t writeBuffer(const void* buffer, size_t length, size_t* handle);
    /**
     * Refers to a buffer whose address is in another one, its parent.
     *
     * @param buffer nullptr for that of an empty list.
     */
    status_t writeEmbeddedBuffer(const void* buffer, size_t length, size_t* handle,
                                 size_t parentHandle, size_t parentOffset);
    /** @param binder nullptr for no object. */
    status_t writeStrongBinder(const sp<IBinder>& binder);
    /** @return INVALID_OPERATION for any handle but nullptr: no descriptors travel. */
    status_t writeNativeHandleNoDup(const native_handle_t* handle);

    // Reading. Fails with NOT_ENOUGH_DATA past the end, with BAD_TYPE for another type.

    /** @return whether the request names this interface. */
    bool enforceInterface(const char* interface) const;
    status_t readBool(bool* value) const;
    status_t readUint8(uint8_t* value) const { return readPadded(value); }
    status_t readInt32(int32_t* value) const { return readPadded(value); }
    status_t readUint32(uint32_t* value) const { return readPadded(value); }
    status_t readUint64(uint64_t* value) const { return readPadded(value); }
    /** Reads text; what is not ASCII becomes "?". */
    status_t readString16(std::string* text) const;
    /** @param length the size that the buffer must have. */
    status_t readBuffer(size_t length, size_t* handle, const void** buffer) const;
    /**
     * @param handle takes the number of the buffer; nullptr if no addresses belong into it. Then
     *     one that has a buffer embedded in it is refused.
     */
    status_t readEmbeddedBuffer(size_t length, size_t* handle, size_t parentHandle,
                                size_t parentOffset, const void** buffer) const;
    /** @param binder nullptr if no object was sent. */
    status_t readNullableStrongBinder(sp<IBinder>* binder) const;
    /** @return INVALID_OPERATION for any handle but none: no descriptors travel. */
    status_t readNullableNativeHandleNoDup(const native_handle_t** handle) const;

    // For the drivers.

    const uint8_t* data() const { return mData.data(); }
    size_t dataSize() const { return mData.size(); }
    const binder_size_t* offsets() const { return mOffsets.data(); }
    size_t offsetCount() const { return mOffsets.size(); }
    /** @return the room that its buffers need, each rounded up to 8, in bytes. */
    size_t buffersSize() const;
    void setDataPosition(size_t position) const { mPosition = position; }
    /**
     * Refers to data that the driver has received.
     *
     * @param release gets the data when the parcel no longer needs it; nullptr if nobody waits for
     *     it back.
     */
    void ipcSetDataReference(const uint8_t* data, size_t size, const binder_size_t* offsets,
                             size_t offsetCount, ReleaseBuffer release, void* owner) {
        clear();
        mData.refer(data, size);
        mOffsets.refer(offsets, offsetCount);
        mRelease = release;
        mOwner = owner;
    }
    /** Empties the parcel. */
    void clear() {
        giveBack();
        mRelease = nullptr;
        mData.clear();
        mOffsets.clear();
        mBinders.clear();
        mPosition = 0;
        mNextObject = 0;
    }

  private:
    /** Values begin at multiples of 4; objects, too. */
    static constexpr size_t padded(size_t size) { return (size + 3) & ~size_t{3}; }

    /** Gives what the driver has received back to it. */
    void giveBack() {
        if (mRelease != nullptr) mRelease(mData.data(), mOwner);
    }
    template <typename T>
    status_t writePadded(T value) {
        return write(&value, sizeof(value));
    }
    template <typename T>
    status_t readPadded(T* value) const {
        const uint8_t* place = read(sizeof(*value));
        if (place == nullptr) return NOT_ENOUGH_DATA;
        memcpy(value, place, sizeof(*value));
        return OK;
    }
    status_t write(const void* bytes, size_t size) {
        uint8_t* place = grow(size);
        if (place == nullptr) return NO_MEMORY;
        memcpy(place, bytes, size);
        return OK;
    }
    /** @return room for a value at the end; nullptr without memory, and in what was received. */
    uint8_t* grow(size_t size) {
        const size_t needed = padded(size);
        if (needed < size) return nullptr;
        uint8_t* place = mData.grow(needed);
        // The padding of the last 4 bytes is zero.
        if (place != nullptr && size > 0) memset(place + needed - 4, 0, 4);
        return place;
    }
    status_t writeObject(const void* object, size_t size);
    status_t writePointer(const binder_buffer_object& object, size_t* handle);
    /** @return whether the driver knows of an object that is read next. */
    bool isObjectNext() const {
        return mNextObject < mOffsets.size() && mOffsets[mNextObject] == mPosition;
    }
    /** @return where the next value lies, and goes past it; nullptr past the end. */
    const uint8_t* read(size_t size) const {
        if (mPosition > dataSize() || size > dataSize() - mPosition) return nullptr;
        // The bytes of an object, which the driver has filled in, are never read as plain values.
        if (mNextObject < offsetCount() && mPosition + size > mOffsets[mNextObject]) return nullptr;
        const uint8_t* place = data() + mPosition;
        mPosition = std::min(dataSize(), mPosition + padded(size));
        return place;
    }
    /** Reads an object of a kind that the driver has checked. @param index its number. */
    status_t readObject(uint32_t type, void* object, size_t size, size_t* index) const;
    status_t readPointer(size_t length, size_t* index, binder_buffer_object* object) const;
    /** Reads the embedded buffer of an empty list that the driver does not know of. */
    status_t readNullPointer(size_t parentHandle, size_t parentOffset) const;
    /** @param object takes a known object, if that is a buffer. @return whether it is. */
    bool isPointer(size_t index, binder_buffer_object* object) const;
    /** @return whether another buffer's address is written into this one. */
    bool isParent(size_t index) const;

    // Most calls fit into the parcel itself.
    InlineArray<uint8_t, 256> mData;
    /** Where the objects lie in the data, for the driver. */
    InlineArray<binder_size_t, 8> mOffsets;
    mutable size_t mPosition = 0;
    /** Index of the next offset to read. */
    mutable size_t mNextObject = 0;
    ReleaseBuffer mRelease = nullptr;
    void* mOwner = nullptr;
    /** Keeps what was written alive until the driver has taken it over. */
    std::vector<sp<IBinder>> mBinders;
};

}  // namespace android::hardware
