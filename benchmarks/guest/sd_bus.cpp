// SPDX-License-Identifier: Apache-2.0

/** Calls over sd-bus, peer to peer: one without arguments, and one with a number each way. */
#include "../../tests/support/Child.h"
#include "RoundTrip.h"

#include <sys/socket.h>
#include <systemd/sd-bus.h>

#include <cstdlib>

namespace {

constexpr char kPath[] = "/vibrator";
constexpr char kInterface[] = "vibrator.IVibrator";

int ping(sd_bus_message* message, void* /* data */, sd_bus_error* /* error */) {
    return sd_bus_reply_method_return(message, nullptr);
}

int on(sd_bus_message* message, void* /* data */, sd_bus_error* /* error */) {
    uint32_t timeoutMs = 0;
    const int result = sd_bus_message_read(message, "u", &timeoutMs);
    return result < 0 ? result : sd_bus_reply_method_return(message, "u", timeoutMs % 4);
}

[[noreturn]] void serve(int socket) {
    const sd_bus_vtable operations[] = {SD_BUS_VTABLE_START(0),
                                        SD_BUS_METHOD("Ping", nullptr, nullptr, ping, 0),
                                        SD_BUS_METHOD("On", "u", "u", on, 0), SD_BUS_VTABLE_END};
    sd_bus* bus = nullptr;
    sd_id128_t id;
    if (sd_id128_randomize(&id) < 0 || sd_bus_new(&bus) < 0 ||
        sd_bus_set_fd(bus, socket, socket) < 0 || sd_bus_set_server(bus, 1, id) < 0 ||
        sd_bus_start(bus) < 0 ||
        sd_bus_add_object_vtable(bus, nullptr, kPath, kInterface, operations, nullptr) < 0) {
        _exit(1);
    }
    for (;;) {
        const int result = sd_bus_process(bus, nullptr);
        if (result < 0) _exit(1);
        if (result == 0) sd_bus_wait(bus, UINT64_MAX);
    }
}

}  // namespace

int main() {
    int sockets[2];
    if (socketpair(AF_UNIX, SOCK_STREAM, 0, sockets) != 0) abort();
    const Child server([&] { serve(sockets[1]); });
    sd_bus* bus = nullptr;
    if (sd_bus_new(&bus) < 0 || sd_bus_set_fd(bus, sockets[0], sockets[0]) < 0 ||
        sd_bus_start(bus) < 0) {
        abort();
    }
    measure("sd-bus, ping", [&] {
        sd_bus_message* reply = nullptr;
        if (sd_bus_call_method(bus, nullptr, kPath, kInterface, "Ping", nullptr, &reply, "") < 0)
            abort();
        sd_bus_message_unref(reply);
    });
    measure("sd-bus, call", [&] {
        sd_bus_message* reply = nullptr;
        uint32_t status = 0;
        if (sd_bus_call_method(bus, nullptr, kPath, kInterface, "On", nullptr, &reply, "u", 6) <
                    0 ||
            sd_bus_message_read(reply, "u", &status) < 0 || status != 2) {
            abort();
        }
        sd_bus_message_unref(reply);
    });
    sd_bus_close_unref(bus);
    return 0;
}
