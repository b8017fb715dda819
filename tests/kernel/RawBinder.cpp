// SPDX-License-Identifier: Apache-2.0
#include "kernel/RawBinder.h"

#include <fcntl.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace {

constexpr size_t kMapSize = (1U << 20U) - 2 * 4096;
constexpr int kTimeoutMs = 10'000;

binder_uintptr_t addressOf(const void* memory) {
    return reinterpret_cast<binder_uintptr_t>(memory);
}

const uint8_t* memoryAt(binder_uintptr_t address) {
    return reinterpret_cast<const uint8_t*>(address);
}

template <typename Value>
Value valueAt(const void* memory) {
    Value value{};
    memcpy(&value, memory, sizeof(value));
    return value;
}

[[noreturn]] void fail(const char* what) {
    std::perror(what);
    abort();
}

}  // namespace

RawParcel& RawParcel::bytes(const void* from, size_t size) {
    const auto* begin = static_cast<const uint8_t*>(from);
    mData.insert(mData.end(), begin, begin + size);
    mData.resize((mData.size() + 3) / 4 * 4);
    return *this;
}

binder_size_t RawParcel::buffer(const std::string& content, const Buffer& where) {
    mMemory.push_back(content);
    binder_buffer_object object{};
    object.hdr.type = BINDER_TYPE_PTR;
    object.buffer = addressOf(mMemory.back().data());
    object.length = content.size();
    if (where.parent != Buffer::kNoParent) {
        object.flags = BINDER_BUFFER_FLAG_HAS_PARENT;
        object.parent = where.parent;
        object.parent_offset = where.parentOffset;
    }
    mBuffersSize += (content.size() + 7) / 8 * 8;
    this->object(object, where.listed);
    return mOffsets.size() - 1;
}

binder_size_t RawParcel::header(uint32_t count, const Buffer& where, bool owns) {
    std::string content(16, '\0');
    memcpy(&content[8], &count, sizeof(count));
    content[12] = owns ? 1 : 0;
    return buffer(content, where);
}

RawParcel& RawParcel::string(const std::string& text) {
    const binder_size_t parent = header(static_cast<uint32_t>(text.size()), {});
    buffer(std::string(text.c_str(), text.size() + 1), {parent, 0});
    return *this;
}

RawParcel& RawParcel::strings(const std::vector<std::string>& texts) {
    const binder_size_t parent = header(static_cast<uint32_t>(texts.size()), {});
    std::string elements(16 * texts.size(), '\0');
    for (size_t i = 0; i < texts.size(); ++i) {
        const auto size = static_cast<uint32_t>(texts[i].size());
        memcpy(&elements[16 * i + 8], &size, sizeof(size));
    }
    const binder_size_t array = buffer(elements, {parent, 0});
    for (size_t i = 0; i < texts.size(); ++i)
        buffer(std::string(texts[i].c_str(), texts[i].size() + 1), {array, 16 * i});
    return *this;
}

RawParcel& RawParcel::vector(uint32_t count, const std::string& elements) {
    buffer(elements, {header(count, {}), 0});
    return *this;
}

RawParcel& RawParcel::cut(size_t size) {
    mData.resize(size);
    while (!mOffsets.empty() && mOffsets.back() + sizeof(binder_buffer_object) > size)
        mOffsets.pop_back();
    return *this;
}

binder_transaction_data_sg RawParcel::transaction() const {
    binder_transaction_data_sg result{};
    result.transaction_data.data_size = mData.size();
    result.transaction_data.data.ptr.buffer = addressOf(mData.data());
    result.transaction_data.offsets_size = mOffsets.size() * sizeof(binder_size_t);
    result.transaction_data.data.ptr.offsets = addressOf(mOffsets.data());
    result.buffers_size = mBuffersSize;
    return result;
}

uint32_t RawAnswer::word(size_t index) const {
    return 4 * index + 4 <= data.size() ? valueAt<uint32_t>(&data[4 * index]) : UINT32_MAX;
}

std::string RawAnswer::text() const {
    switch (kind) {
        case kReply:
            return "a reply of " + std::to_string(data.size()) + " bytes, exception " +
                   std::to_string(word(0));
        case kStatus:
            return "status " + std::to_string(status);
        case kFailed:
            return "refused by the driver";
        case kDead:
            return "the object is dead";
        case kSent:
            return "sent";
        default:
            return "nothing in time";
    }
}

RawBinder::RawBinder(const char* device)
    : mDevice(open(device, O_RDWR | O_CLOEXEC | O_NONBLOCK)),
      mMap(mmap(nullptr, kMapSize, PROT_READ, MAP_PRIVATE, mDevice, 0)) {
    if (mDevice < 0 || mMap == MAP_FAILED) fail(device);
    const uint32_t threads = 0;
    ioctl(mDevice, BINDER_SET_MAX_THREADS, &threads);
}

RawBinder::~RawBinder() {
    munmap(mMap, kMapSize);
    close(mDevice);
}

RawAnswer RawBinder::call(uint32_t handle, uint32_t code, const RawParcel& request,
                          uint32_t flags) {
    mAnswer = RawAnswer();
    mAnswered = false;
    mOneWay = (flags & TF_ONE_WAY) != 0;
    send(handle, code, request, flags);
    while (!mAnswered && receive(kTimeoutMs)) {
    }
    return mAnswer;
}

void RawBinder::send(uint32_t handle, uint32_t code, const RawParcel& request, uint32_t flags) {
    binder_transaction_data_sg data = request.transaction();
    data.transaction_data.target.handle = handle;
    data.transaction_data.code = code;
    data.transaction_data.flags = flags;
    command(BC_TRANSACTION_SG, &data, sizeof(data));
    exchange(false);
}

