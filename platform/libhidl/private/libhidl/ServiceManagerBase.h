// SPDX-License-Identifier: Apache-2.0
#pragma once

#include <android/hidl/manager/1.2/IServiceManager.h>

#include <string>
#include <utility>
#include <vector>

namespace android::hardware {

/** What both service managers of this platform answer in the same way. */
class ServiceManagerBase : public ::android::hidl::manager::V1_2::IServiceManager {
  public:
    using IBase = ::android::hidl::base::V1_0::IBase;
    using IClientCallback = ::android::hidl::manager::V1_2::IClientCallback;
    using IServiceNotification = ::android::hidl::manager::V1_0::IServiceNotification;

    /** Adds a service under the names of the interfaces that it says it has. */
    Return<bool> add(const hidl_string& name, const sp<IBase>& service) override {
        if (service == nullptr) return false;
        bool success = false;
        const Return<void> result = service->interfaceChain(
                [&](const auto& chain) { success = addWithChain(name, service, chain); });
        return result.isOk() && success;
    }
    Return<void> list(list_cb callback) override {
        std::vector<hidl_string> names;
        for (const InstanceDebugInfo& each : services())
            names.emplace_back(std::string(each.interfaceName) + "/" +
                               std::string(each.instanceName));
        callback(names);
        return Void();
    }
    Return<void> listByInterface(const hidl_string& interface,
                                 listByInterface_cb callback) override {
        std::vector<hidl_string> instances;
        for (const InstanceDebugInfo& each : services()) {
            if (each.interfaceName == interface) instances.push_back(each.instanceName);
        }
        callback(instances);
        return Void();
    }
    Return<void> debugDump(debugDump_cb callback) override {
        callback(services());
        return Void();
    }
    /**
     * There is no list of declared services, so every service may still come, and then over this: a
     * device's clients do not wait for one that has no transport.
     */
    Return<Transport> getTransport(const hidl_string&, const hidl_string&) override {
        return Transport::HWBINDER;
    }
    Return<void> registerPassthroughClient(const hidl_string&, const hidl_string&) override {
        return Void();
    }
    Return<bool> registerClientCallback(const hidl_string&, const hidl_string&, const sp<IBase>&,
                                        const sp<IClientCallback>&) override {
        return false;
    }
    Return<bool> unregisterClientCallback(const sp<IBase>&, const sp<IClientCallback>&) override {
        return false;
    }
    Return<void> listManifestByInterface(const hidl_string& interface,
                                         listManifestByInterface_cb callback) override {
        return listByInterface(interface, callback);
    }

  protected:
    /** An interface and an instance. */
    using Name = std::pair<std::string, std::string>;

    /** @return what is known of each service, once for each of its names. */
    virtual std::vector<InstanceDebugInfo> services() = 0;
};

}  // namespace android::hardware
