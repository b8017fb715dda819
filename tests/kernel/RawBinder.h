// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <linux/android/binder.h>
#include <sys/types.h>

#include <cerrno>
#include <cstdint>
#include <deque>
#include <functional>
#include <string>
#include <vector>

/** What the raw peer knows of the platform's protocol: names, and codes of transactions. */
namespace raw {
constexpr char kManager[] = "android.hidl.manager@1.0::IServiceManager";
constexpr char kManager1_2[] = "android.hidl.manager@1.2::IServiceManager";
constexpr char kBase[] = "android.hidl.base@1.0::IBase";
constexpr uint32_t kGet = 1;
constexpr uint32_t kAdd = 2;
constexpr uint32_t kAddWithChain = 12;
constexpr uint32_t kInterfaceChain = 0x0f43484e;
constexpr uint32_t kPing = 0x0f504e47;
constexpr uint32_t kDebug = 0x0f444247;

constexpr int32_t kUnknownTransaction = -EBADMSG;
constexpr int32_t kNotEnoughData = -ENODATA;
constexpr int32_t kBadType = INT32_MIN + 1;
}  // namespace raw

/** The content of a request or a reply: as right, or as wrong, as a test wants it. */
class RawParcel {
  public:
    RawParcel() = default;
    /** Begins with an interface's token. */
    explicit RawParcel(const std::string& token) { this->token(token); }
    // Its objects point into it.
    RawParcel(const RawParcel&) = delete;
    RawParcel& operator=(const RawParcel&) = delete;
    ~RawParcel() = default;

    RawParcel& token(const std::string& interface) {
        return bytes(interface.c_str(), interface.size() + 1);
    }

    RawParcel& bytes(const void* from, size_t size);
    RawParcel& u32(uint32_t value) { return bytes(&value, sizeof(value)); }
    /** Adds an object of the driver's, listed as one or not. */
    template <typename Object>
    RawParcel& object(const Object& value, bool listed = true) {
        if (listed) mOffsets.push_back(mData.size());
        return bytes(&value, sizeof(value));
    }

    /** Memory that the request carries along, and where it is to be mentioned. */
    struct Buffer {
        /** Index of the buffer that holds the pointer to this one; none for the outermost. */
        static constexpr binder_size_t kNoParent = UINT64_MAX;
        binder_size_t parent = kNoParent;
        binder_size_t parentOffset = 0;
        bool listed = true;
    };
    /** Adds a buffer. @return its index. */
    binder_size_t buffer(const std::string& content, const Buffer& where);
    /** Adds the 16 bytes in which a string or a vector begins. @return the buffer's index. */
    binder_size_t header(uint32_t count, const Buffer& where, bool owns = false);
    RawParcel& string(const std::string& text);
    RawParcel& strings(const std::vector<std::string>& texts);
    /** Adds a vector whose count is right or not, with its elements. */
    RawParcel& vector(uint32_t count, const std::string& elements);

    size_t size() const { return mData.size(); }
    /** Cuts the data off after some bytes, and with them the objects behind. */
    RawParcel& cut(size_t size);

    /** @return the request or reply for the driver; valid as long as this is. */
    binder_transaction_data_sg transaction() const;

  private:
    std::vector<uint8_t> mData;
    std::vector<binder_size_t> mOffsets;
    std::deque<std::string> mMemory;
    binder_size_t mBuffersSize = 0;
};

/** What has come of a call; or the content of a request, which is a reply's kind then. */
struct RawAnswer {
    enum Kind {
        kReply,
        /** A status in place of a reply. */
        kStatus,
        /** The driver refused the request, or the reply. */
        kFailed,
        /** The object's process is dead. */
        kDead,
        /** The driver took a oneway request. */
        kSent,
        kNothingInTime,
    };
    Kind kind = kNothingInTime;
    int32_t status = 0;
    std::vector<uint8_t> data;
    /** What each buffer holds, in order. */
    std::vector<std::string> buffers;
    /** The objects in it, which are this process's to use. */
    std::vector<uint32_t> handles;

    uint32_t word(size_t index) const;
    /** @return the string that a buffer holds, without its end. */
    std::string string(size_t buffer) const { return std::string(buffers[buffer].c_str()); }
    /** Whether it is a reply without an exception. */
    bool isOk() const { return kind == kReply && data.size() >= 4 && word(0) == 0; }
    /** @return what it is, for a test's message. */
    std::string text() const;
};

/**
 * A process's use of the kernel's binder driver, without any code of the runtime that it tries; it
 * may be used by one thread. Waits ten seconds at most.
 */
class RawBinder {
  public:
    explicit RawBinder(const char* device = "/dev/hwbinder");
    RawBinder(const RawBinder&) = delete;
    RawBinder& operator=(const RawBinder&) = delete;
    ~RawBinder();

    RawAnswer call(uint32_t handle, uint32_t code, const RawParcel& request, uint32_t flags = 0);
    /** Sends a request, and does not wait for what comes of it. */
    void send(uint32_t handle, uint32_t code, const RawParcel& request, uint32_t flags = 0);
    /** @return the service's handle; 0 where the manager knows none. */
    uint32_t get(const std::string& interface, const std::string& name = "default");

    /** Answers a request for this process's object. @return the status; not 0 in place of a reply.
     */
    using Handler =
            std::function<int32_t(uint32_t code, const RawAnswer& request, RawParcel& reply)>;
    /** Has requests answered, which happens in calls and in serveWhile(). */
    void onRequest(Handler handler) { mHandler = std::move(handler); }
    /** @return this process's object, as it is put in a request. */
    static flat_binder_object object();
    void serveWhile(const std::function<bool()>& condition);

  private:
    void command(uint32_t code, const void* data, size_t size);
    /** Performs the commands. @return whether anything was read. */
    bool exchange(bool read);
    /** Waits for more from the driver and sees to it. @return whether anything came in time. */
    bool receive(int timeoutMs);
    void take(uint32_t code, const uint8_t* data);
    RawAnswer read(const binder_transaction_data& data);
    void answer(const binder_transaction_data& request);

    int mDevice;
    void* mMap;
    std::vector<uint8_t> mOut;
    Handler mHandler;
    RawAnswer mAnswer;
    bool mOneWay = false;
    bool mAnswered = false;
};
