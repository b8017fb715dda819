// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hidl/HidlSupport.h>

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string_view>
#include <type_traits>

namespace android::hardware::details {

/** Size of the largest message, request or reply, in bytes. */
inline constexpr size_t kMaxMessageSize = 65536;

/**
 * One packet of the transport. Every item begins at a multiple of 8, so that the elements of a list
 * can be used where they lie.
 */
struct Message {
    // Left uninitialised: 64 KiB would be cleared for messages of some 100 bytes.
    alignas(8) char data[kMaxMessageSize];
    size_t size = 0;
};

/** Whether values of a type cross the transport as they lie in memory. */
template <typename T>
inline constexpr bool isPlain = std::is_trivially_copyable_v<T> && !std::is_same_v<T, bool> &&
                                !std::is_pointer_v<T> && !std::is_same_v<T, std::string_view>;

/** Puts values into a message, one after the other. */
class Writer {
  public:
    explicit Writer(Message& message) : mMessage(message) { mMessage.size = 0; }

    /** @return whether everything that was put had room. */
    bool fits() const { return mFits; }

    template <typename T>
    std::enable_if_t<isPlain<T>> put(const T& value) {
        putBytes(&value, sizeof(value));
    }
    void put(bool value) { put(uint32_t{value}); }
    void put(std::string_view text) {
        put(static_cast<uint32_t>(text.size()));
        putBytes(text.data(), text.size());
    }
    void put(const hidl_string& text) { put(std::string_view(text.c_str(), text.size())); }
    template <typename T>
    void put(const hidl_vec<T>& list) {
        put(static_cast<uint32_t>(list.size()));
        if constexpr (isPlain<T>) {
            putBytes(list.data(), list.size() * sizeof(T));
        } else {
            for (const T& element : list)
                put(element);
        }
    }

  private:
    void putBytes(const void* bytes, size_t size) {
        const size_t padded = (size + 7) / 8 * 8;
        mFits = mFits && padded <= kMaxMessageSize - mMessage.size;
        if (!mFits || size == 0) return;
        memcpy(mMessage.data + mMessage.size, bytes, size);
        memset(mMessage.data + mMessage.size + size, 0, padded - size);
        mMessage.size += padded;
    }

    Message& mMessage;
    bool mFits = true;
};

/** Takes values out of a message in the order in which they were put. */
class Reader {
  public:
    explicit Reader(Message& message) : mNext(message.data), mLeft(message.size) {}

    /** @return whether every value was there, and nothing is left over. */
    bool isComplete() const { return mValid && mLeft == 0; }

    template <typename T>
    std::enable_if_t<isPlain<T>> take(T* value) {
        if (const char* bytes = takeBytes(1, sizeof(T))) memcpy(value, bytes, sizeof(T));
    }
    void take(bool* value) {
        uint32_t number = 0;
        take(&number);
        mValid = mValid && number <= 1;
        *value = number == 1;
    }
    /** The text refers to the message, which must outlive it. */
    void take(std::string_view* text) {
        const size_t length = takeCount();
        if (const char* bytes = takeBytes(length, 1)) *text = std::string_view(bytes, length);
    }
    void take(hidl_string* text) {
        std::string_view view;
        take(&view);
        *text = hidl_string(view.data(), view.size());
    }
    /** A list of plain values refers to the message, which must outlive it. */
    template <typename T>
    void take(hidl_vec<T>* list) {
        const size_t count = takeCount();
        if constexpr (isPlain<T>) {
            char* bytes = takeBytes(count, sizeof(T));
            if (bytes != nullptr) list->setToExternal(reinterpret_cast<T*>(bytes), count);
        } else {
            // Each element takes 8 bytes at the least: no more can be meant than could follow.
            mValid = mValid && count <= mLeft / 8;
            if (!mValid) return;
            list->resize(count);
            for (T& element : *list)
                take(&element);
        }
    }

  private:
    size_t takeCount() {
        uint32_t count = 0;
        take(&count);
        return count;
    }

    /** @return the bytes of count elements, nullptr where the message does not hold so many. */
    char* takeBytes(size_t count, size_t size) {
        const size_t padded = (count * size + 7) / 8 * 8;
        mValid = mValid && padded <= mLeft;
        if (!mValid) return nullptr;
        char* bytes = mNext;
        mNext += padded;
        mLeft -= padded;
        return bytes;
    }

    char* mNext;
    size_t mLeft;
    bool mValid = true;
};

}  // namespace android::hardware::details
