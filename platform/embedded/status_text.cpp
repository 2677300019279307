/* SPDX-License-Identifier: Apache-2.0 */
// Texts of the statuses, as messages show them (platform/status_text.h).

#include "platform/status_text.h"

namespace {

struct StatusText {
    HYP_ReturnStatus status;
    const char *text;
};

// clang-format off
constexpr StatusText kTexts[] = {
    {HYP_OK,             "Success"},
    {HYP_FAILURE,        "Failure"},
    {HYP_NOT_FOUND,      "Not found"},
    {HYP_EXISTS,         "Already exists"},
    {HYP_LIMIT_EXCEEDED, "Limit exceeded"},
    {HYP_BAD_PARAM,      "Bad parameter"},
    {HYP_FILE_EMPTY,     "File is empty"},
    {HYP_IO_ERROR,       "I/O error"},
    {HYP_READ_ERROR,     "Read error"},
    {HYP_WRITE_ERROR,    "Write error"},
    {HYP_NO_MEMORY,      "Out of memory"},
    {HYP_NOT_SUPPORTED,  "Not supported"},
    {HYP_BAD_CHECKSUM,   "Bad checksum"},
};
// clang-format on

} // namespace

extern "C" const char *HYP_ReturnStatusToString(HYP_ReturnStatus status) {
    for (const StatusText &row : kTexts) {
        if (row.status == status) return row.text;
    }
    return "Unknown status";
}
