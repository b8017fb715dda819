// SPDX-License-Identifier: Apache-2.0
#pragma once

#include "libhwbinder/Packet.h"

#include <gtest/gtest.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <utils/UniqueFd.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <string>
#include <utility>
#include <vector>

/** What a client knows of the protocol that shares no code with the service. */
namespace raw {
constexpr char kManager[] = "android.hidl.manager@1.0::IServiceManager";
constexpr char kBase[] = "android.hidl.base@1.0::IBase";
constexpr char kV10[] = "android.hardware.vibrator@1.0::IVibrator";
constexpr char kV20[] = "vendor.velmora.hardware.vibrator@2.0::IDaxVibrator";
constexpr char kV21[] = "vendor.velmora.hardware.vibrator@2.1::IDaxVibrator";
constexpr uint32_t kPing = 0x0f504e47;
constexpr uint32_t kInterfaceChain = 0x0f43484e;
constexpr uint32_t kDebug = 0x0f444247;
constexpr uint32_t kSetHalInstrumentation = 0x0f494e54;
constexpr uint32_t kNotifySyspropsChanged = 0x0f535953;
constexpr uint32_t kOn = 1;
constexpr uint32_t kSupportsAmplitudeControl = 3;
constexpr uint32_t kDaxSetAmplitude = 18;
constexpr uint32_t kDaxPerformHapticEngine = 23;
constexpr uint32_t kManagersGet = 1;
constexpr uint32_t kManagersAdd = 2;
}  // namespace raw

/** @return a structure's bytes. */
template <typename T>
std::string bytesOf(const T& value) {
    return {reinterpret_cast<const char*>(&value), sizeof(value)};
}

/**
 * A message, right or as wrong as a test wants it: an interface's token, objects one after the
 * other, and plain values. All of it may be changed until it is given away.
 */
struct RawMessage {
    explicit RawMessage(std::string itsHead) : head(std::move(itsHead)) {
        head.resize((head.size() + 3) / 4 * 4);
    }
    static RawMessage to(const std::string& interface) {
        return RawMessage(interface + std::string(1, '\0'));
    }

    /** Adds memory that goes along, and the object that refers to it. */
    void add(const std::string& content, bool hasParent = false, binder_size_t parent = 0,
             binder_size_t parentOffset = 0) {
        binder_buffer_object object{};
        object.hdr.type = BINDER_TYPE_PTR;
        object.flags = hasParent ? BINDER_BUFFER_FLAG_HAS_PARENT : 0;
        object.parent = parent;
        object.parent_offset = parentOffset;
        offsets.push_back(objects.size() * sizeof(object));
        objects.push_back(object);
        memory.emplace_back();
        set(objects.size() - 1, content);
    }
    /** Adds an object, without memory of its own, behind everything else. */
    template <typename Object>
    void addLast(const Object& object) {
        offsets.push_back(objects.size() * sizeof(objects[0]) + tail.size());
        tail += bytesOf(object);
    }
    void set(size_t i, const std::string& content) {
        memory[i] = content;
        objects[i].length = content.size();
    }
    /** Adds a list or a string: an address, a count, whether it owns its elements; and these. */
    void addList(uint32_t count, const std::string& elements) {
        add(bytesOf(uint64_t{0}) + bytesOf(count) + bytesOf(uint32_t{0}));
        add(elements, true, objects.size() - 1);
    }
    void addString(const std::string& text) {
        addList(static_cast<uint32_t>(text.size()), text + std::string(1, '\0'));
    }
    void setCount(uint32_t count) { memcpy(&memory[0][8], &count, sizeof(count)); }
    /** Drops what comes after some of the objects. */
    void keep(size_t count) {
        objects.resize(count);
        offsets.resize(count);
        memory.resize(count);
        tail.clear();
    }
    /** Puts an object of another kind in the place of one. */
    template <typename Object>
    void replace(size_t i, uint32_t type, Object object = {}) {
        object.hdr.type = type;
        objects[i] = {};
        memcpy(&objects[i], &object, sizeof(object));
    }

