/* SPDX-License-Identifier: Apache-2.0 */
// Texts of the statuses, as messages show them.

#include "platform/status_text.h"

extern "C" const char *HYP_ReturnStatusToString(HYP_ReturnStatus status) {
    switch (status) {
    case HYP_OK: return "Success";
    case HYP_FAILURE: return "Failure";
    case HYP_NOT_FOUND: return "Not found";
    case HYP_EXISTS: return "Already exists";
    case HYP_LIMIT_EXCEEDED: return "Limit exceeded";
    case HYP_BAD_PARAM: return "Bad parameter";
    case HYP_FILE_EMPTY: return "File is empty";
    case HYP_IO_ERROR: return "I/O error";
    case HYP_READ_ERROR: return "Read error";
    case HYP_WRITE_ERROR: return "Write error";
    case HYP_NO_MEMORY: return "Out of memory";
    case HYP_NOT_SUPPORTED: return "Not supported";
    case HYP_BAD_CHECKSUM: return "Bad checksum";
    default: return "Unknown status";
    }
}
