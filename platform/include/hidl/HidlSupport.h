// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <utils/RefBase.h>

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <initializer_list>
#include <string>
#include <utility>
#include <vector>

namespace android::hardware {

namespace details {
/** Marks the interface classes themselves. */
struct i_tag {};
}  // namespace details

/** Receives the news that a remote object has died; this transport sends none. */
class hidl_death_recipient : public virtual RefBase {};

/** Descriptors that travel with a call; none do on this transport. */
class hidl_handle {};

/** Text that crosses an interface. */
class hidl_string {
  public:
    hidl_string() = default;
    hidl_string(const char* text) : mText(text) {}  // NOLINT: implicit as published
    hidl_string(const char* text, size_t length) : mText(text, length) {}
    hidl_string(std::string text) : mText(std::move(text)) {}  // NOLINT: implicit as published

    const char* c_str() const { return mText.c_str(); }
    size_t size() const { return mText.size(); }
    bool empty() const { return mText.empty(); }
    operator std::string() const { return mText; }  // NOLINT: implicit as published

    bool operator==(const char* other) const { return mText == other; }
    bool operator==(const hidl_string& other) const { return mText == other.mText; }

  private:
    std::string mText;
};

/** Array of a fixed size that crosses an interface. */
template <typename T, size_t N>
struct hidl_array {
    T elements[N] = {};
};

/** List that crosses an interface: owns its elements or refers to somebody else's. */
template <typename T>
class hidl_vec {
  public:
    hidl_vec() = default;
    hidl_vec(std::initializer_list<T> list) { copyOf(list.begin(), list.size()); }
    hidl_vec(const std::vector<T>& other) {  // NOLINT: implicit as published
        copyOf(other.data(), other.size());
    }
    hidl_vec(const hidl_vec& other) { copyOf(other.mData, other.mSize); }
    hidl_vec(hidl_vec&& other) noexcept { swap(other); }
    ~hidl_vec() { release(); }

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
        release();
        mData = data;
        mSize = static_cast<uint32_t>(size);
        mOwns = shouldOwn;
    }

    /** Changes the number of elements, keeping as many as fit. */
    void resize(size_t size) {
        auto* data = new T[size]();
        std::copy_n(mData, std::min<size_t>(size, mSize), data);
        setToExternal(data, size, true);
    }

    T* data() { return mData; }
    const T* data() const { return mData; }
    size_t size() const { return mSize; }
    T& operator[](size_t index) { return mData[index]; }
    const T& operator[](size_t index) const { return mData[index]; }
    T* begin() { return mData; }
    T* end() { return mData + mSize; }
    const T* begin() const { return mData; }
    const T* end() const { return mData + mSize; }

    operator std::vector<T>() const { return {begin(), end()}; }  // NOLINT: implicit as published
    bool operator==(const hidl_vec& other) const {
        return std::equal(begin(), end(), other.begin(), other.end());
    }

  private:
    void copyOf(const T* data, size_t size) {
        if (size == 0) return;
        auto* copy = new T[size]();
        std::copy_n(data, size, copy);
        setToExternal(copy, size, true);
    }
    void release() {
        if (mOwns) delete[] mData;
    }
    void swap(hidl_vec& other) noexcept {
        std::swap(mData, other.mData);
        std::swap(mSize, other.mSize);
        std::swap(mOwns, other.mOwns);
    }

    T* mData = nullptr;
    uint32_t mSize = 0;
    bool mOwns = false;
};

}  // namespace android::hardware
