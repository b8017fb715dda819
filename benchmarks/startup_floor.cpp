// SPDX-License-Identifier: Apache-2.0

/**
 * What the daemon does from its start to its first answer, by bare system calls: it writes as many
 * log lines, probes the same nodes, publishes a socket and its lock, and answers one message.
 *
 * usage: startup-floor SOCKET
 */
#include <fcntl.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

#include <cstdio>
#include <cstring>

int main(int /* argc */, char** arguments) {
    const char line[] =
            "D/QorVibrator-HAL2.1(12345): a line of about the usual length of the log\n";
    for (int i = 0; i < 20; ++i) {
        if (write(STDERR_FILENO, line, sizeof(line) - 1) < 0) return 1;
    }
    open("/sys/class/timed_output/vibrator/enable", O_RDWR | O_CLOEXEC);
    open("/sys/class/leds/vibrator/activate", O_RDWR | O_CLOEXEC);

    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    char lock[sizeof(address.sun_path) + 8];
    snprintf(address.sun_path, sizeof(address.sun_path), "%s~", arguments[1]);
    snprintf(lock, sizeof(lock), "%s.lock", arguments[1]);
    flock(open(lock, O_RDWR | O_CREAT | O_CLOEXEC, 0600), LOCK_EX | LOCK_NB);
    unlink(address.sun_path);
    const int listener = socket(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0);
    if (bind(listener, reinterpret_cast<const sockaddr*>(&address), sizeof(address)) != 0 ||
        listen(listener, 1) != 0 || rename(address.sun_path, arguments[1]) != 0) {
        return 1;
    }
    const int client = accept(listener, nullptr, nullptr);
    char message[64];
    const ssize_t size = recv(client, message, sizeof(message), 0);
    return size > 0 && send(client, message, static_cast<size_t>(size), 0) == size ? 0 : 1;
}
