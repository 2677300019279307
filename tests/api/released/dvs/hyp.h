/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_HYP_H
#define DVS_HYP_H

#include <stdbool.h>
#include <stdint.h>

#include "dvs/data.h"
#include "dvs/state.h"
#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The kernel interface: numbered commands to the hypervisor kernel's switching module, sent through its
 * character device in one fixed record; the fetch of whole states; filters and queries over what comes back.
 *
 * What holds for every function here:
 *
 * Arguments  Texts end in NUL and are cut to their field: switch name 63 characters, port id 47, property
 *            and class name 127, command text 127. Lengths are bytes. None of the pointers may be null
 *            unless it is said.
 * Outputs    `out` receives a buffer, `outLen` its size in bytes. Buffers are released with DVSHYP_DataFree,
 *            property lists with DVSData_Free. Commands that fetch a reply set *out to null when they do not
 *            succeed, and *outLen to the length the module last named (untouched when the device cannot be
 *            opened; 0 when the module claims more bytes than the buffer holds). Other functions leave their
 *            outputs alone on failure.
 * Statuses   HYP_FAILURE: the device cannot be opened, or the module failed the command without giving a
 *            status, or it claimed more bytes than the buffer holds. HYP_NO_MEMORY: a buffer could not be
 *            allocated. Anything else is the module's own answer: HYP_NOT_FOUND for an absent switch, port
 *            or property, HYP_EXISTS for a duplicate, HYP_LIMIT_EXCEEDED, HYP_BAD_PARAM, HYP_NOT_SUPPORTED
 *            for a version or command it does not know.
 * Messages   Go to standard error, whatever the debug levels: "failed to open dvsdev device %s\n" when the
 *            device cannot be opened; "ioctl failed: %s\n" when a plain call fails with another errno than
 *            ENOENT.
 * Locks      Plain commands take none and may be called from several threads. Functions that use the switch
 *            table as scratch say so: they hold "dvshyp" (DVSwitchHYPLock) from loading the table to
 *            resetting it, and leave the table empty on every path. "dvshyp" is taken before the
 *            switch-state lock.
 */

/*
 * The request record, packed, host byte order. A sender zeroes it and fills what its command uses; the
 * request number of the ioctl is the command's number.
 */
typedef struct __attribute__((packed)) DVSHYPRequest {
    char switchName[64]; /*   0 switch name */
    char portId[48];     /*  64 port id */
    char propName[128];  /* 112 property name; class of a switch add; decimal number of an uplink */
    uint32_t maxPorts;   /* 240 port limit of a switch */
    uint32_t version;    /* 244 switch version number */
    uint32_t propType;   /* 248 type word of a value being set */
    uint32_t reserved;   /* 252 always 0 */
    uint32_t status;     /* 256 HYP_FAILURE going in; written by the module when it fails the call */
    uint32_t dataLen;    /* 260 size of the value at `data`; fetch: capacity in, size needed or got out */
    uint64_t data;       /* 264 address of the value or of the receive buffer */
    char cmd[128];       /* 272 command text (DVSHYP_CmdExec) */
    uint32_t cmdInLen;   /* 400 size of the command's input */
    uint64_t cmdIn;      /* 404 address of the command's input; the one field off its natural boundary */
    uint32_t cmdOutLen;  /* 412 capacity of the reply buffer in, size needed or returned out */
    uint64_t cmdOut;     /* 416 address of the reply buffer */
} DVSHYPRequest;

/* What DVSHYP_PortGetByExternalId finds; 176 bytes. */
typedef struct {
    char portId[48];      /*  0 id of the matching port; empty when none matched */
    char externalId[128]; /* 48 the external id that was asked for */
} DVSHYPExternalIdResult;

/* One port of a port list; 52 bytes. */
typedef struct {
    char portId[48];       /*  0 port id */
    uint32_t connectionId; /* 48 first word of "com.orbeno.common.port.connectid"; 0 when absent or shorter
                              than that */
} DVSHYPPortListEntry;

