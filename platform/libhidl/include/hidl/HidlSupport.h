// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <cutils/native_handle.h>
#include <hidl/HidlInternal.h>
#include <utils/RefBase.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <string>
#include <string_view>
#include <type_traits>
#include <utility>
#include <vector>

namespace android::hidl::base::V1_0 {
struct IBase;
}

namespace android::hardware {

// Strings, lists and handles lie in memory as on the wire. Their padding has a name and is zero, so
// that no uninitialised memory of this process is sent.

/** Receives the notice that a remote object's process has ended. */
struct hidl_death_recipient : public virtual RefBase {
    /**
     * @param cookie what was given to linkToDeath.
     * @param who the object; it may be gone in this process too.
     */
    virtual void serviceDied(uint64_t cookie,
                             const wp<::android::hidl::base::V1_0::IBase>& who) = 0;
};

/** Descriptors and numbers that travel with a call. On this platform only an empty one does. */
class hidl_handle {
  public:
    hidl_handle() = default;
    hidl_handle(const native_handle_t* handle) : mHandle(handle) {}  // NOLINT: as published
    hidl_handle& operator=(const native_handle_t* handle) {
        mHandle = handle;
        return *this;
    }

    const native_handle_t* getNativeHandle() const { return mHandle; }
    operator const native_handle_t*() const { return mHandle; }  // NOLINT: as published

  private:
    const native_handle_t* mHandle = nullptr;
    [[maybe_unused]] bool mOwnsHandle = false;
    [[maybe_unused]] uint8_t mZero[7] = {};
};

/** Text that crosses an interface. */
class hidl_string {
  public:
    /** Offset of the pointer to the characters, for packing and unpacking. */
    static constexpr size_t kOffsetOfBuffer = 0;

    hidl_string() = default;
    hidl_string(const char* text)  // NOLINT: implicit as published
        : hidl_string(std::string_view(text == nullptr ? "" : text)) {}
    hidl_string(const char* text, size_t length) : hidl_string(std::string_view(text, length)) {}
    hidl_string(const std::string& text)  // NOLINT: implicit as published
        : hidl_string(std::string_view(text)) {}
    hidl_string(const hidl_string& other) : hidl_string(other.view()) {}
    hidl_string(hidl_string&& other) noexcept { swap(other); }
    ~hidl_string() {
        if (mOwnsBuffer) delete[] mBuffer;
    }
    hidl_string& operator=(hidl_string other) noexcept {
        swap(other);
        return *this;
    }

    const char* c_str() const { return mBuffer; }
    size_t size() const { return mSize; }
    bool empty() const { return mSize == 0; }
    operator std::string() const { return std::string(view()); }  // NOLINT: implicit as published

  private:
    explicit hidl_string(std::string_view text) {
        if (text.empty()) return;
        auto* copy = new char[text.size() + 1];
        std::copy(text.begin(), text.end(), copy);
        copy[text.size()] = '\0';
        mBuffer = copy;
        mSize = static_cast<uint32_t>(text.size());
        mOwnsBuffer = true;
    }

    std::string_view view() const { return {mBuffer, mSize}; }
    void swap(hidl_string& other) noexcept {
        std::swap(mBuffer, other.mBuffer);
        std::swap(mSize, other.mSize);
        std::swap(mOwnsBuffer, other.mOwnsBuffer);
    }

    friend bool operator==(const hidl_string& left, const hidl_string& right) {
        return left.view() == right.view();
    }
    friend bool operator!=(const hidl_string& left, const hidl_string& right) {
        return left.view() != right.view();
    }
    friend bool operator<(const hidl_string& left, const hidl_string& right) {
        return left.view() < right.view();
    }

    const char* mBuffer = "";
    uint32_t mSize = 0;
    bool mOwnsBuffer = false;
    [[maybe_unused]] uint8_t mZero[3] = {};
};

/** List that crosses an interface. It owns its elements or refers to those of another owner. */
template <typename T>
class hidl_vec {
  public:
    /** Offset of the pointer to the elements, for packing and unpacking. */
    static constexpr size_t kOffsetOfBuffer = 0;

    hidl_vec() = default;
    explicit hidl_vec(size_t size) { resize(size); }
    hidl_vec(std::initializer_list<T> list) { copyOf(list.begin(), list.size()); }
    hidl_vec(const std::vector<T>& other) {  // NOLINT: implicit as published
        copyOf(other.data(), other.size());
    }
    hidl_vec(const hidl_vec& other) { copyOf(other.mBuffer, other.mSize); }
    hidl_vec(hidl_vec&& other) noexcept { swap(other); }
    ~hidl_vec() {
        if (mOwnsBuffer) delete[] mBuffer;
    }
    hidl_vec& operator=(hidl_vec other) noexcept {
        swap(other);
        return *this;
    }

