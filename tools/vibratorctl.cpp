// SPDX-License-Identifier: Apache-2.0
#include "commands/Commands.h"

int main(int argc, char** argv) {
    Client client;
#define ADD(name) add##name(client);
    VIBRATORCTL_COMMANDS(ADD)
#undef ADD
    return client.run(argc, argv);
}
