/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_STATE_H
#define DVS_STATE_H

#include <stdbool.h>
#include <stdint.h>

#include "dvs/data.h"
#include "dvs/status.h"

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The switch state: every distributed virtual switch of this host, with its properties and ports, in one
 * process-wide table of 32 slots; and the buffer format that holds all of it.
 *
 * Ownership. The table owns its switches; a switch owns its property lists and ports; a port owns its data
 * list. Returned pointers stay owned by the table: a switch or port is valid until it is removed, a value
 * until its property changes. Values passed in are copied. A list passed to a port add belongs to the port if
 * the add succeeds and to the caller if it fails. Lists created here use malloc and free.
 *
 * Texts are NUL-terminated, must not be NULL unless a function allows it, and compare case-sensitively and
 * whole. A switch id has at most 63 characters, a class name 127, a port id 47 (15 on switches of version 6
 * and below). Property names compare over at most 128 characters.
 *
 * Serialization follows the buffer convention of dvs/data.h. If *buf is NULL, a block is allocated (released
 * with free) and *len receives its size. Otherwise *len is the capacity of *buf and receives the size
 * written; HYP_LIMIT_EXCEEDED if the capacity is too small. Both are untouched on failure.
 *
 * Locking. The recursive lock "dvsstate" guards the table's slots. Adding, removing and finding switches, the
 * walk over them and all operations on the whole table take it themselves. The contents of a switch are not
 * guarded: to change a switch from several threads, or to keep a pointer while others may remove it, hold
 * DVSwitchHandleLock throughout.
 *
 * The retrieval of kernel state (dvs/hyp.h) and the config store (dvs/configstore.h) also use the table as
 * scratch. Do not call them while the table holds your own switches: they overwrite it.
 *
 * Messages go to standard output according to dvs_debug: errors at 0 or above, traces above 0, detail
 * above 1.
 */

typedef struct MXUserRecLock MXUserRecLock;
typedef struct BitVector BitVector;
typedef struct DVSPort DVSPort;

/* A switch. Callers may read every field; field comments say which ones they may change. */
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct DVSwitch {
    uint32_t numPorts;       /* ports of all kinds on this switch */
    uint32_t maxPorts;       /* port limit; the host-wide limit for classes without one of their own */
    uint32_t newMaxPorts;    /* pending limit, set by callers and serialized; see DVS_UpdateMaxPorts */
    uint32_t version;        /* 4 to 12, 100, 107 to 112; see DVSState_SwitchSetVersion */
    char switchId[64];       /* NUL-terminated; must be a UUID's text for lookups by UUID */
    char className[128];     /* NUL-terminated; see DVS_SetClassName */
    DVSData *globalPropList; /* settings that are the same on every host; NULL: none */
    DVSData *hostPropList;   /* settings of this host; NULL: none */
    uint32_t classFlags;     /* bit 0: exempt from maxPorts; bit 1: overlay class */
    BitVector *portBitmap;   /* one bit per slot, set if the slot holds a port */
    DVSPort *ports[];        /* slots; their number is the host-wide limit at the time of the switch add */
} DVSwitch;
#pragma GCC diagnostic pop

/* A port. */
struct DVSPort {
    char portId[48];   /* NUL-terminated; read-only */
    DVSData *portData; /* its properties, owned */
    DVSwitch *owner;   /* the switch whose slot holds it */
    uint32_t portType; /* its kind; callers may change it, 0 hides the port from serialization */
};

/* Port kinds. A switch may have one port per id and kind, but any number of zombies with the same id. */
typedef enum {
    DVS_PORT_ACTIVE = 1, /* lookups without a kind try this one first */
    DVS_PORT_SHADOW = 2,
    DVS_PORT_ZOMBIE = 3,     /* created by deserialization only */
    DVS_PORT_LOCAL_CACHE = 4 /* fallback of a lookup for an active port by id */
} DVSPortType;               /* stored as u32 */

