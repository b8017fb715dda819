// SPDX-License-Identifier: Apache-2.0
#include <hwbinder/Binder.h>
#include <hwbinder/BpHwBinder.h>
#include <hwbinder/Parcel.h>
#include <hwbinder/ProcessState.h>

#include <cstring>
#include <string>

namespace android::hardware {
status_t Parcel::writeInterfaceToken(const char* interface) {
    return write(interface, strlen(interface) + 1);
}

status_t Parcel::writeString16(const char* text, size_t length) {
    const status_t status = writeInt32(static_cast<int32_t>(length));
    if (status != OK) return status;
    uint8_t* place = grow(2 * (length + 1));
    if (place == nullptr) return NO_MEMORY;
    for (size_t i = 0; i <= length; ++i) {
        const char16_t character = i < length ? static_cast<unsigned char>(text[i]) : 0;
        memcpy(place + 2 * i, &character, sizeof(character));
    }
    return OK;
}

status_t Parcel::writeObject(const void* object, size_t size) {
    const size_t offset = mData.size();
    const status_t status = write(object, size);
    if (status != OK) return status;
    binder_size_t* place = mOffsets.grow(1);
    if (place == nullptr) return NO_MEMORY;
    *place = offset;
    return OK;
}

status_t Parcel::writePointer(const binder_buffer_object& object, size_t* handle) {
    if (handle != nullptr) *handle = mOffsets.size();
    return writeObject(&object, sizeof(object));
}

status_t Parcel::writeBuffer(const void* buffer, size_t length, size_t* handle) {
    binder_buffer_object object{};
    object.hdr.type = BINDER_TYPE_PTR;
    object.buffer = reinterpret_cast<binder_uintptr_t>(buffer);
    object.length = length;
    return writePointer(object, handle);
}

status_t Parcel::writeEmbeddedBuffer(const void* buffer, size_t length, size_t* handle,
                                     size_t parentHandle, size_t parentOffset) {
    binder_buffer_object object{};
    object.hdr.type = BINDER_TYPE_PTR;
    object.flags = BINDER_BUFFER_FLAG_HAS_PARENT;
    object.buffer = reinterpret_cast<binder_uintptr_t>(buffer);
    object.length = length;
    object.parent = parentHandle;
    object.parent_offset = parentOffset;
    // Not in the list of offsets, as on a device: the driver would fill in an address.
    if (buffer == nullptr) return write(&object, sizeof(object));
    return writePointer(object, handle);
}

status_t Parcel::writeStrongBinder(const sp<IBinder>& binder) {
    flat_binder_object object{};
    object.hdr.type = BINDER_TYPE_BINDER;
    // Not in the list of offsets: the driver would make an object of it.
    if (binder == nullptr) return write(&object, sizeof(object));
    if (BpHwBinder* remote = binder->remoteBinder()) {
        object.hdr.type = BINDER_TYPE_HANDLE;
        object.handle = remote->handle();
    } else {
        BHwBinder* local = binder->localBinder();
        // No FLAT_BINDER_FLAG_ACCEPTS_FDS: no operation takes descriptors, and to close one that a
        // hostile caller has chosen may take seconds.
        object.flags = static_cast<uint32_t>(local->getMinSchedulingPriority()) &
                       FLAT_BINDER_FLAG_PRIORITY_MASK;
        object.binder = reinterpret_cast<binder_uintptr_t>(local->getWeakRefs());
        object.cookie = reinterpret_cast<binder_uintptr_t>(local);
    }
    mBinders.push_back(binder);
    return writeObject(&object, sizeof(object));
}

status_t Parcel::writeNativeHandleNoDup(const native_handle_t* handle) {
    return handle == nullptr ? writeUint64(0) : INVALID_OPERATION;
}

status_t Parcel::readBool(bool* value) const {
    uint8_t byte = 0;
    const status_t status = readPadded(&byte);
    // Any byte but 0 and 1 would be undefined as a bool.
    if (status == OK) *value = byte != 0;
    return status;
}

bool Parcel::enforceInterface(const char* interface) const {
    const size_t size = strlen(interface) + 1;
    const uint8_t* place = read(size);
    return place != nullptr && memcmp(place, interface, size) == 0;
}

status_t Parcel::readString16(std::string* text) const {
    int32_t length = 0;
    const status_t status = readInt32(&length);
    if (status != OK) return status;
    if (length < 0) return BAD_VALUE;
    const auto count = static_cast<size_t>(length);
    const uint8_t* place = read(2 * (count + 1));
    if (place == nullptr) return NOT_ENOUGH_DATA;
    text->clear();
    for (size_t i = 0; i < count; ++i) {
        char16_t character = 0;
        memcpy(&character, place + 2 * i, sizeof(character));
        *text += character < 0x80 ? static_cast<char>(character) : '?';
    }
    return OK;
}

status_t Parcel::readObject(uint32_t type, void* object, size_t size, size_t* index) const {
    if (mPosition > dataSize() || size > dataSize() - mPosition) return NOT_ENOUGH_DATA;
    if (!isObjectNext()) return BAD_TYPE;
    binder_object_header header;
    memcpy(&header, data() + mPosition, sizeof(header));
    if (header.type != type) return BAD_TYPE;
    memcpy(object, data() + mPosition, size);
    mPosition += size;
    *index = mNextObject++;
    return OK;
}

bool Parcel::isPointer(size_t index, binder_buffer_object* object) const {
    if (index >= offsetCount()) return false;
    const uint8_t* place = data() + mOffsets[index];
    memcpy(&object->hdr, place, sizeof(object->hdr));
    if (object->hdr.type != BINDER_TYPE_PTR) return false;
    memcpy(object, place, sizeof(*object));
    return true;
}

bool Parcel::isParent(size_t index) const {
    // Both drivers refuse a child when another buffer, that is no child, has come before.
    for (size_t i = index + 1; i < offsetCount(); ++i) {
        binder_buffer_object next;
        if (!isPointer(i, &next)) continue;
        return (next.flags & BINDER_BUFFER_FLAG_HAS_PARENT) != 0 && next.parent == index;
    }
    return false;
}

status_t Parcel::readPointer(size_t length, size_t* index, binder_buffer_object* object) const {
    const status_t status = readObject(BINDER_TYPE_PTR, object, sizeof(*object), index);
    if (status != OK) return status;
    return object->length == length ? OK : BAD_VALUE;
}

status_t Parcel::readBuffer(size_t length, size_t* handle, const void** buffer) const {
    binder_buffer_object object;
    size_t index = 0;
    const status_t status = readPointer(length, &index, &object);
    if (status != OK) return status;
    if ((object.flags & BINDER_BUFFER_FLAG_HAS_PARENT) != 0) return BAD_VALUE;
    if (handle != nullptr) *handle = index;
    *buffer = reinterpret_cast<const void*>(object.buffer);
    return OK;
}

status_t Parcel::readNullPointer(size_t parentHandle, size_t parentOffset) const {
    binder_buffer_object object;
    const status_t status = readPadded(&object);
    if (status != OK) return status;
    if (object.hdr.type != BINDER_TYPE_PTR) return BAD_TYPE;
    // The address in the parent is the sender's, since the driver has not filled it in.
    binder_buffer_object parent;
    if (!isPointer(parentHandle, &parent)) return BAD_VALUE;
    binder_uintptr_t address = 0;
    memcpy(&address, reinterpret_cast<const uint8_t*>(parent.buffer) + parentOffset,
           sizeof(address));
    return object.buffer == 0 && object.length == 0 && address == 0 ? OK : BAD_VALUE;
}

status_t Parcel::readEmbeddedBuffer(size_t length, size_t* handle, size_t parentHandle,
                                    size_t parentOffset, const void** buffer) const {
    if (length == 0 && !isObjectNext()) {
        *buffer = nullptr;
        return readNullPointer(parentHandle, parentOffset);
    }
    binder_buffer_object object;
    size_t index = 0;
    const status_t status = readPointer(length, &index, &object);
    if (status != OK) return status;
    if ((object.flags & BINDER_BUFFER_FLAG_HAS_PARENT) == 0 || object.parent != parentHandle ||
        object.parent_offset != parentOffset) {
        return BAD_VALUE;
    }
    *buffer = reinterpret_cast<const void*>(object.buffer);
    // Where no address belongs, it would be taken for values of the sender.
    if (handle == nullptr) return isParent(index) ? BAD_VALUE : OK;
    *handle = index;
    return OK;
}

status_t Parcel::readNullableStrongBinder(sp<IBinder>* binder) const {
    flat_binder_object object;
    size_t index = 0;
    if (!isObjectNext()) {
        const status_t status = readPadded(&object);
        if (status != OK) return status;
        *binder = nullptr;
        return object.hdr.type == BINDER_TYPE_BINDER && object.binder == 0 ? OK : BAD_TYPE;
    }
    if (readObject(BINDER_TYPE_HANDLE, &object, sizeof(object), &index) == OK) {
        *binder = ProcessState::self()->getStrongProxyForHandle(object.handle);
        return OK;
    }
    const status_t status = readObject(BINDER_TYPE_BINDER, &object, sizeof(object), &index);
    if (status == OK) *binder = reinterpret_cast<BHwBinder*>(object.cookie);
    return status;
}

status_t Parcel::readNullableNativeHandleNoDup(const native_handle_t** handle) const {
    uint64_t size = 0;
    const status_t status = readUint64(&size);
    if (status != OK) return status;
    *handle = nullptr;
    return size == 0 ? OK : INVALID_OPERATION;
}

size_t Parcel::buffersSize() const {
    size_t total = 0;
    for (size_t i = 0; i < offsetCount(); ++i) {
        binder_buffer_object object;
        if (isPointer(i, &object)) total += (object.length + 7) & ~size_t{7};
    }
    return total;
}

}  // namespace android::hardware
