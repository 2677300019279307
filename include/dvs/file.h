/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_FILE_H
#define DVS_FILE_H

#include <stdbool.h>
#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

HYP_ReturnStatus DVSFile_WriteClassical(const char *path, const void *buf, uint32_t len, bool viaTemp);
HYP_ReturnStatus DVSFile_Write(const char *path, const void *buf, uint32_t len);
HYP_ReturnStatus DVSFile_ReadClassical(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset);
HYP_ReturnStatus DVSFile_Read(const char *path, void **buf, uint32_t *len, uint32_t *alignOffset);
HYP_ReturnStatus DVSFile_WriteDurable(const char *path, const void *buf, uint32_t len);   /* addition: survives power loss, see design.md */

#ifdef __cplusplus
}
#endif

#endif