/* Callbacks of the walks; true stops the walk. `arg` is passed through. */
typedef bool (*DVSSwitchForEachFn)(DVSwitch *sw, void *arg);
typedef bool (*DVSPortForEachFn)(DVSPort *port, void *arg);
typedef bool (*DVSPropForEachFn)(DVSDataEntry *entry, void *arg);

/* Debug level of the switch state; -1, the default, prints nothing. */
extern int32_t dvs_debug;

/* Ports that the kernel allows on the whole host. 0 until the first switch add reads and caches it. */
extern uint32_t uwMaxNumActivePortsSystemWide;

/* ---- The lock ---- */

/*
 * Takes the recursive lock "dvsstate", created on first use. If both are held, take "dvshyp" of dvs/hyp.h
 * first. Returns the handle for DVSwitchHandleUnlock; NULL if the host cannot create the lock.
 */
MXUserRecLock *DVSwitchHandleLock(void);

/* Releases the lock taken by DVSwitchHandleLock. NULL is a no-op. */
void DVSwitchHandleUnlock(MXUserRecLock *lock);

/* ---- Switches ---- */

/*
 * Adds a switch, without ports and properties, in the first free slot.
 *
 * className  truncated to 127 characters. The classes "ovlvswitch", "etherswitch", "stub-vswitch", "cswitch"
 *            and "vswitch" are exempt from a limit of their own and get the host-wide one.
 * maxPorts   the limit of a switch of any other class; ignored for those five.
 * version    not checked.
 *
 * HYP_OK.
 * HYP_BAD_PARAM       an id of 64 characters or more.
 * HYP_LIMIT_EXCEEDED  maxPorts exceeds the host's free ports, or all 32 slots are taken.
 * HYP_EXISTS          a switch with this id exists.
 * HYP_NO_MEMORY       nothing was added.
 * Any other           the host failed to return its port limit, which the first add queries.
 *
 * Takes the lock for the insertion.
 */
HYP_ReturnStatus DVSState_SwitchAdd(const char *switchId, const char *className, uint32_t maxPorts,
                                    uint32_t version);

/*
 * Removes a switch with its ports and properties. HYP_NOT_FOUND: no switch has this id. If a port cannot be
 * removed, the switch stays with its remaining ports and the result is still HYP_OK. Takes the lock.
 */
HYP_ReturnStatus DVSState_SwitchRemove(const char *switchId);

/* Returns the switch with this id, or NULL. Takes the lock only for the search. */
DVSwitch *DVSState_SwitchFind(const char *switchId);

/*
 * Returns the switch whose id is the text of this UUID, or NULL. The text is sixteen pairs of lower-case
 * hexadecimal digits, separated by spaces, with a hyphen between the eighth and the ninth. Takes the lock
 * only for the search.
 */
DVSwitch *DVSState_SwitchFindByUUID(const uint8_t uuid[16]);

/*
 * Returns the first switch whose global property "com.orbeno.common.alias" equals this text (the property is
 * compared up to its NUL or its end), or NULL. Takes the lock only for the search.
 */
DVSwitch *DVSState_SwitchFindByAlias(const char *alias);

/* Calls callback(switch, arg) for every switch in slot order, under the lock. The callback may remove
 * switches. */
void DVSState_SwitchForEach(DVSSwitchForEachFn callback, void *arg);

/*
 * Sets a switch's version. HYP_NOT_SUPPORTED: the version is not 4 to 12, 100 or 107 to 112. HYP_NOT_FOUND:
 * no switch has this id. Takes the lock only for the search.
 */
HYP_ReturnStatus DVSState_SwitchSetVersion(const char *switchId, uint32_t version);

/* Fields of a switch. They take no lock. */
const char *DVS_SwitchId(DVSwitch *sw);
const char *DVS_ClassName(DVSwitch *sw);
uint32_t DVS_Version(DVSwitch *sw);
uint32_t DVS_GetMaxPorts(DVSwitch *sw);
uint32_t DVS_GetNewMaxPorts(DVSwitch *sw);

/*
 * Returns the value of the switch's global property "com.orbeno.common.alias", looked up by the switch's id
 * in the table; "unknown" if it does not exist. Takes the lock only for the search.
 */
