/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_KIT_H
#define PLATFORM_KIT_H

#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The host's system-information interface, a tree of read-only values. The library reads one node, once, when
 * the first switch is added. Both functions are thread-safe.
 */

/* Nodes. Each is a number in the host's byte order; the comment gives its width. */
enum {
    KIT_NODE_net_maxPortsSystemWide = 1 /* 4 bytes: maximum switch ports of all kinds on this host */
};

/*
 * Checks that the host's interface is compatible with the caller. Called before the first KIT_Get.
 *
 * signature   the name of the interface that the caller expects; not NULL.
 * version     the interface's version; the library requests 21.
 *
 * HYP_OK; HYP_BAD_PARAM for a null signature; HYP_NOT_SUPPORTED for another version.
 * Embedded: accepts any signature.
 */
HYP_ReturnStatus KIT_CheckSig(const char *signature, uint32_t version);

/*
 * Reads one node.
 *
 * node           a KIT_NODE_… number.
 * instanceArgs   selects an instance of a node that has several; NULL for the nodes above.
 * value, size    output buffer and its size in bytes, which must equal the node's width. The buffer is
 *                untouched on failure.
 *
 * HYP_OK; HYP_NOT_FOUND: the host does not have the node. HYP_BAD_PARAM: a null value, another width, or a
 * host setting that is not a valid value of this node. Other failures are the host's own.
 *
 * Embedded: the port limit is the first that exists of: the number set with DVSHost_SetMaxPorts
 * (platform/embedded/host_limits.h); the emulator's answer, if one is configured; the environment variable
 * DVS_MAX_PORTS, a decimal number from 1 to 4294967295 without sign or spaces (ignored in a set-user-id
 * program); 65536. Each call looks it up again.
 */
HYP_ReturnStatus KIT_Get(uint32_t node, const void *instanceArgs, void *value, uint32_t size);

#ifdef __cplusplus
}
#endif

#endif
