// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/Parcel.h>
#include <utils/Errors.h>

#include <cstddef>
#include <cstdint>

namespace android::hardware {

/**
 * A parcel on its way over a socket: a header, the parcel's data, its list of offsets, and its
 * buffers in the order of their objects. Each part begins at a multiple of 8.
 *
 * What the kernel does for a parcel is done here: buffers are copied, and their objects and the
 * addresses in their parents changed to where they lie in the receiver.
 */
struct Packet {
    /** Size of the largest packet, in bytes. */
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
    status_t pack(uint32_t code, uint32_t flags, const Parcel& parcel);
    /** Packs an error in place of a reply. */
    void packStatus(status_t status);

    /**
     * Makes a parcel of the packet that has been received, which it refers to.
     *
     * @param header takes the header.
     * @param release called with the packet when it is no longer needed: at once if the packet is
     *     malformed, else when the parcel is cleared.
     * @return OK; FAILED_TRANSACTION if its sizes, offsets and objects do not fit together.
     */
    status_t unpack(Header* header, Parcel* parcel, Parcel::ReleaseBuffer release, void* owner);

    size_t size = 0;
    // Left uninitialised, to save clearing 64 KiB for packets of some 100 bytes.
    alignas(8) uint8_t bytes[kMaxSize];

  private:
    bool append(const void* source, size_t length);
    status_t packObjects(const Parcel& parcel);
    /** Clears the place of an object's address in its parent's buffer. */
    bool clearAddress(size_t parentObject, const binder_buffer_object& object);
    /** Changes objects and addresses of a received packet to where the buffers lie here. */
    status_t relocate(const Header& header, size_t buffersAt);
};

}  // namespace android::hardware