    /**
     * Refers to elements that live elsewhere, without a copy.
     *
     * @param shouldOwn whether the list deletes them in the end; data is then from new[].
     */
    void setToExternal(T* data, size_t size, bool shouldOwn = false) {
        if (mOwnsBuffer) delete[] mBuffer;
        mBuffer = data;
        mSize = static_cast<uint32_t>(size);
        mOwnsBuffer = shouldOwn;
    }

    /** Changes the number of elements, keeping as many as fit. */
    void resize(size_t size) {
        auto* data = new T[size]();
        std::copy_n(mBuffer, std::min<size_t>(size, mSize), data);
        setToExternal(data, size, true);
    }

    T* data() { return mBuffer; }
    const T* data() const { return mBuffer; }
    size_t size() const { return mSize; }
    T& operator[](size_t index) { return mBuffer[index]; }
    const T& operator[](size_t index) const { return mBuffer[index]; }
    T* begin() { return mBuffer; }
    T* end() { return mBuffer + mSize; }
    const T* begin() const { return mBuffer; }
    const T* end() const { return mBuffer + mSize; }

    operator std::vector<T>() const { return {begin(), end()}; }  // NOLINT: implicit as published
    bool operator==(const hidl_vec& other) const {
        return std::equal(begin(), end(), other.begin(), other.end());
    }
    bool operator!=(const hidl_vec& other) const { return !(*this == other); }

  private:
    void copyOf(const T* data, size_t size) {
        if (size == 0) return;
        auto* copy = new T[size]();
        std::copy_n(data, size, copy);
        setToExternal(copy, size, true);
    }
    void swap(hidl_vec& other) noexcept {
        std::swap(mBuffer, other.mBuffer);
        std::swap(mSize, other.mSize);
        std::swap(mOwnsBuffer, other.mOwnsBuffer);
    }

    T* mBuffer = nullptr;
    uint32_t mSize = 0;
    bool mOwnsBuffer = false;
    [[maybe_unused]] uint8_t mZero[3] = {};
};

/** Array of a fixed size that crosses an interface. */
template <typename T, size_t N>
class hidl_array {
  public:
    hidl_array() = default;
    hidl_array(const T (&elements)[N]) {  // NOLINT: implicit as published
        std::copy_n(elements, N, mElements);
    }

    const T& operator[](size_t index) const { return mElements[index]; }
    static constexpr size_t size() { return N; }
    bool operator==(const hidl_array& other) const {
        return std::equal(mElements, mElements + N, other.mElements);
    }

  private:
    T mElements[N] = {};
};

/** Shared memory; generated code needs its size, but nothing here uses it. */
class hidl_memory {
    hidl_handle mHandle;
    [[maybe_unused]] uint64_t mSize = 0;
    hidl_string mName;
};

/** Type of a set of an enumeration's values. */
template <typename Enum>
using hidl_bitfield = std::underlying_type_t<Enum>;

namespace details {
// Inline, so that the generated specialisations of several files are one.
inline namespace enum_values {
/** The values of an enumeration, each once, as the generated headers list them. */
template <typename Enum>
constexpr std::array<Enum, 0> hidl_enum_values = {};
}  // namespace enum_values
}  // namespace details

/** The values of an enumeration, for a range-based for. */
template <typename Enum>
struct hidl_enum_range {
    constexpr auto begin() const { return details::hidl_enum_values<Enum>.begin(); }
    constexpr auto end() const { return details::hidl_enum_values<Enum>.end(); }
};

/** @return a number, or a text in quotes, as the generated toString functions show it. */
template <typename T>
std::enable_if_t<std::is_arithmetic_v<T>, std::string> toString(T number) {
    return std::to_string(number);
}
inline std::string toString(const hidl_string& text) {
    return "\"" + std::string(text) + "\"";
}
template <typename T>
std::string toString(const hidl_vec<T>& list) {
    std::string text = "[" + std::to_string(list.size()) + "]{";
    for (size_t i = 0; i < list.size(); ++i)
        text += (i == 0 ? "" : ", ") + toString(list[i]);
    return text + "}";
}

}  // namespace android::hardware
