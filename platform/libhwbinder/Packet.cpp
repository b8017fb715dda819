// SPDX-License-Identifier: Apache-2.0
#include "Packet.h"

#include <cstring>

namespace android::hardware {
namespace {

constexpr size_t roundUp(size_t size) {
    return (size + 7) & ~size_t{7};
}

/** @return whether the place of an object's address is in its parent's buffer. */
bool isWithin(const binder_buffer_object& parent, const binder_buffer_object& object) {
    return object.parent_offset <= parent.length &&
           sizeof(object.buffer) <= parent.length - object.parent_offset;
}

/** Writes an object's address into its parent's buffer. @return whether the place is in there. */
bool setAddress(const uint8_t* parentObject, const binder_buffer_object& object) {
    binder_buffer_object parent;
    memcpy(&parent, parentObject, sizeof(parent));
    if (!isWithin(parent, object)) return false;
    memcpy(reinterpret_cast<uint8_t*>(parent.buffer) + object.parent_offset, &object.buffer,
           sizeof(object.buffer));
    return true;
}

}  // namespace

bool Packet::append(const void* source, size_t length) {
    if (length > kMaxSize || roundUp(length) > kMaxSize - size) return false;
    if (length == 0) return true;
    size += roundUp(length);
    // The padding of the last 8 bytes is zero.
    memset(bytes + size - 8, 0, 8);
    memcpy(bytes + size - roundUp(length), source, length);
    return true;
}

bool Packet::clearAddress(size_t parentObject, const binder_buffer_object& object) {
    binder_buffer_object parent;
    memcpy(&parent, bytes + sizeof(Header) + parentObject, sizeof(parent));
    if (!isWithin(parent, object)) return false;
    memset(bytes + parent.buffer + object.parent_offset, 0, sizeof(object.buffer));
    return true;
}

status_t Packet::pack(uint32_t code, uint32_t flags, const Parcel& parcel) {
    const size_t offsetsSize = parcel.offsetCount() * sizeof(binder_size_t);
    const Header header{code, flags, static_cast<uint32_t>(parcel.dataSize()),
                        static_cast<uint32_t>(offsetsSize)};
    memcpy(bytes, &header, sizeof(header));
    size = sizeof(header);
    if (!append(parcel.data(), parcel.dataSize())) return FAILED_TRANSACTION;
    return offsetsSize == 0 ? OK : packObjects(parcel);
}

status_t Packet::packObjects(const Parcel& parcel) {
    if (!append(parcel.offsets(), parcel.offsetCount() * sizeof(binder_size_t))) {
        return FAILED_TRANSACTION;
    }
    for (size_t i = 0; i < parcel.offsetCount(); ++i) {
        uint8_t* place = bytes + sizeof(Header) + parcel.offsets()[i];
        binder_buffer_object object;
        memcpy(&object.hdr, place, sizeof(object.hdr));
        if (object.hdr.type != BINDER_TYPE_PTR) return FAILED_TRANSACTION;
        memcpy(&object, place, sizeof(object));
        const size_t at = size;
        if (!append(reinterpret_cast<const void*>(object.buffer), object.length)) {
            return FAILED_TRANSACTION;
        }
        // Addresses of this process must not leave it: the offset in the packet replaces the
        // object's, and zero the parent's.
        object.buffer = at;
        memcpy(place, &object, sizeof(object));
        if ((object.flags & BINDER_BUFFER_FLAG_HAS_PARENT) != 0 &&
            (object.parent >= i || !clearAddress(parcel.offsets()[object.parent], object))) {
            return FAILED_TRANSACTION;
        }
    }
    return OK;
}

void Packet::packStatus(status_t status) {
    Parcel parcel;
    parcel.writeInt32(status);
    pack(0, TF_STATUS_CODE, parcel);
}

status_t Packet::unpack(Header* header, Parcel* parcel, Parcel::ReleaseBuffer release,
                        void* owner) {
    status_t status = FAILED_TRANSACTION;
    size_t offsetsAt = 0;
    if (size >= sizeof(*header)) {
        memcpy(header, bytes, sizeof(*header));
        offsetsAt = sizeof(*header) + roundUp(header->dataSize);
        const size_t buffersAt = offsetsAt + roundUp(header->offsetsSize);
        if (header->dataSize % 4 == 0 && header->offsetsSize % sizeof(binder_size_t) == 0) {
            const bool isAll = header->offsetsSize == 0 && buffersAt == size;
            status = isAll ? OK : relocate(*header, buffersAt);
        }
    }
    if (status != OK) {
        release(bytes, owner);
        return status;
    }
    parcel->ipcSetDataReference(bytes + sizeof(*header), header->dataSize,
                                reinterpret_cast<const binder_size_t*>(bytes + offsetsAt),
                                header->offsetsSize / sizeof(binder_size_t), release, owner);
    return OK;
}

status_t Packet::relocate(const Header& header, size_t buffersAt) {
    if (buffersAt > size) return FAILED_TRANSACTION;
    uint8_t* data = bytes + sizeof(header);
    const auto* offsets = reinterpret_cast<const binder_size_t*>(data + roundUp(header.dataSize));
    const size_t count = header.offsetsSize / sizeof(binder_size_t);
    size_t least = 0;
    for (size_t i = 0; i < count; ++i) {
        const size_t offset = offsets[i];
        binder_buffer_object object;
        // Objects follow one another, and lie within the data at multiples of 4.
        if (offset < least || offset % 4 != 0 || offset > header.dataSize ||
            sizeof(object) > header.dataSize - offset) {
            return FAILED_TRANSACTION;
        }
        least = offset + sizeof(object);
        memcpy(&object, data + offset, sizeof(object));
        if (object.hdr.type != BINDER_TYPE_PTR || object.length > size - buffersAt) {
            return FAILED_TRANSACTION;
        }
        object.buffer = reinterpret_cast<binder_uintptr_t>(bytes + buffersAt);
        buffersAt += roundUp(object.length);
        if (buffersAt > size) return FAILED_TRANSACTION;
        memcpy(data + offset, &object, sizeof(object));
        if ((object.flags & BINDER_BUFFER_FLAG_HAS_PARENT) == 0) continue;
        if (object.parent >= i || !setAddress(data + offsets[object.parent], object)) {
            return FAILED_TRANSACTION;
        }
    }
    return buffersAt == size ? OK : FAILED_TRANSACTION;
}

}  // namespace android::hardware
