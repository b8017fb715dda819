// SPDX-License-Identifier: Apache-2.0
#include "commands/Commands.h"

int main(int argc, char** argv) {
    Client client;
    addCommands(client);
    return client.run(argc, argv);
}
