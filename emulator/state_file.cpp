/* SPDX-License-Identifier: Apache-2.0 */
// The emulator's state file: loaded at start, saved durably. A file that exists but cannot be loaded
// completely is never overwritten.

#include <cerrno>
#include <cstring>

#include <sys/stat.h>

#include "dvs/file.h"
#include "emulator/module.h"
#include "platform/status_text.h"

namespace dvs::emulator {

HYP_ReturnStatus Module::LoadState(std::string *why) {
    if (stateFile_.empty()) return HYP_OK;
    struct stat status {};
    // The file layer also returns "not found" for an unreadable file, which must not count as a new one.
    if (stat(stateFile_.c_str(), &status) != 0) {
        if (errno == ENOENT) return HYP_OK;
        *why = stateFile_ + ": " + std::strerror(errno);
        return HYP_READ_ERROR;
    }
    void *contents = nullptr;
    uint32_t size = 0;
    uint32_t alignOffset = 0;
    HYP_ReturnStatus result = DVSFile_Read(stateFile_.c_str(), &contents, &size, &alignOffset);
    if (result == HYP_OK) {
        const Block block(static_cast<char *>(contents) - alignOffset);
        result = DVSState_ConfigDeserialize(contents, size);
        sizeBound_ = size;
    }
    if (result != HYP_OK) *why = stateFile_ + ": " + HYP_ReturnStatusToString(result);
    return result;
}

HYP_ReturnStatus Module::SaveState() {
    if (stateFile_.empty()) return HYP_OK;
    void *serialized = nullptr;
    uint32_t size = 0;
    const HYP_ReturnStatus status = DVSState_ConfigSerialize(&serialized, &size);
    if (status != HYP_OK) return status;
    const Block state(serialized);
    counters_.saves++;
    return DVSFile_WriteDurable(stateFile_.c_str(), serialized, size);
}

} // namespace dvs::emulator
