/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_HOST_LIMITS_H
#define PLATFORM_EMBEDDED_HOST_LIMITS_H

// What a program sets for the embedded host. For programs and tests; nothing in the library includes it.

#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Sets the number of ports that KIT_Get answers for this process, before any other source of it; 0 takes the
 * setting back. The library reads the limit once, at the first switch, so this comes before that. Safe in any
 * thread.
 */
void DVSHost_SetMaxPorts(uint32_t ports);

/* The number set above; 0 when there is none. */
uint32_t DVSHost_MaxPorts(void);

#ifdef __cplusplus
}
#endif

#endif
