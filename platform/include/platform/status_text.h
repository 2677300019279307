/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_STATUS_TEXT_H
#define PLATFORM_STATUS_TEXT_H

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The text of a status, for messages. Never NULL; the text is constant and lives as long as the process. A status
 * that the host does not know has a text of its own that says so.
 */
const char *HYP_ReturnStatusToString(HYP_ReturnStatus status);

#ifdef __cplusplus
}
#endif

#endif
