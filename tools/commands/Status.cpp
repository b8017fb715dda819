// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

#include <chrono>
#include <thread>

namespace {

/** @return the service, waited for up to some seconds. @throw Unreachable */
::android::sp<service::IDaxVibrator> await(const Client& client, uint32_t seconds) {
    using Clock = std::chrono::steady_clock;
    const auto deadline = Clock::now() + std::chrono::seconds(seconds);
    for (;;) {
        try {
            return client.service();
        } catch (const Unreachable&) {
            if (Clock::now() >= deadline) throw;
        }
        std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
}

}  // namespace

void addStatus(Client& client) {
    constexpr cli::Numbers kWaits = {"a time in s", 0, 3600};
    cli::Command& command = client.program().command(
            kForAll, "status", "tell whether the service answers, and what it is", "--wait 10");
    const auto wait =
            command.number("--wait SECONDS", kWaits, "how long to wait for the service", 0);
    command.run([&client, wait] {
        const auto vibrator = await(client, *wait);
        const service::Description description = service::describe(vibrator);
        std::vector<std::string> interfaces;
        Client::reached(vibrator->interfaceChain([&](const auto& chain) {
            for (const auto& descriptor : chain)
                interfaces.emplace_back(descriptor.c_str());
        }));
        std::string words = "service:    " + client.instance() + ", answers\n" +
                            "served by:  " + description.server + "\n" +
                            "transport:  " + description.transport + "\n" +
                            "manager:    " + description.manager + "\n" + "interfaces:";
        for (const std::string& interface : interfaces)
            words += (interface == interfaces[0] ? " " : "            ") + interface + "\n";
        return client.report().found("status", words,
                                     {{"instance", client.instance()},
                                      {"answers", true},
                                      {"server", description.server},
                                      {"transport", description.transport},
                                      {"manager", description.manager},
                                      {"interfaces", interfaces}});
    });
}
