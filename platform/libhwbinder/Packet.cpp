// SPDX-License-Identifier: Apache-2.0
#include "Packet.h"

#include <cstring>

namespace android::hardware {
namespace {

/**
 * Writes an object's address into its parent's buffer.
 *
 * @param base what the parent has the place of its buffer from.
 * @return whether the place of the address is in there.
 */
bool setAddress(const uint8_t* parentObject, const binder_buffer_object& object,
                binder_uintptr_t base, binder_uintptr_t address) {
    binder_buffer_object parent;
    memcpy(&parent, parentObject, sizeof(parent));
    if (object.parent_offset > parent.length ||
        sizeof(address) > parent.length - object.parent_offset) {
        return false;
    }
    memcpy(reinterpret_cast<uint8_t*>(base + parent.buffer) + object.parent_offset, &address,
           sizeof(address));
    return true;
}

/**
 * @return whether an embedded object comes where the kernel lets it, too: next after its parent and
 *     what that holds so far, at a place behind theirs. So nothing is added to a buffer later, and
 * no address is written over.
 */
bool isInOrder(const uint8_t* data, const binder_size_t* offsets, size_t index,
               const binder_buffer_object& object) {
    size_t least = 0;
    for (size_t last = index - 1; last != object.parent;) {
        binder_buffer_object before;
        memcpy(&before, data + offsets[last], sizeof(before));
        if ((before.flags & BINDER_BUFFER_FLAG_HAS_PARENT) == 0) return false;
        least = before.parent_offset + sizeof(before.buffer);
        last = before.parent;
    }
    return object.parent_offset >= least;
}

}  // namespace

status_t Packet::packObjects(const Parcel& parcel) {
    if (!append(parcel.offsets(), parcel.offsetCount() * sizeof(binder_size_t))) {
        return FAILED_TRANSACTION;
    }
    uint8_t* const data = bytes + sizeof(Header);
    for (size_t i = 0; i < parcel.offsetCount(); ++i) {
        uint8_t* place = data + parcel.offsets()[i];
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
            (object.parent >= i || !setAddress(data + parcel.offsets()[object.parent], object,
                                               reinterpret_cast<binder_uintptr_t>(bytes), 0))) {
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

bool Packet::relocate(const Header& header) {
    if (header.dataSize % 4 != 0 || header.offsetsSize % sizeof(binder_size_t) != 0) return false;
    const size_t offsetsAt = sizeof(header) + roundUp(header.dataSize);
    size_t buffersAt = offsetsAt + roundUp(header.offsetsSize);
    if (buffersAt > size) return false;
    uint8_t* data = bytes + sizeof(header);
    const auto* offsets = reinterpret_cast<const binder_size_t*>(bytes + offsetsAt);
    const size_t count = header.offsetsSize / sizeof(binder_size_t);
    size_t least = 0;
    for (size_t i = 0; i < count; ++i) {
        const size_t offset = offsets[i];
        binder_buffer_object object;
        // Objects follow one another, and lie within the data at multiples of 4.
        if (offset < least || offset % 4 != 0 || offset > header.dataSize ||
            sizeof(object) > header.dataSize - offset) {
            return false;
        }
        least = offset + sizeof(object);
        memcpy(&object, data + offset, sizeof(object));
        if (object.hdr.type != BINDER_TYPE_PTR || object.length > size - buffersAt) {
            return false;
        }
        object.buffer = reinterpret_cast<binder_uintptr_t>(bytes + buffersAt);
        buffersAt += roundUp(object.length);
        if (buffersAt > size) return false;
        memcpy(data + offset, &object, sizeof(object));
        if ((object.flags & BINDER_BUFFER_FLAG_HAS_PARENT) == 0) continue;
        if (object.parent >= i || !isInOrder(data, offsets, i, object) ||
            !setAddress(data + offsets[object.parent], object, 0, object.buffer)) {
            return false;
        }
    }
    return buffersAt == size;
}

}  // namespace android::hardware
