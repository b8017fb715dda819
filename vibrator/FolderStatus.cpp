// SPDX-License-Identifier: Apache-2.0
#include "FolderStatus.h"

#include "Log.h"
#include "NodePathTable.h"
#include "TextNode.h"
#include "Vibrator.h"

#include <cerrno>
#include <cstring>

namespace vendor::velmora::hardware::vibrator::V2_1::implementation {

Return<bool> Vibrator::daxSupportsFolderStatusSetting() {
    LOG_DEBUG("daxSupportsFolderStatusSetting starts");
    if (checkCallerPermission() != kCallerPermitted) return false;

    char text[kFolderTextSize + 1];
    if (!readTextNode("daxSupportsFolderStatusSetting", THE_DEVICE_EVENT_CMD, NodeMode::kReadWrite,
                      text, sizeof(text))) {
        return false;
    }
    LOG_DEBUG("daxSupportsFolderStatusSetting string : %s ", text);
    LOG_DEBUG("daxSupportsFolderStatusSetting string len : %lu ",
              static_cast<unsigned long>(strlen(text)));
    const bool supports = takesFolderStatus(text);
    LOG_DEBUG(supports ? "daxSupportsFolderStatusSetting TRUE"
                       : "daxSupportsFolderStatusSetting FALSE");
    return supports;
}

Return<Status> Vibrator::daxSetFolderStatus(DaxFolderStatus status) {
    LOG_DEBUG("daxSetFolderStatus starts");
    if (checkCallerPermission() != kCallerPermitted) return Status::UNKNOWN_ERROR;
    if (status > DaxFolderStatus::FOLDER_CLOSE) {
        LOG_DEBUG("daxSetFolderStatus BAD_VALUE");
        return Status::BAD_VALUE;
    }

    const std::string& command =
            status == DaxFolderStatus::FOLDER_OPEN ? FOLDER_OPEN_COMMAND : FOLDER_CLOSE_COMMAND;
    const auto length = static_cast<int>(command.size());
    LOG_DEBUG("%s", command.c_str());
    LOG_DEBUG("length : %d", length);
    const auto written = writeTextNode(THE_DEVICE_EVENT_CMD, command.c_str(), command.size());
    if (!written) {
        LOG_ERROR("daxSetFolderStatus is fail: %d", errno);
        return Status::UNKNOWN_ERROR;
    }
    LOG_DEBUG("ret : %d", static_cast<int>(*written));
    if (*written != length) {
        LOG_DEBUG("daxSetFolderStatus error");
        return Status::UNKNOWN_ERROR;
    }
    LOG_DEBUG("daxSetFolderStatus end");
    return Status::OK;
}

}  // namespace vendor::velmora::hardware::vibrator::V2_1::implementation
