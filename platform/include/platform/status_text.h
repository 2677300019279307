/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_STATUS_TEXT_H
#define PLATFORM_STATUS_TEXT_H

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The text of a status, for messages. Never NULL; constant, valid as long as the process. An unknown status
 * has its own text that says so.
 */
const char *HYP_ReturnStatusToString(HYP_ReturnStatus status);

#ifdef __cplusplus
}
#endif

#endif