/* A switch's ports of one kind. */
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct {
    uint32_t numEntries;           /* 0 entries filled */
    uint32_t portType;             /* 4 the DVSPortType asked for */
    DVSHYPPortListEntry entries[]; /* 8 numEntries records, back to back */
} DVSHYPPortList;
#pragma GCC diagnostic pop

/* ---- The channel ---- */

/*
 * Sends one command over the process's cached device descriptor, which the first successful call opens and
 * nothing closes. The record's status is preset to HYP_FAILURE; it is returned when the call fails, and not
 * looked at when the call succeeds. After a failed open the next call tries again.
 */
HYP_ReturnStatus DVSHYP_Ioctl(int request, DVSHYPRequest *req);

/*
 * Executes a text command of the module (command 28) and fetches its reply, in a buffer that is offered anew
 * for as long as the module answers HYP_LIMIT_EXCEEDED, whether or not it asked for more. `in`: the command's
 * input, inLen bytes, null when inLen is 0. A buffer that cannot be allocated is reported with "failed to
 * alloc buffer memory" on standard error.
 */
HYP_ReturnStatus DVSHYP_CmdExec(const char *switchName, const char *cmd, const void *in, uint32_t inLen,
                                void **out, uint32_t *outLen);

/* Releases a buffer that a function of this header handed out. Null is allowed. */
void DVSHYP_DataFree(void *buf);

/*
 * Takes the recursive lock "dvshyp", created on first use, and returns its handle for DVSwitchHYPUnlock
 * (where null does nothing). Hold it around a sequence that must not meet another thread's use of the switch
 * table as scratch.
 */
MXUserRecLock *DVSwitchHYPLock(void);
void DVSwitchHYPUnlock(MXUserRecLock *lock);

/* ---- Whole states ---- */

/* 0: replaces the module's state by a serialized one of `len` bytes. 1: empties it. 2: tidies it up. */
HYP_ReturnStatus DVSHYP_StateInit(const void *state, uint32_t len);
HYP_ReturnStatus DVSHYP_StateCleanup(void);
HYP_ReturnStatus DVSHYP_StateSanitize(void);

/* 3: fetches the module's whole state, serialized as DVSState_ConfigSerialize does. */
HYP_ReturnStatus DVSHYP_StateGet(void **out, uint32_t *outLen);

/* ---- Switches ---- */

/* 4, 5: adds and removes a switch. HYP_EXISTS, HYP_LIMIT_EXCEEDED; HYP_NOT_FOUND. */
HYP_ReturnStatus DVSHYP_SwitchAdd(const char *switchName, const char *className, uint32_t maxPorts,
                                  uint32_t version);
HYP_ReturnStatus DVSHYP_SwitchRemove(const char *switchName);

/* 6, 7: associates the switch with the host's networking, and takes that back. */
HYP_ReturnStatus DVSHYP_SwitchAssociate(const char *switchName);
HYP_ReturnStatus DVSHYP_SwitchDissociate(const char *switchName);

/* 21, 22: sets the port limit and the version number. */
HYP_ReturnStatus DVSHYP_SwitchSetMaxPorts(const char *switchName, uint32_t maxPorts);
HYP_ReturnStatus DVSHYP_SwitchSetVersion(const char *switchName, uint32_t version);

/* ---- Switch properties ---- */

/* 8, 9, 10: fetches, sets and clears a global property. `propType` is the property type word (see
 * dvs/data.h). */
HYP_ReturnStatus DVSHYP_GlobalPropGet(const char *switchName, const char *propName, void **out,
                                      uint32_t *outLen);
