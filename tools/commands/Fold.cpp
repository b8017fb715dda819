// SPDX-License-Identifier: Apache-2.0
#include "Commands.h"

void addFold(Client& client) {
    using ::vendor::velmora::hardware::vibrator::V2_0::DaxFolderStatus;
    cli::Command& fold = client.program().command(
            kRestricted, "fold", "tell the driver that the device is open or folded", "close");
    const auto state = fold.choice(
            "STATE", {{"open", "the device is open"}, {"close", "the device is folded"}},
            "the device's state");
    fold.run([&client, state] {
        const bool isOpen = *state == 0;
        return client.answer(
                {"fold", "daxSetFolderStatus", true, isOpen ? "open" : "close"},
                client.service()->daxSetFolderStatus(isOpen ? DaxFolderStatus::FOLDER_OPEN
                                                            : DaxFolderStatus::FOLDER_CLOSE));
    });
}
