/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_KIT_H
#define PLATFORM_KIT_H

#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/* The host's system-information interface: one node is read from it. */

enum { KIT_NODE_net_maxPortsSystemWide = 1 };

HYP_ReturnStatus KIT_CheckSig(const char *signature, uint32_t version);
HYP_ReturnStatus KIT_Get(uint32_t node, const void *instanceArgs, void *value, uint32_t size);

#ifdef __cplusplus
}
#endif

#endif
