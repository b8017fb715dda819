// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <type_traits>

namespace android::hardware {

/**
 * An array that needs no memory from the heap while it is small. It can also refer to elements of
 * another owner, and then does not grow.
 */
template <typename T, size_t kInlineCapacity>
class InlineArray {
  public:
    static_assert(std::is_trivially_copyable_v<T>);

    // NOLINTNEXTLINE(modernize-use-equals-default): with that, {} would clear the elements.
    InlineArray() {}
    ~InlineArray() { freeHeap(); }
    InlineArray(const InlineArray&) = delete;
    InlineArray& operator=(const InlineArray&) = delete;

    const T* data() const { return mData; }
    size_t size() const { return mSize; }
    const T& operator[](size_t index) const { return mData[index]; }

    /** @return room for more elements at the end, uninitialised; nullptr without memory for it. */
    T* grow(size_t count) {
        const size_t start = mSize;
        if (count > mRoom && !reserve(count)) return nullptr;
        mRoom -= count;
        mSize += count;
        return mData + start;
    }
    /** Becomes what another owner has, who keeps it. */
    void refer(const T* data, size_t size) {
        freeHeap();
        // Never written to: there is no room in it.
        mData = const_cast<T*>(data);
        mSize = size;
        mRoom = 0;
    }
    void clear() {
        refer(mInline, 0);
        mRoom = kInlineCapacity;
    }

  private:
    void freeHeap() {
        if (mIsHeap) free(mData);
        mIsHeap = false;
    }
    bool reserve(size_t count) {
        constexpr size_t kMaxSize = SIZE_MAX / sizeof(T) / 2;
        const bool isAnothers = !mIsHeap && mData != mInline;
        if (isAnothers || count > kMaxSize || mSize > kMaxSize) return false;
        const size_t capacity = std::max(mSize + count, 2 * (mSize + mRoom));
        auto* larger = static_cast<T*>(realloc(mIsHeap ? mData : nullptr, capacity * sizeof(T)));
        if (larger == nullptr) return false;
        if (!mIsHeap) memcpy(larger, mInline, mSize * sizeof(T));
        mData = larger;
        mRoom = capacity - mSize;
        mIsHeap = true;
        return true;
    }

    // Left uninitialised: they are written before they are read.
    alignas(8) T mInline[kInlineCapacity];
    T* mData = mInline;
    size_t mSize = 0;
    /** How many more elements have a place. */
    size_t mRoom = kInlineCapacity;
    bool mIsHeap = false;
};

}  // namespace android::hardware
