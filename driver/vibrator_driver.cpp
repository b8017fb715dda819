// SPDX-License-Identifier: Apache-2.0
#include "Device.h"
#include "cli/CommandLine.h"
#include "text/Text.h"

#include <iostream>

namespace {

class VibratorDriver : public cli::Program {
  public:
    VibratorDriver()
        : Program("vibrator-driver", VERSION,
                  "Offers a force-feedback motor, of a phone or a game controller, to the service "
                  "as a vibrator driver of the kernel's would be.") {
        shared().note(
                "Exit code: 0 done; 1 failed; 2 a mistake in the command line; run: that of its "
                "command.");
        addList();
    }

  private:
    void addList() {
        command("A motor", "list", "list the motors of this machine and what they can do", "")
                .run([this] {
                    const std::vector<driver::Device> devices = driver::listDevices();
                    for (const driver::Device& device : devices) {
                        std::cout << device.path << "  " << cli::printable(device.name) << ": "
                                  << device.inWords() << '\n';
                    }
                    if (devices.empty()) warn("list: this machine has no force-feedback motor");
                    return cli::kSuccess;
                });
    }
};

}  // namespace

int main(int argc, char** argv) {
    return VibratorDriver().run(argc, argv);
}
