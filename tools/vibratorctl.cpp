// SPDX-License-Identifier: Apache-2.0
#include "commands/Commands.h"

int main(int argc, char** argv) {
    vibratorctl::Client client;
    vibratorctl::addCommands(client);
    return client.run(argc, argv);
}
