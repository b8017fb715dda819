// SPDX-License-Identifier: Apache-2.0
#include "Faults.h"

#include <cstring>
#include <filesystem>
#include <fstream>

namespace simulator {
namespace {

std::string faultFile(const std::string& directory, const std::string& leaf,
                      const std::string& operation) {
    return directory + "/faults/" + leaf + "." + operation;
}

}  // namespace

std::optional<Fault> parseFault(const std::string& text) {
    constexpr char kShort[] = "short=";
    Fault fault;
    if (text.compare(0, strlen(kShort), kShort) == 0) {
        const std::string number = text.substr(strlen(kShort));
        if (number.empty() || number.size() > 6 ||
            number.find_first_not_of("0123456789") != std::string::npos) {
            return std::nullopt;
        }
        fault.bytes = std::stoul(number);
        return fault;
    }
    constexpr int kLargestErrno = 133;
    for (fault.error = 1; fault.error <= kLargestErrno; ++fault.error) {
        const char* name = strerrorname_np(fault.error);
        if (name != nullptr && text == name) return fault;
    }
    return std::nullopt;
}

bool setFault(const std::string& directory, const std::string& leaf, const std::string& operation,
              const std::optional<Fault>& fault) {
    const std::string path = faultFile(directory, leaf, operation);
    if (!fault) {
        std::error_code error;
        std::filesystem::remove(path, error);
        return !error;
    }
    std::ofstream file(path, std::ios::trunc);
    file << fault->error << ' ' << fault->bytes << ' ' << fault->times << ' ' << fault->after
         << '\n';
    return static_cast<bool>(file.flush());
}

std::optional<Fault> takeFault(const std::string& directory, const std::string& leaf,
                               const std::string& operation) {
    Fault fault;
    std::ifstream file(faultFile(directory, leaf, operation));
    if (!(file >> fault.error >> fault.bytes >> fault.times >> fault.after)) return std::nullopt;
    if (fault.after > 0) {
        --fault.after;
        setFault(directory, leaf, operation, fault);
        return std::nullopt;
    }
    if (fault.times > 0) {
        Fault left = fault;
        --left.times;
        setFault(directory, leaf, operation, left.times > 0 ? std::optional(left) : std::nullopt);
    }
    return fault;
}

}  // namespace simulator
