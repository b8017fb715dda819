// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <hwbinder/IBinder.h>
#include <utils/RefBase.h>

namespace android::hardware {

/** The part of a generated proxy that knows the remote object. */
class IInterface : public virtual RefBase {
  public:
    /** @return the remote object behind a proxy. */
    static IBinder* asBinder(const IInterface* proxy) { return proxy->mRemote.get(); }

  protected:
    explicit IInterface(const sp<IBinder>& remote) : mRemote(remote) {}

    IBinder* remote() const { return mRemote.get(); }

  private:
    const sp<IBinder> mRemote;
};

/** Base of the generated proxy of an interface. */
template <typename Interface>
class BpInterface : public Interface, public IInterface {
  public:
    explicit BpInterface(const sp<IBinder>& remote) : IInterface(remote) {}
};

}  // namespace android::hardware
