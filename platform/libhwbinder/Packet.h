// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Parcel.h>
#include <utils/Errors.h>

#include <cstddef>
#include <cstdint>
#include <cstring>

namespace android::hardware {

/**
 * A parcel on its way over a socket: a header, the parcel's data, its list of offsets, and its
 * buffers in the order of their objects. Each part begins at a multiple of 8.
 *
 * What the kernel does for a parcel is done here: buffers are copied, and their objects and the
 * addresses in their parents changed to where they lie in the receiver.
 */
struct Packet {
    /** Size of the largest packet, in bytes; Status::description() names it. */
    static constexpr size_t kMaxSize = 65536;

    struct Header {
        /** Of the operation; 0 in a reply. */
        uint32_t code;
        /** TF_ONE_WAY in a request, TF_STATUS_CODE in a reply that is just a status. */
        uint32_t flags;
        // In bytes, without the padding to a multiple of 8.
        uint32_t dataSize;
        uint32_t offsetsSize;
    };

    // NOLINTNEXTLINE(modernize-use-equals-default): with that, make_unique would clear the bytes.
    Packet() {}

    /** @return OK; FAILED_TRANSACTION if it is too large, or has other objects than buffers. */
    status_t pack(uint32_t code, uint32_t flags, const Parcel& parcel) {
        const size_t offsetsSize = parcel.offsetCount() * sizeof(binder_size_t);
        const Header header{code, flags, static_cast<uint32_t>(parcel.dataSize()),
                            static_cast<uint32_t>(offsetsSize)};
        memcpy(bytes, &header, sizeof(header));
        size = sizeof(header);
        if (!append(parcel.data(), parcel.dataSize())) return FAILED_TRANSACTION;
        return offsetsSize == 0 ? OK : packObjects(parcel);
    }
    /** Packs an error in place of a reply. */
    void packStatus(status_t status);

    /**
     * Makes a parcel of the packet that has been received, which it refers to.
     *
     * @param header takes the header.
     * @param release called with the packet's bytes when the parcel is cleared; nullptr if nobody
     *     waits for that.
     * @return OK; FAILED_TRANSACTION if its sizes, offsets and objects do not fit together.
     */
    status_t unpack(Header* header, Parcel* parcel, Parcel::ReleaseBuffer release = nullptr,
                    void* owner = nullptr) {
        if (size < sizeof(*header)) return FAILED_TRANSACTION;
        memcpy(header, bytes, sizeof(*header));
        const size_t offsetsAt = sizeof(*header) + roundUp(header->dataSize);
        const bool isPlain =
                header->dataSize % 4 == 0 && header->offsetsSize == 0 && offsetsAt == size;
        if (!isPlain && !relocate(*header)) return FAILED_TRANSACTION;
        parcel->ipcSetDataReference(bytes + sizeof(*header), header->dataSize,
                                    reinterpret_cast<const binder_size_t*>(bytes + offsetsAt),
                                    header->offsetsSize / sizeof(binder_size_t), release, owner);
        return OK;
    }

    size_t size = 0;
    // Left uninitialised, to save clearing 64 KiB for packets of some 100 bytes.
    alignas(8) uint8_t bytes[kMaxSize];

  private:
    static constexpr size_t roundUp(size_t length) { return (length + 7) & ~size_t{7}; }

    /** Adds a part. @return whether there was room. */
    bool append(const void* source, size_t length) {
        if (length > kMaxSize || roundUp(length) > kMaxSize - size) return false;
        if (length == 0) return true;
        size += roundUp(length);
        // The padding of the last 8 bytes is zero.
        memset(bytes + size - 8, 0, 8);
        memcpy(bytes + size - roundUp(length), source, length);
        return true;
    }
    status_t packObjects(const Parcel& parcel);
    /**
     * Changes objects and addresses of a received packet to where the buffers lie here.
     *
     * @return whether its sizes, offsets and objects fit together.
     */
    bool relocate(const Header& header);
};

}  // namespace android::hardware