uint32_t RawBinder::get(const std::string& interface, const std::string& name) {
    const RawAnswer answer =
            call(0, raw::kGet, RawParcel(raw::kManager).string(interface).string(name));
    return answer.isOk() && answer.handles.size() == 1 ? answer.handles[0] : 0;
}

flat_binder_object RawBinder::object() {
    flat_binder_object result{};
    result.hdr.type = BINDER_TYPE_BINDER;
    result.flags = 0x7f;
    // Never looked at but by the driver, to which it must not be null.
    result.binder = 1;
    result.cookie = 1;
    return result;
}

void RawBinder::serveWhile(const std::function<bool()>& condition) {
    command(BC_ENTER_LOOPER, nullptr, 0);
    exchange(false);
    while (condition())
        receive(20);
}

void RawBinder::command(uint32_t code, const void* data, size_t size) {
    const auto append = [this](const void* from, size_t count) {
        const auto* begin = static_cast<const uint8_t*>(from);
        mOut.insert(mOut.end(), begin, begin + count);
    };
    append(&code, sizeof(code));
    append(data, size);
}

bool RawBinder::exchange(bool read) {
    uint8_t in[1024];
    binder_write_read io{};
    io.write_size = mOut.size();
    io.write_buffer = addressOf(mOut.data());
    io.read_size = read ? sizeof(in) : 0;
    io.read_buffer = addressOf(in);
    while (ioctl(mDevice, BINDER_WRITE_READ, &io) != 0) {
        if (errno == EAGAIN) break;
        if (errno != EINTR) fail("BINDER_WRITE_READ");
    }
    // What has been taken in leads to new commands.
    mOut.clear();
    for (size_t at = 0; at + sizeof(uint32_t) <= io.read_consumed;) {
        const auto code = valueAt<uint32_t>(in + at);
        take(code, in + at + sizeof(code));
        at += sizeof(code) + _IOC_SIZE(code);
    }
    if (!mOut.empty()) exchange(false);
    return io.read_consumed > 0;
}

bool RawBinder::receive(int timeoutMs) {
    // Not by poll(): the driver takes tens of milliseconds to let go of a process that has used it,
    // and of other dead ones only then.
    for (int waited = 0; waited < timeoutMs * 2; ++waited) {
        if (exchange(true)) return true;
        usleep(500);
    }
    return false;
}

void RawBinder::take(uint32_t code, const uint8_t* data) {
    switch (code) {
        case BR_TRANSACTION:
            answer(valueAt<binder_transaction_data>(data));
            break;
        case BR_REPLY:
            mAnswer = read(valueAt<binder_transaction_data>(data));
            mAnswered = true;
            break;
        case BR_TRANSACTION_COMPLETE:
            if (mOneWay) mAnswer.kind = RawAnswer::kSent;
            mAnswered = mOneWay;
            break;
        case BR_FAILED_REPLY:
        case BR_DEAD_REPLY:
            mAnswer.kind = code == BR_FAILED_REPLY ? RawAnswer::kFailed : RawAnswer::kDead;
            mAnswered = true;
            break;
        case BR_INCREFS:
            command(BC_INCREFS_DONE, data, sizeof(binder_ptr_cookie));
            break;
        case BR_ACQUIRE:
            command(BC_ACQUIRE_DONE, data, sizeof(binder_ptr_cookie));
            break;
        default:
            break;
    }
}

RawAnswer RawBinder::read(const binder_transaction_data& data) {
    RawAnswer content;
    const uint8_t* begin = memoryAt(data.data.ptr.buffer);
    content.data.assign(begin, begin + data.data_size);
    content.kind = (data.flags & TF_STATUS_CODE) != 0 ? RawAnswer::kStatus : RawAnswer::kReply;
    if (content.kind == RawAnswer::kStatus) content.status = static_cast<int32_t>(content.word(0));
    const uint8_t* offsets = memoryAt(data.data.ptr.offsets);
    for (size_t i = 0; i < data.offsets_size / sizeof(binder_size_t); ++i) {
        const uint8_t* at = begin + valueAt<binder_size_t>(offsets + i * sizeof(binder_size_t));
        const auto type = valueAt<uint32_t>(at);
        if (type == BINDER_TYPE_PTR) {
            const auto object = valueAt<binder_buffer_object>(at);
            content.buffers.emplace_back(reinterpret_cast<const char*>(memoryAt(object.buffer)),
                                         object.length);
        } else if (type == BINDER_TYPE_HANDLE) {
            const auto object = valueAt<flat_binder_object>(at);
            content.handles.push_back(object.handle);
            command(BC_ACQUIRE, &object.handle, sizeof(object.handle));
        }
    }
    command(BC_FREE_BUFFER, &data.data.ptr.buffer, sizeof(data.data.ptr.buffer));
    return content;
}

void RawBinder::answer(const binder_transaction_data& request) {
    const RawAnswer content = read(request);
    RawParcel reply;
    const int32_t status =
            mHandler ? mHandler(request.code, content, reply) : raw::kUnknownTransaction;
    RawParcel refusal;
    refusal.u32(static_cast<uint32_t>(status));
    if ((request.flags & TF_ONE_WAY) == 0) {
        binder_transaction_data_sg data = (status == 0 ? reply : refusal).transaction();
        data.transaction_data.flags = status == 0 ? 0 : TF_STATUS_CODE;
        command(BC_REPLY_SG, &data, sizeof(data));
    }
    // Now, since the reply's memory goes with it.
    exchange(false);
}