    /** Becomes a parcel, which refers to this. */
    void giveTo(android::hardware::Parcel* parcel) {
        mPlaces.clear();
        mData = head;
        for (size_t i = 0; i < objects.size(); ++i) {
            if (objects[i].hdr.type == BINDER_TYPE_PTR)
                objects[i].buffer = reinterpret_cast<binder_uintptr_t>(memory[i].data());
            mData += bytesOf(objects[i]);
        }
        mData += tail;
        for (const binder_size_t offset : offsets)
            mPlaces.push_back(head.size() + offset);
        parcel->ipcSetDataReference(
                reinterpret_cast<const uint8_t*>(mData.data()), mData.size(), mPlaces.data(),
                mPlaces.size(), [](const uint8_t*, void*) {}, nullptr);
    }
    /** Becomes a packet; nothing of it is checked. */
    std::unique_ptr<android::hardware::Packet> packet(uint32_t code, uint32_t flags = 0) {
        android::hardware::Parcel parcel;
        giveTo(&parcel);
        std::string bytes = bytesOf(
                android::hardware::Packet::Header{code, flags, static_cast<uint32_t>(mData.size()),
                                                  static_cast<uint32_t>(8 * mPlaces.size())});
        const auto append = [&](const std::string& part) {
            bytes += part;
            bytes.resize((bytes.size() + 7) / 8 * 8);
        };
        append(mData);
        append({reinterpret_cast<const char*>(mPlaces.data()), 8 * mPlaces.size()});
        for (const std::string& part : memory)
            append(part);
        auto packet = std::unique_ptr<android::hardware::Packet>(new android::hardware::Packet);
        packet->size = bytes.size();
        memcpy(packet->bytes, bytes.data(), std::min(bytes.size(), sizeof(packet->bytes)));
        return packet;
    }

    std::string head;
    std::vector<binder_buffer_object> objects;
    /** Where the objects lie behind the head. */
    std::vector<binder_size_t> offsets;
    std::vector<std::string> memory;
    std::string tail;

  private:
    std::string mData;
    std::vector<binder_size_t> mPlaces;
};

/** What has come back over a socket: the status that stands for a reply, or the reply. */
struct Received {
    bool isClosed = false;
    int32_t status = 0;
    std::vector<uint8_t> packet;

    uint32_t word(size_t index) const {
        uint32_t value = 0;
        memcpy(&value, packet.data() + sizeof(android::hardware::Packet::Header) + 4 * index,
               sizeof(value));
        return value;
    }
};

/** A client of the daemon that sends over its socket whatever it likes. */
class RawClient {
  public:
    using Packet = android::hardware::Packet;

    explicit RawClient(const std::string& directory, const std::string& interface = raw::kV21)
        : mSocket(socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0)) {
        sockaddr_un address{};
        address.sun_family = AF_UNIX;
        const std::string path = directory + "/" + interface + ".default";
        memcpy(address.sun_path, path.c_str(), path.size());
        const timeval tenSeconds{10, 0};
        setsockopt(mSocket.get(), SOL_SOCKET, SO_RCVTIMEO, &tenSeconds, sizeof(tenSeconds));
        // Of one that is refused, the first call fails.
        static_cast<void>(
                connect(socketNumber(), reinterpret_cast<sockaddr*>(&address), sizeof(address)));
    }

    int socketNumber() const { return mSocket.get(); }
    bool send(const void* bytes, size_t size, int flags = 0) const {
        return ::send(mSocket.get(), bytes, size, flags | MSG_NOSIGNAL) ==
               static_cast<ssize_t>(size);
    }
    bool send(const std::unique_ptr<Packet>& packet) const {
        return send(packet->bytes, packet->size);
    }
    Received receive() const {
        Received answer;
        answer.packet.resize(Packet::kMaxSize);
        const ssize_t size = recv(mSocket.get(), answer.packet.data(), Packet::kMaxSize, 0);
        // Reset: closed by the server with a request still unread.
        if (size < 0 && errno != ECONNRESET) ADD_FAILURE() << "no reply: " << strerror(errno);
        answer.isClosed = size <= 0;
        if (answer.isClosed) return answer;
        answer.packet.resize(static_cast<size_t>(size));
        Packet::Header header;
        memcpy(&header, answer.packet.data(), sizeof(header));
        if ((header.flags & TF_STATUS_CODE) != 0)
            answer.status = static_cast<int32_t>(answer.word(0));
        return answer;
    }
    Received call(const std::unique_ptr<Packet>& packet) const {
        EXPECT_TRUE(send(packet));
        return receive();
    }
    bool answersPing() const {
        if (!send(RawMessage::to(raw::kBase).packet(raw::kPing))) return false;
        const Received answer = receive();
        return !answer.isClosed && answer.status == 0;
    }

  private:
    android::UniqueFd mSocket;
};

/** @return a request with numbers as arguments. */
inline std::unique_ptr<android::hardware::Packet> request(
        const char* interface, uint32_t code, const std::vector<uint32_t>& arguments = {},
        uint32_t flags = 0) {
    RawMessage message = RawMessage::to(interface);
    for (const uint32_t argument : arguments)
        message.tail += bytesOf(argument);
    return message.packet(code, flags);
}
