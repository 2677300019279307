/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_KIT_H
#define PLATFORM_KIT_H

#include <stdint.h>

#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The host's system-information interface, a tree of read-only values. The library reads one node of it, once, when
 * the first switch is added. Both functions may be called from several threads at once.
 */

/* Nodes. Each is a number in the host's byte order, of the width its comment gives. */
enum {
    KIT_NODE_net_maxPortsSystemWide = 1 /* 4 bytes: how many switch ports of all kinds this host allows */
};

/*
 * Checks that the host's interface is the one the caller was written for. Called before the first KIT_Get.
 *
 * signature   what the caller believes to talk to, as text; not NULL.
 * version     the interface's version; the library asks for 21.
 *
 * HYP_OK; HYP_BAD_PARAM for a missing signature; HYP_NOT_SUPPORTED for another version.
 * Embedded: any signature will do, there is nothing else to be mistaken for.
 */
HYP_ReturnStatus KIT_CheckSig(const char *signature, uint32_t version);

/*
 * Reads one node.
 *
 * node           a KIT_NODE_… number.
 * instanceArgs   which instance of a node that has several; NULL for those above.
 * value, size    where the value goes, and the width of it in bytes, which is exactly the node's. On failure the
 *                value is untouched.
 *
 * HYP_OK; HYP_NOT_FOUND for a node that the host does not have; HYP_BAD_PARAM for a missing value, another width or
 * a setting of the host that is not a value of this node; a failure of the host's own otherwise.
 *
 * Embedded: the port limit is the first of these that there is: the number set with DVSHost_SetMaxPorts
 * (platform/embedded/host_limits.h); the answer of the emulator, when one is configured; the environment variable
 * DVS_MAX_PORTS, a decimal number from 1 to 4294967295 without sign or blanks (ignored in a set-user-id program);
 * 65536. Each is looked up anew on every call.
 */
HYP_ReturnStatus KIT_Get(uint32_t node, const void *instanceArgs, void *value, uint32_t size);

#ifdef __cplusplus
}
#endif

#endif
