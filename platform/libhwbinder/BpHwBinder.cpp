// SPDX-License-Identifier: Apache-2.0
#include "libhwbinder/Driver.h"

#include <hwbinder/BpHwBinder.h>
#include <hwbinder/Parcel.h>
#include <hwbinder/ProcessState.h>

#include <algorithm>

namespace android::hardware {

BpHwBinder::BpHwBinder(uint32_t handle)
    : mHandle(handle), mRemote(ProcessState::self()->driver().open(handle)) {}

BpHwBinder::~BpHwBinder() {
    const bool isLast = ProcessState::self()->expungeHandle(mHandle, this);
    // If the handle has another proxy by now, that one takes the notice over.
    if (isLast && !mRecipients.empty()) mRemote->clearDeathNotice();
}

status_t BpHwBinder::transact(uint32_t code, const Parcel& data, Parcel* reply, uint32_t flags,
                              TransactCallback /* callback */) {
    if (mRemote == nullptr) return DEAD_OBJECT;
    const status_t status = mRemote->transact(code, data, reply, flags);
    if (status == DEAD_OBJECT) {
        const std::lock_guard<std::mutex> lock(mMutex);
        mAlive = false;
    }
    return status;
}

status_t BpHwBinder::linkToDeath(const sp<DeathRecipient>& recipient) {
    const std::lock_guard<std::mutex> lock(mMutex);
    if (!mAlive || mRemote == nullptr) return DEAD_OBJECT;
    if (mRecipients.empty()) {
        const status_t status = mRemote->requestDeathNotice();
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
    if (mRecipients.empty()) mRemote->clearDeathNotice();
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