const char *DVS_SwitchName(DVSwitch *sw);

/* Sets the class name, truncated to 127 characters. Flags and limits do not change. No lock. */
void DVS_SetClassName(DVSwitch *sw, const char *className);

/* Copies the pending port limit to the limit and returns it. No lock. */
uint32_t DVS_UpdateMaxPorts(DVSwitch *sw);

/* ---- Ports ---- */

/*
 * Adds an active (local-cache) port in the switch's first free slot.
 *
 * data  its properties, owned by the port on success. NULL returns HYP_BAD_PARAM.
 *
 * HYP_OK.
 * HYP_NOT_FOUND       no switch has this id.
 * HYP_BAD_PARAM       the id is too long for the switch's version, or `data` is NULL.
 * HYP_LIMIT_EXCEEDED  the switch's or the host's limit is reached.
 * HYP_EXISTS          the switch has a port with this id and kind.
 * HYP_NO_MEMORY       nothing was added.
 */
HYP_ReturnStatus DVSState_PortAdd(const char *switchId, const char *portId, DVSData *data);
HYP_ReturnStatus DVSState_LocalCachePortAdd(const char *switchId, const char *portId, DVSData *data);

/*
 * Adds a shadow port from serialized port data, which is copied. Deserializes first: statuses are those of
 * DVSData_Deserialize, then those of DVSState_PortAdd.
 */
HYP_ReturnStatus DVSState_PortAddShadow(const char *switchId, const char *portId, const void *buf,
                                        uint32_t len);

/*
 * Removes the first active (shadow, zombie, local-cache) port with this id, and its data. HYP_NOT_FOUND: no
 * such switch or port. Ports of other kinds are not removed.
 */