HYP_ReturnStatus DVSHYP_GlobalPropSet(const char *switchName, const char *propName, const void *value,
                                      uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSHYP_GlobalPropClear(const char *switchName, const char *propName);

/* 11, 12, 13: the same for a host property. */
HYP_ReturnStatus DVSHYP_HostPropGet(const char *switchName, const char *propName, void **out,
                                    uint32_t *outLen);
HYP_ReturnStatus DVSHYP_HostPropSet(const char *switchName, const char *propName, const void *value,
                                    uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSHYP_HostPropClear(const char *switchName, const char *propName);

/* The clears' common worker: `command` is 10 or 13. */
HYP_ReturnStatus DVSHYPSwitchPropClear(const char *switchName, const char *propName, uint32_t command);

/* 29, 30: as the fetches above, asked of the SmartNIC. */
HYP_ReturnStatus DVSHYP_SmartNICGlobalPropGet(const char *switchName, const char *propName, void **out,
                                              uint32_t *outLen);
HYP_ReturnStatus DVSHYP_SmartNICHostPropGet(const char *switchName, const char *propName, void **out,
                                            uint32_t *outLen);

/* ---- Ports ---- */

/* 14: adds a port; `portData` is its serialized property list of `len` bytes. 15: removes it. */
HYP_ReturnStatus DVSHYP_PortAdd(const char *switchName, const char *portId, const void *portData,
                                uint32_t len);
HYP_ReturnStatus DVSHYP_PortRemove(const char *switchName, const char *portId);

/* 20: HYP_OK when the module has the port. 19: fetches its serialized property list. */
HYP_ReturnStatus DVSHYP_PortFind(const char *switchName, const char *portId);
HYP_ReturnStatus DVSHYP_PortStateGet(const char *switchName, const char *portId, void **out,
                                     uint32_t *outLen);

/* 16, 17, 18: fetches, sets and clears one entry of the port's data. */
HYP_ReturnStatus DVSHYP_PortDataGet(const char *switchName, const char *portId, const char *propName,
                                    void **out, uint32_t *outLen);
HYP_ReturnStatus DVSHYP_PortDataSet(const char *switchName, const char *portId, const char *propName,
                                    const void *value, uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSHYP_PortDataClear(const char *switchName, const char *portId, const char *propName);

/* 26, 27: sets and fetches the data that a port keeps for one uplink, by the uplink's number. */
HYP_ReturnStatus DVSHYP_UplinkDataSet(const char *switchName, const char *portId, int uplink,
                                      const void *value, uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSHYP_UplinkDataGet(const char *switchName, const char *portId, int uplink, void **out,
                                      uint32_t *outLen);

/* 31: as DVSHYP_PortDataGet, asked of the SmartNIC. */
HYP_ReturnStatus DVSHYP_SmartNICPortDataGet(const char *switchName, const char *portId, const char *propName,
                                            void **out, uint32_t *outLen);

/*
 * Finds the port of a switch by its external id ("com.orbeno.port.extraConfig.vnic.external.id", else
 * "com.orbeno.port.extraConfig.hypnic.external.id"), the first in slot order whose stored id is a leading
 * part of the one asked for; an empty stored id matches everything. *out receives a new result, released with
 * DVSHYP_DataFree, also when no port matched (its port id is empty then). HYP_BAD_PARAM: externalId has more
 * than 127 characters; the device is not touched. HYP_NOT_FOUND: no such switch. Uses the switch table as
 * scratch.
 */
HYP_ReturnStatus DVSHYP_PortGetByExternalId(const char *switchName, const char *externalId,
                                            DVSHYPExternalIdResult **out);

/* ---- Persistent state ---- */

/*
 * Fetches the module's state and serializes what of it is worth keeping: without switches marked
 * "com.orbeno.common.volatile.nopersist", without entries whose name contains ".volatile.", without ports
 * other than active ones, without ports marked "com.orbeno.common.port.volatile.persist", and, of a switch
 * whose host property "com.orbeno.common.portset.opaque" begins with "true", without ports whose id is a
 * number above 999.
 *
 * out, outLen  as the lists' serialization has them: *out is null and receives a new buffer, or a buffer of
 *              *outLen bytes that is filled. Left as they were on failure.
 * stateFile    may be null. Otherwise switches marked "nopersist" are replaced by their versions in this
 *              state file.
 *
 * Statuses of the fetch, of loading a state (HYP_BAD_PARAM, HYP_BAD_CHECKSUM, …), of DVSFile_Read and of the
 * serialization (HYP_EXISTS; HYP_LIMIT_EXCEEDED for a buffer too small). A state file whose contents cannot
 * be loaded is reported on standard error, "DVSState_ConfigDeserialize failed: %s\n", and its buffer stays
 * allocated. Uses the switch table as scratch.
 */
HYP_ReturnStatus DVSHYP_PersistentStateGet(void **out, uint32_t *outLen);
HYP_ReturnStatus DVSHYP_PersistentStateGetWithFile(void **out, uint32_t *outLen, const char *stateFile);

/*
 * Fetches one port's property list without the entries whose name contains ".volatile.", serialized for the
 * switch version `dvsVersion`. Outputs as above. Takes no lock and does not use the switch table.
 */
HYP_ReturnStatus DVSHYP_PersistentPortStateGet(const char *switchName, const char *portId,
                                               uint32_t dvsVersion, void **out, uint32_t *outLen);

/* ---- Filters over property lists ---- */

/*
 * Each walks `list` and removes entries, judging every entry by itself, namesakes included. An entry is of a
 * type when DVSData_IsSamePropType says so. They return the status that ended the walk: HYP_NOT_FOUND at the
 * end of the list. The list belongs to the caller, no lock is taken.
 */

/* Removes every entry whose name contains `needle`. */
HYP_ReturnStatus DVSHYPStripNamedProp(DVSData *list, const char *needle);

/*
 * Removes every entry that is of another type or whose name contains `needle`, unless its name is one of
 * `keep`, a null-terminated array of names (128 characters are compared), or null for none.
 */
HYP_ReturnStatus DVSHYPStripNamedPropForType(DVSData *list, const char *needle, const char **keep,
                                             uint32_t propType);

/* Removes every entry but those of the type whose name contains `needle`. */
HYP_ReturnStatus DVSHYPExtractNamedPropForType(DVSData *list, const char *needle, uint32_t propType);

/* ---- Queries ---- */

/*
 * Each fetches state, narrows one list of it to entries of `propType` and hands that list over
 * (DVSData_Free). A switch without the list gives an empty one. HYP_NOT_FOUND: no such switch. The
 * switch-level queries use the switch table as scratch, the port-level ones take no lock.
 */

/*
 * A switch's properties that are not the platform's own. The module is asked for "com.orbeno.common.version":
 * above 106 the list also loses "com.orbeno.vswitch.teaming" and "com.orbeno.ovl.vdr.dvptracking". A failed
 * version query is ignored. `host` selects the host list.
 */
HYP_ReturnStatus DVSHYPVendorPropList(const char *switchName, DVSData **out, uint32_t propType, bool host);
HYP_ReturnStatus DVSHYP_VendorGlobalPropList(const char *switchName, DVSData **out, uint32_t propType);
HYP_ReturnStatus DVSHYP_VendorHostPropList(const char *switchName, DVSData **out, uint32_t propType);

/* The same of one port. */
HYP_ReturnStatus DVSHYP_VendorPortPropList(const char *switchName, const char *portId, DVSData **out,
                                           uint32_t propType);

/* The extra configuration of a switch ("com.orbeno.extraconfig.", global list) and of a port. */
HYP_ReturnStatus DVSHYP_ExtraConfigPropList(const char *switchName, DVSData **out, uint32_t propType);
HYP_ReturnStatus DVSHYP_ExtraConfigPortPropList(const char *switchName, const char *portId, DVSData **out,
                                                uint32_t propType);

/*
 * The overlay network's properties of a switch. `global` selects the global list: the opposite sense of
 * DVSHYPVendorPropList's flag. Asked for type 16, entries named "com.orbeno.net.portset.fc.…" of any type are
 * kept.
 */
HYP_ReturnStatus DVSHYP_OvlPropList(const char *switchName, uint32_t propType, bool global, DVSData **out);

/* True when `name` begins with one of the overlay network's prefixes. */
bool IsOvlProp(const char *name);

/*
 * The switch's ports of one kind (a DVSPortType), in slot order, with their connection ids. *out receives a
 * new list, released with DVSHYP_DataFree. HYP_NOT_FOUND: no such switch. Uses the switch table as scratch.
 */
HYP_ReturnStatus DVSHYP_SwitchPortList(const char *switchName, DVSHYPPortList **out, uint32_t portType);

#ifdef __cplusplus
}
#endif

#endif
