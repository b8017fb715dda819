// SPDX-License-Identifier: Apache-2.0

/** The least that a call takes over each of the two transports: a message in each direction. */
#include "../../tests/support/Child.h"
#include "RoundTrip.h"

#include <fcntl.h>
#include <linux/android/binder.h>
#include <sys/epoll.h>
#include <sys/ioctl.h>
#include <sys/mman.h>
#include <sys/socket.h>

#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>

namespace {

/** The sizes of a call's request and reply parcels, in bytes. */
struct Sizes {
    const char* call;
    size_t request;
    size_t reply;
};
/** As in guest-ping: a ping's token and status; a call has two more numbers, its reply one. */
constexpr Sizes kSizes[] = {{"ping", 32, 4}, {"call", 52, 12}};
constexpr size_t kMaxSize = 128;

/** @return the size of a parcel's packet: with a header, both padded to a multiple of 8. */
constexpr size_t packetSize(size_t parcel) {
    return 16 + (parcel + 7) / 8 * 8;
}

/** A server of one client, whose identity it does not check. */
[[noreturn]] void echo(int socket, size_t reply) {
    char message[kMaxSize];
    while (recv(socket, message, sizeof(message), 0) > 0) {
        if (send(socket, message, reply, 0) < 0) _exit(1);
    }
    _exit(0);
}

/** A server for several clients, which gets the sender of each message from the kernel. */
[[noreturn]] void echoToAnybody(int socket, size_t reply) {
    const int on = 1;
    setsockopt(socket, SOL_SOCKET, SO_PASSCRED, &on, sizeof(on));
    const int all = epoll_create1(0);
    epoll_event event{};
    event.events = EPOLLIN;
    epoll_ctl(all, EPOLL_CTL_ADD, socket, &event);
    char message[kMaxSize];
    alignas(cmsghdr) char control[CMSG_SPACE(sizeof(ucred))];
    for (;;) {
        iovec place{message, sizeof(message)};
        msghdr request{};
        request.msg_iov = &place;
        request.msg_iovlen = 1;
        request.msg_control = control;
        request.msg_controllen = sizeof(control);
        if (epoll_wait(all, &event, 1, -1) != 1 || recvmsg(socket, &request, MSG_DONTWAIT) <= 0 ||
            send(socket, message, reply, MSG_DONTWAIT) < 0) {
            _exit(1);
        }
    }
}

void echoOverSocket(const char* server, void (*serve)(int socket, size_t reply),
                    const Sizes& sizes) {
    const size_t request = packetSize(sizes.request);
    const size_t reply = packetSize(sizes.reply);
    int sockets[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET, 0, sockets) != 0) abort();
    const Child child([&] { serve(sockets[1], reply); });
    char message[kMaxSize] = {};
    measure((std::string(server) + ", " + sizes.call).c_str(), [&] {
        if (send(sockets[0], message, request, 0) != static_cast<ssize_t>(request) ||
            recv(sockets[0], message, sizeof(message), 0) != static_cast<ssize_t>(reply)) {
            abort();
        }
    });
    close(sockets[0]);
    close(sockets[1]);
}

/** A process's use of the driver: one buffer of commands out, one in. */
class Binder {
  public:
    // Another device than the service manager's.
    Binder() : mDevice(open("/dev/binder", O_RDWR | O_CLOEXEC)) {
        if (mDevice < 0 || mmap(nullptr, 1 << 20, PROT_READ, MAP_PRIVATE, mDevice, 0) == MAP_FAILED)
            abort();
    }
    void becomeManager() {
        // The kernel may still be busy with the previous one.
        while (ioctl(mDevice, BINDER_SET_CONTEXT_MGR, 0) != 0) {
            if (errno != EBUSY) abort();
            usleep(1000);
        }
        add(BC_ENTER_LOOPER, nullptr, 0);
    }
    /** Adds a request to object 0, or a reply, to the commands. */
    void addMessage(uint32_t command, const void* data, size_t size) {
        binder_transaction_data message{};
        message.data_size = size;
        message.data.ptr.buffer = reinterpret_cast<binder_uintptr_t>(data);
        add(command, &message, sizeof(message));
    }
    /** Sends the commands and waits until a message comes, whose buffer then goes back. */
    void exchange(uint32_t awaited) {
        for (bool arrived = false; !arrived;) {
            alignas(8) char in[256];
            binder_write_read io{};
            io.write_size = mSize;
            io.write_buffer = reinterpret_cast<binder_uintptr_t>(mCommands);
            io.read_size = sizeof(in);
            io.read_buffer = reinterpret_cast<binder_uintptr_t>(in);
            if (ioctl(mDevice, BINDER_WRITE_READ, &io) != 0) abort();
            mSize = 0;
            for (size_t at = 0; at < io.read_consumed;) {
                uint32_t command = 0;
                memcpy(&command, in + at, sizeof(command));
                at += sizeof(command);
                if (command == awaited) {
                    binder_transaction_data message;
                    memcpy(&message, in + at, sizeof(message));
                    add(BC_FREE_BUFFER, &message.data.ptr.buffer, sizeof(binder_uintptr_t));
                    arrived = true;
                } else if (command == BR_FAILED_REPLY || command == BR_DEAD_REPLY) {
                    abort();
                }
                at += _IOC_SIZE(command);
            }
        }
    }

  private:
    void add(uint32_t command, const void* data, size_t size) {
        memcpy(mCommands + mSize, &command, sizeof(command));
        if (size > 0) memcpy(mCommands + mSize + sizeof(command), data, size);
        mSize += sizeof(command) + size;
    }

    int mDevice;
    char mCommands[256];
    size_t mSize = 0;
};

void echoOverBinder(const Sizes& sizes) {
    int ready[2];
    if (pipe(ready) != 0) abort();
    const Child echo([&] {
        Binder binder;
        binder.becomeManager();
        if (write(ready[1], "", 1) != 1) abort();
        const char message[kMaxSize] = {};
        for (;;) {
            binder.exchange(BR_TRANSACTION);
            binder.addMessage(BC_REPLY, message, sizes.reply);
        }
    });
    char byte = 0;
    if (read(ready[0], &byte, 1) != 1) abort();
    Binder binder;
    const char message[kMaxSize] = {};
    measure((std::string("bare binder echo, ") + sizes.call).c_str(), [&] {
        binder.addMessage(BC_TRANSACTION, message, sizes.request);
        binder.exchange(BR_REPLY);
    });
}

}  // namespace

int main() {
    for (const Sizes& sizes : kSizes) {
        echoOverSocket("bare SOCK_SEQPACKET echo", echo, sizes);
        echoOverSocket("the same to anybody, by name", echoToAnybody, sizes);
        echoOverBinder(sizes);
    }
    return 0;
}