HYP_ReturnStatus DVSState_PortRemove(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_PortRemoveShadow(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_PortRemoveZombie(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_LocalCachePortRemove(const char *switchId, const char *portId);

/* Returns the first port in slot order with this id and kind; NULL if there is none or `sw` is NULL. */
DVSPort *DVSState_FindPortByIDAndType(DVSwitch *sw, const char *portId, uint32_t kind);

/* Returns the active port with this id, else the local-cache one; NULL if there is no port or no switch. */
DVSPort *DVSState_PortFindOnDVSwitch(DVSwitch *sw, const char *portId);
DVSPort *DVSState_PortFind(const char *switchId, const char *portId);

/* Returns the shadow (zombie, local-cache) port with this id; NULL if there is no port or no switch. */
DVSPort *DVSState_PortFindShadow(const char *switchId, const char *portId);
DVSPort *DVSState_PortFindZombie(const char *switchId, const char *portId);
DVSPort *DVSState_LocalCachePortFind(const char *switchId, const char *portId);

/* DVSState_PortFind (DVSState_PortFindShadow) on the switch whose id is the text of this UUID. */
DVSPort *DVSState_PortFindByUUID(const uint8_t uuid[16], const char *portId);
DVSPort *DVSState_PortFindShadowByUUID(const uint8_t uuid[16], const char *portId);

/*
 * Returns the first port in slot order of this kind whose property "com.orbeno.common.port.alias" equals this
 * text (the property is compared up to its NUL or its end); NULL if there is no port or no switch.
 */
DVSPort *DVSState_PortFindByAliasType(DVSwitch *sw, const char *alias, uint32_t kind);

/* The same for an active port; falls back to a local-cache one. */
DVSPort *DVSState_PortFindByAliasOnDVS(DVSwitch *sw, const char *alias);

/* Returns the active (shadow) port with this alias on the switch with that alias. Does not try local-cache
 * ports. */
DVSPort *DVSState_PortFindByAlias(const char *switchAlias, const char *portAlias);
DVSPort *DVSState_PortFindShadowByAlias(const char *switchAlias, const char *portAlias);

/* Calls callback(port, arg) for every port in slot order. The callback may remove the port it was given. */
void DVSState_PortForEach(DVSwitch *sw, DVSPortForEachFn callback, void *arg);

const char *DVS_PortId(DVSPort *port);

/* Returns the value of the port's property "com.orbeno.common.port.alias"; "unknown" if it does not exist. */
const char *DVS_PortAlias(DVSPort *port);

/* ---- Properties ---- */

/*
 * Two parallel families: host properties (hostPropList) and global properties (globalPropList). If a switch
 * does not have the list, it has no properties of that family.
 *
 * Functions that take a switch id take the lock only for the search and return HYP_NOT_FOUND if the switch
 * does not exist.
 */

/*
 * Sets a property; DVSData_Update describes its position and propType 0. HYP_FAILURE: null data or length 0;
 * nothing is changed. HYP_BAD_PARAM: the length is too large for an entry. HYP_NO_MEMORY.
 */
HYP_ReturnStatus DVSState_HostPropSet(const char *switchId, const char *name, const void *data, uint32_t len,
                                      uint32_t propType);
HYP_ReturnStatus DVSState_GlobalPropSet(const char *switchId, const char *name, const void *data,
                                        uint32_t len, uint32_t propType);

/* Removes a property. HYP_NOT_FOUND: it does not exist. */
HYP_ReturnStatus DVSState_HostPropClear(const char *switchId, const char *name);
HYP_ReturnStatus DVSState_GlobalPropClear(const char *switchId, const char *name);

/* Returns a property's entry, owned by the list. HYP_NOT_FOUND: it does not exist, *entry untouched. */
HYP_ReturnStatus DVSState_HostPropLookup(const char *switchId, const char *name, DVSDataEntry **entry);
HYP_ReturnStatus DVSState_GlobalPropLookup(const char *switchId, const char *name, DVSDataEntry **entry);

/*
 * Returns a property's value; the list keeps ownership. `len` may be NULL. HYP_NOT_FOUND: it does not exist,
 * outputs untouched. No lock.
 */
HYP_ReturnStatus DVSState_HostPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len);
HYP_ReturnStatus DVSState_GlobalPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len);

/* True if the property exists. No lock. */
bool DVSState_HostPropIsSet(DVSwitch *sw, const char *name);
bool DVSState_GlobalPropIsSet(DVSwitch *sw, const char *name);

/*
 * Calls callback(entry, arg) for every property in list order. Returns 1 (true) if the callback stopped the
 * walk, HYP_NOT_FOUND if it completed. The callback must not remove the entry it was given. No lock.
 */
HYP_ReturnStatus DVSState_HostPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg);
HYP_ReturnStatus DVSState_GlobalPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg);

/* The same for a port's data. No lock. Get needs both outputs; `len` of Read may be NULL. */
HYP_ReturnStatus DVSState_PortDataGet(DVSPort *port, const char *name, void **data, uint32_t *len);
HYP_ReturnStatus DVSState_PortDataSet(DVSPort *port, const char *name, const void *data, uint32_t len,
                                      uint32_t propType);
HYP_ReturnStatus DVSState_PortDataClear(DVSPort *port, const char *name);
HYP_ReturnStatus DVSState_PortDataRead(DVSPort *port, const char *name, void **data, uint32_t *len);
HYP_ReturnStatus DVSState_PortDataForEach(DVSPort *port, DVSPropForEachFn callback, void *arg);

/* ---- Serialized state ---- */

/*
 * Three levels of the format of dvs/data.h, nested as values of type 0x10:
 *
 *   the state     one entry per switch in slot order, named by its id; its value is
 *   a switch      "switchVersion" (u32), "className" (128 bytes), "maxPorts" (u32, the pending limit),
 *                 "globalPropList" and "hostPropList" if the switch has them, then one entry per port in
 *                 slot order, named by its id; the value of each list and port is
 *   a list        the properties. A port that is not active carries its kind as
 *                 "com.orbeno.common.port.volatile.type" (u32): added to the output if the port's data does
 *                 not have it, and removed on reading.
 *
 * Ports of kind 0 are skipped. A switch of version 99 skips properties whose type word has bit 2, 5, 6
 * or 31.
 */

