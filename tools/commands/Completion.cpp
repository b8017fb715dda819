// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

void addCompletion(Client& client) {
    client.program().addCompletion(kTools);
}
