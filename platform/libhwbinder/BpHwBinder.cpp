// SPDX-License-Identifier: Apache-2.0
#include "Driver.h"

#include <hwbinder/BpHwBinder.h>
#include <hwbinder/Parcel.h>
#include <hwbinder/ProcessState.h>

#include <algorithm>

namespace android::hardware {

BpHwBinder::BpHwBinder(uint32_t handle)
    : mDriver(ProcessState::self()->driver()), mHandle(handle), mLink(mDriver.acquire(handle)) {}

BpHwBinder::~BpHwBinder() {
    const bool isLast = ProcessState::self()->expungeHandle(mHandle, this);
    // If the handle has another proxy by now, that one takes the notice over.
    if (isLast && !mRecipients.empty()) mDriver.clearDeathNotice(mHandle);
    mDriver.release(mHandle);
}

status_t BpHwBinder::transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags,
                              TransactCallback /* callback */) {
    const status_t status = mDriver.transact(mHandle, mLink, code, data, reply, flags);
    if (status == DEAD_OBJECT) {
        const std::lock_guard<std::mutex> lock(mMutex);
        mAlive = false;
    }
    return status;
}

status_t BpHwBinder::linkToDeath(const sp<DeathRecipient>& recipient) {
    const std::lock_guard<std::mutex> lock(mMutex);
    if (!mAlive) return DEAD_OBJECT;
    if (mRecipients.empty()) {
        const status_t status = mDriver.requestDeathNotice(mHandle);
        if (status != OK) return status;
    }
    mRecipients.push_back(recipient);
    return OK;
}

status_t BpHwBinder::unlinkToDeath(const sp<DeathRecipient>& recipient) {
    const std::lock_guard<std::mutex> lock(mMutex);
    const auto found = std::find(mRecipients.begin(), mRecipients.end(), recipient);
    if (found == mRecipients.end()) return NAME_NOT_FOUND;
    mRecipients.erase(found);
    if (mRecipients.empty()) mDriver.clearDeathNotice(mHandle);
    return OK;
}

void BpHwBinder::sendObituary() {
    std::vector<sp<DeathRecipient>> recipients;
    {
        const std::lock_guard<std::mutex> lock(mMutex);
        mAlive = false;
        recipients.swap(mRecipients);
    }
    for (const sp<DeathRecipient>& recipient : recipients)
        recipient->binderDied(this);
}

}  // namespace android::hardware