/*
 * Serializes a port's data. HYP_NO_MEMORY. HYP_LIMIT_EXCEEDED: the buffer is too small, or the list's size
 * does not match its entries. The block comes from the data list's own allocator. No lock.
 */
HYP_ReturnStatus DVSState_PortSerialize(DVSPort *port, void **buf, uint32_t *len);

/* Serializes a switch. Statuses as above; HYP_BAD_PARAM: a value is too large for an entry. No lock. */
HYP_ReturnStatus DVSState_SwitchSerialize(DVSwitch *sw, void **buf, uint32_t *len);

/*
 * Serializes the whole table. HYP_NO_MEMORY. HYP_LIMIT_EXCEEDED: the buffer is too small. HYP_EXISTS: a
 * switch could not be serialized, for any reason. Holds the lock throughout.
 */
HYP_ReturnStatus DVSState_ConfigSerialize(void **buf, uint32_t *len);

/*
 * Adds a port from its serialized data, with the kind stored there, or as an active one if there is no kind.
 * Returns the statuses of DVSState_PortAdd and DVSData_Deserialize; HYP_BAD_PARAM also for a kind shorter
 * than four bytes; HYP_NOT_FOUND: no such switch. With several threads, the caller holds the lock.
 */
HYP_ReturnStatus DVSState_PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_PortDeserialize(const char *switchId, const char *portId, const void *buf,
                                          uint32_t len);

/*
 * Adds a switch from its buffer. An existing switch keeps its version, class and limits; its property lists
 * are replaced (a list missing from the buffer is removed) and the ports are added.
 *
 * HYP_OK.
 * HYP_NOT_FOUND  a field is missing, or the switch was removed meanwhile.
 * HYP_BAD_PARAM  a version or limit shorter than four bytes.
 * Any other      from DVSData_Deserialize, DVSState_SwitchAdd or DVSState_PortAddDeserialize.
 *
 * If a port fails, a switch created by this call is removed; an existing one keeps what was applied so far.
 * With several threads, the caller holds the lock.
 */
HYP_ReturnStatus DVSState_SwitchDeserialize(const char *switchId, const void *buf, uint32_t len);

/*
 * Adds every switch of a state; existing switches stay and are merged as above. If the buffer is not a valid
 * state, the table is unchanged. If a switch fails, the table is emptied and its status returned. With
 * several threads, the caller holds the lock.
 */
HYP_ReturnStatus DVSState_ConfigDeserialize(const void *buf, uint32_t len);

/* ---- The whole table ---- */

/* Removes every switch. HYP_EXISTS: one cannot be removed; the remaining switches stay. Holds the lock
 * throughout. */
HYP_ReturnStatus DVSState_ConfigReset(void);

/*
 * Removes the switches that must not persist: those whose global property
 * "com.orbeno.common.volatile.nopersist" begins with a byte other than 0.
 *
 * parked      32 slots. If the result is true, they receive all remaining switches, which leave the table and
 *             belong to the caller (see DVSState_FreeDVSArray); otherwise each is NULL.
 * removedIds  32 rows; the first ones receive the ids of the removed switches, the others are untouched.
 * park        true to move the remaining switches out of the table.
 *
 * Returns true if `park` was set and a switch was removed. Holds the lock throughout.
 */
bool DVSState_StripDvsWithNoPersistFlag(DVSwitch *parked[32], char removedIds[32][64], bool park);

/*
 * Moves the switches with the given ids, if the global table has them, into free slots of `table`, then
 * swaps `table` and the global table. The given switches join the parked ones; the other switches of the
 * global table end up in `table`. All 32 rows count; an unused row is an empty text. C callers cast their
 * rows to const. Holds the lock throughout.
 */
void DVSState_UpdateGlobalSwsArray(DVSwitch *table[32], const char ids[32][64]);

/*
 * Frees all switches: those of the global table, which ends up empty, and those of `table`, whose pointers
 * become invalid. Holds the lock throughout.
 */
void DVSState_FreeDVSArray(DVSwitch *table[32]);

#ifdef __cplusplus
}
#endif

#endif
