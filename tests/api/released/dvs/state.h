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
 * The switch state: every distributed virtual switch this host takes part in, with its properties and its
 * ports, in one process-wide table of 32 slots; and the one buffer in which all of it travels.
 *
 * Ownership. The table owns its switches, a switch its property lists and ports, a port its data list.
 * Pointers to records, names and values are lent: a switch or port until it is removed, a value until its
 * property changes. Values handed in are copied. A list given to a port add belongs to the port when the add
 * succeeds, and stays the caller's when it fails. Lists made here use malloc and free.
 *
 * Texts are NUL-terminated, must not be NULL unless a function says so, and compare case-sensitively and
 * whole. A switch id has at most 63 characters, a class name 127, a port id 47 (15 on switches of version 6
 * and below). A property name counts 128 characters at most.
 *
 * Serialization follows the buffer convention of dvs/data.h: where *buf is NULL a block is allocated
 * (released with free) and *len receives its size; where it is not, *len is its capacity, HYP_LIMIT_EXCEEDED
 * refuses one that is too small, and *len receives the size written. Both stay untouched on failure.
 *
 * Locking. The recursive lock "dvsstate" guards the table's slots. Adding, removing and finding switches, the
 * walk over them and all operations on the whole table take it themselves. Nothing guards a switch's
 * contents: whoever changes one switch from several threads, or keeps a pointer while others may remove,
 * holds DVSwitchHandleLock around it all.
 *
 * The table is scratch space too: the retrieval of kernel state (dvs/hyp.h) and the config store
 * (dvs/configstore.h) load over it and reset it. Who keeps switches of his own in it must not call those
 * meanwhile.
 *
 * Messages go to standard output as far as dvs_debug asks for them: errors at 0 or above, traces above 0,
 * detail above 1.
 */

typedef struct MXUserRecLock MXUserRecLock;
typedef struct BitVector BitVector;
typedef struct DVSPort DVSPort;

/* A switch. Callers may read every field; what they may change is said with the field. */
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct DVSwitch {
    uint32_t numPorts;       /* ports of all kinds on this switch */
    uint32_t maxPorts;       /* port limit; the host-wide limit for the classes that have none of their own */
    uint32_t newMaxPorts;    /* pending limit, callers set it; see DVS_UpdateMaxPorts. The one serialized */
    uint32_t version;        /* 4 to 12, 100, 107 to 112; see DVSState_SwitchSetVersion */
    char switchId[64];       /* NUL-terminated; a UUID's text where the switch is to be found by UUID */
    char className[128];     /* NUL-terminated; see DVS_SetClassName */
    DVSData *globalPropList; /* settings that are the same on every host; NULL: none */
    DVSData *hostPropList;   /* settings of this host; NULL: none */
    uint32_t classFlags;     /* bit 0: not held to maxPorts; bit 1: overlay class */
    BitVector *portBitmap;   /* one bit a slot, set where a port stands */
    DVSPort *ports[];        /* as many slots as the host-wide limit said when the switch was added */
} DVSwitch;
#pragma GCC diagnostic pop

/* A port. */
struct DVSPort {
    char portId[48];   /* NUL-terminated; not to be changed */
    DVSData *portData; /* its properties, owned */
    DVSwitch *owner;   /* the switch whose slot holds it */
    uint32_t portType; /* its kind; callers may change it, 0 hides the port from serialization */
};

/* Port kinds. An id may stand once per kind on a switch, zombies any number of times. */
typedef enum {
    DVS_PORT_ACTIVE = 1, /* found first by every lookup that names no kind */
    DVS_PORT_SHADOW = 2,
    DVS_PORT_ZOMBIE = 3,     /* comes from deserialization only */
    DVS_PORT_LOCAL_CACHE = 4 /* what a lookup for an active port by id falls back to */
} DVSPortType;               /* stored as u32 */

/* Callbacks of the walks; true stops the walk. `arg` is the caller's. */
typedef bool (*DVSSwitchForEachFn)(DVSwitch *sw, void *arg);
typedef bool (*DVSPortForEachFn)(DVSPort *port, void *arg);
typedef bool (*DVSPropForEachFn)(DVSDataEntry *entry, void *arg);

/* Debug level of the switch state; -1, the default, prints nothing. */
extern int32_t dvs_debug;

/* Ports that the kernel allows on the whole host. 0 until the first switch add reads it, then kept. */
extern uint32_t uwMaxNumActivePortsSystemWide;

/* ---- The lock ---- */

/*
 * Takes the lock "dvsstate", made on first use. Recursive; "dvshyp" of dvs/hyp.h comes before it where both
 * are held. Gives the handle to release it with, NULL when the host has no lock to give.
 */
MXUserRecLock *DVSwitchHandleLock(void);

/* Releases what DVSwitchHandleLock took. NULL is fine. */
void DVSwitchHandleUnlock(MXUserRecLock *lock);

/* ---- Switches ---- */

/*
 * Adds a switch, without ports and properties, in the first free slot.
 *
 * className  cut after 127 characters. The classes "ovlvswitch", "etherswitch", "stub-vswitch", "cswitch"
 *            and "vswitch" are not held to a limit: they get the host-wide one.
 * maxPorts   the limit of a switch of any other class; ignored for those five.
 * version    taken as it is.
 *
 * HYP_OK.
 * HYP_BAD_PARAM       an id of 64 characters or more.
 * HYP_LIMIT_EXCEEDED  maxPorts is more than the host has ports free, or all 32 slots are taken.
 * HYP_EXISTS          a switch has this id.
 * HYP_NO_MEMORY       nothing was added.
 * Any other           the host could not tell its port limit, which the first add asks for.
 *
 * Takes the lock for the insertion.
 */
HYP_ReturnStatus DVSState_SwitchAdd(const char *switchId, const char *className, uint32_t maxPorts,
                                    uint32_t version);

/*
 * Removes a switch with its ports and properties. HYP_OK also when a port could not be removed, which leaves
 * the switch in place with the ports it still has. HYP_NOT_FOUND when no switch has this id. Takes the lock.
 */
HYP_ReturnStatus DVSState_SwitchRemove(const char *switchId);

/* The switch of this id; NULL when there is none. Takes the lock for the search only. */
DVSwitch *DVSState_SwitchFind(const char *switchId);

/*
 * The switch whose id is the text of this UUID: sixteen pairs of lower-case hexadecimal digits, a blank
 * between them and a hyphen between the eighth and the ninth. NULL when there is none. Takes the lock for the
 * search only.
 */
DVSwitch *DVSState_SwitchFindByUUID(const uint8_t uuid[16]);

/*
 * The first switch whose global property "com.orbeno.common.alias" is this text (up to its NUL or its end).
 * NULL when there is none. Takes the lock for the search only.
 */
DVSwitch *DVSState_SwitchFindByAlias(const char *alias);

/* Calls callback(switch, arg) for every switch in slot order, under the lock. The callback may remove
 * switches. */
void DVSState_SwitchForEach(DVSSwitchForEachFn callback, void *arg);

/*
 * Sets a switch's version. HYP_NOT_SUPPORTED for any but 4 to 12, 100 and 107 to 112; HYP_NOT_FOUND when no
 * switch has this id. Takes the lock for the search only.
 */
HYP_ReturnStatus DVSState_SwitchSetVersion(const char *switchId, uint32_t version);

/* Fields of a switch. No lock. */
const char *DVS_SwitchId(DVSwitch *sw);
const char *DVS_ClassName(DVSwitch *sw);
uint32_t DVS_Version(DVSwitch *sw);
uint32_t DVS_GetMaxPorts(DVSwitch *sw);
uint32_t DVS_GetNewMaxPorts(DVSwitch *sw);

/*
 * The value of the switch's global property "com.orbeno.common.alias", looked up by the switch's id in the
 * table; "unknown" when it is not there. Takes the lock for the search only.
 */
const char *DVS_SwitchName(DVSwitch *sw);

/* Sets the class name, cut after 127 characters. Flags and limits stay as they are. No lock. */
void DVS_SetClassName(DVSwitch *sw, const char *className);

/* Makes the pending port limit the limit, and gives it. No lock. */
uint32_t DVS_UpdateMaxPorts(DVSwitch *sw);

/* ---- Ports ---- */

/*
 * Adds an active (a local-cache) port in the switch's first free slot.
 *
 * data  its properties, which the port owns on success. NULL is HYP_BAD_PARAM.
 *
 * HYP_OK.
 * HYP_NOT_FOUND       no switch has this id.
 * HYP_BAD_PARAM       an id too long for the switch's version, or no data.
 * HYP_LIMIT_EXCEEDED  the switch's or the host's limit is reached.
 * HYP_EXISTS          the switch has a port of this id and kind.
 * HYP_NO_MEMORY       nothing was added.
 */
HYP_ReturnStatus DVSState_PortAdd(const char *switchId, const char *portId, DVSData *data);
HYP_ReturnStatus DVSState_LocalCachePortAdd(const char *switchId, const char *portId, DVSData *data);

/*
 * Adds a shadow port from serialized port data, which is copied. Statuses as above, and those of
 * DVSData_Deserialize, which comes first.
 */
HYP_ReturnStatus DVSState_PortAddShadow(const char *switchId, const char *portId, const void *buf,
                                        uint32_t len);

/*
 * Removes the first active (shadow, zombie, local-cache) port of this id, with its data. HYP_NOT_FOUND when
 * there is no such switch or port; a port of another kind stays.
 */
HYP_ReturnStatus DVSState_PortRemove(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_PortRemoveShadow(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_PortRemoveZombie(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_LocalCachePortRemove(const char *switchId, const char *portId);

/* The first port in slot order of this id and kind; NULL when there is none, or no switch. */
DVSPort *DVSState_FindPortByIDAndType(DVSwitch *sw, const char *portId, uint32_t kind);

/* The active port of this id, else the local-cache one; NULL when there is none, or no switch. */
DVSPort *DVSState_PortFindOnDVSwitch(DVSwitch *sw, const char *portId);
DVSPort *DVSState_PortFind(const char *switchId, const char *portId);

/* The shadow (zombie, local-cache) port of this id; NULL when there is none, or no switch. */
DVSPort *DVSState_PortFindShadow(const char *switchId, const char *portId);
DVSPort *DVSState_PortFindZombie(const char *switchId, const char *portId);
DVSPort *DVSState_LocalCachePortFind(const char *switchId, const char *portId);

/* DVSState_PortFind (DVSState_PortFindShadow) on the switch whose id is the text of this UUID. */
DVSPort *DVSState_PortFindByUUID(const uint8_t uuid[16], const char *portId);
DVSPort *DVSState_PortFindShadowByUUID(const uint8_t uuid[16], const char *portId);

/*
 * The first port in slot order of this kind whose property "com.orbeno.common.port.alias" is this text (up to
 * its NUL or its end); NULL when there is none, or no switch.
 */
DVSPort *DVSState_PortFindByAliasType(DVSwitch *sw, const char *alias, uint32_t kind);

/* The same for an active port, else a local-cache one. */
DVSPort *DVSState_PortFindByAliasOnDVS(DVSwitch *sw, const char *alias);

/* The active (shadow) port of this alias on the switch of that alias. No fallback to local-cache ports. */
DVSPort *DVSState_PortFindByAlias(const char *switchAlias, const char *portAlias);
DVSPort *DVSState_PortFindShadowByAlias(const char *switchAlias, const char *portAlias);

/* Calls callback(port, arg) for every port in slot order. The callback may remove the port it was given. */
void DVSState_PortForEach(DVSwitch *sw, DVSPortForEachFn callback, void *arg);

const char *DVS_PortId(DVSPort *port);

/* The value of the port's property "com.orbeno.common.port.alias"; "unknown" when it is not there. */
const char *DVS_PortAlias(DVSPort *port);

/* ---- Properties ---- */

/*
 * Two families alike: host properties (hostPropList) and global properties (globalPropList). A switch without
 * the list has none of its properties.
 *
 * Those that take a switch id take the lock for the search only, and give HYP_NOT_FOUND when there is no such
 * switch.
 */

/*
 * Sets a property; see DVSData_Update for what happens to its place and for propType 0. HYP_FAILURE, with
 * nothing changed, when there is no data or its length is 0; HYP_BAD_PARAM for a length that no entry can
 * have; HYP_NO_MEMORY.
 */
HYP_ReturnStatus DVSState_HostPropSet(const char *switchId, const char *name, const void *data, uint32_t len,
                                      uint32_t propType);
HYP_ReturnStatus DVSState_GlobalPropSet(const char *switchId, const char *name, const void *data,
                                        uint32_t len, uint32_t propType);

/* Removes a property. HYP_NOT_FOUND when it is not there. */
HYP_ReturnStatus DVSState_HostPropClear(const char *switchId, const char *name);
HYP_ReturnStatus DVSState_GlobalPropClear(const char *switchId, const char *name);

/* Lends a property's entry. HYP_NOT_FOUND, *entry untouched, when it is not there. */
HYP_ReturnStatus DVSState_HostPropLookup(const char *switchId, const char *name, DVSDataEntry **entry);
HYP_ReturnStatus DVSState_GlobalPropLookup(const char *switchId, const char *name, DVSDataEntry **entry);

/*
 * Lends a property's value; `len` may be NULL. HYP_NOT_FOUND, outputs untouched, when it is not there. No
 * lock.
 */
HYP_ReturnStatus DVSState_HostPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len);
HYP_ReturnStatus DVSState_GlobalPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len);

/* True when the property is there. No lock. */
bool DVSState_HostPropIsSet(DVSwitch *sw, const char *name);
bool DVSState_GlobalPropIsSet(DVSwitch *sw, const char *name);

/*
 * Calls callback(entry, arg) for every property in list order. 1 (true) when the callback stopped the walk,
 * HYP_NOT_FOUND when it was complete. The callback must not remove the entry it was given. No lock.
 */
HYP_ReturnStatus DVSState_HostPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg);
HYP_ReturnStatus DVSState_GlobalPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg);

/* The same for the data of a port. No lock. A get wants both outputs, a read can do without the length. */
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
 *   the state     one entry per switch in slot order, named by its id; the value is
 *   a switch      "switchVersion" (u32), "className" (128 bytes), "maxPorts" (u32, the pending limit),
 *                 "globalPropList" and "hostPropList" where the switch has them, then one entry per port in
 *                 slot order, named by its id; lists and ports have for value
 *   a list        the properties. A port that is not active carries its kind as
 *                 "com.orbeno.common.port.volatile.type" (u32): added to the output where the port's data
 *                 lack it, and taken out again on reading.
 *
 * Ports of kind 0 are left out. A switch of version 99 leaves out properties whose type word has bit 2, 5, 6
 * or 31.
 */

/*
 * Serializes a port's data. HYP_NO_MEMORY; HYP_LIMIT_EXCEEDED (a buffer too small, or a list whose size does
 * not agree with its entries). The block comes from the data list's own allocator. No lock.
 */
HYP_ReturnStatus DVSState_PortSerialize(DVSPort *port, void **buf, uint32_t *len);

/* Serializes a switch. Statuses as above; HYP_BAD_PARAM for a value that no entry can have. No lock. */
HYP_ReturnStatus DVSState_SwitchSerialize(DVSwitch *sw, void **buf, uint32_t *len);

/*
 * Serializes the whole table. HYP_NO_MEMORY; HYP_LIMIT_EXCEEDED (a buffer too small); HYP_EXISTS when a
 * switch could not be serialized, whatever the reason. Holds the lock throughout.
 */
HYP_ReturnStatus DVSState_ConfigSerialize(void **buf, uint32_t *len);

/*
 * Adds a port from its serialized data, as the kind these carry, else as an active one. The statuses of
 * DVSState_PortAdd and of DVSData_Deserialize; HYP_BAD_PARAM also for a kind of less than four bytes;
 * HYP_NOT_FOUND when there is no switch. The caller holds the lock where several threads are about.
 */
HYP_ReturnStatus DVSState_PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_PortDeserialize(const char *switchId, const char *portId, const void *buf,
                                          uint32_t len);

/*
 * Adds a switch from its buffer. One that is there already keeps its version, class and limits: its property
 * lists are replaced (one that the buffer lacks: the switch is left without) and the ports are added.
 *
 * HYP_OK.
 * HYP_NOT_FOUND  a field is missing, or the switch went away meanwhile.
 * HYP_BAD_PARAM  a version or limit of less than four bytes.
 * Any other      that of DVSData_Deserialize, DVSState_SwitchAdd or DVSState_PortAddDeserialize.
 *
 * When a port fails, a switch that this call created is removed again; one that was there keeps what it got
 * so far. The caller holds the lock where several threads are about.
 */
HYP_ReturnStatus DVSState_SwitchDeserialize(const char *switchId, const void *buf, uint32_t len);

/*
 * Adds every switch of a state; those already in the table stay and are merged as above. A buffer that is no
 * state leaves the table as it was; a switch that fails empties it, and its status is the result. The caller
 * holds the lock where several threads are about.
 */
HYP_ReturnStatus DVSState_ConfigDeserialize(const void *buf, uint32_t len);

/* ---- The whole table ---- */

/* Removes every switch. HYP_EXISTS when one cannot be removed; the rest stays then. Holds the lock
 * throughout. */
HYP_ReturnStatus DVSState_ConfigReset(void);

/*
 * Removes the switches that are not to be persisted: those whose global property
 * "com.orbeno.common.volatile.nopersist" begins with a byte other than 0.
 *
 * parked      32 slots. When true is returned, all remaining switches, which have left the table and belong
 *             to the caller (see DVSState_FreeDVSArray); otherwise NULL in each.
 * removedIds  32 rows; the first ones receive the ids of the removed switches, the rest is untouched.
 * park        whether to move the remaining switches away at all.
 *
 * True when `park` was set and a switch was removed. Holds the lock throughout.
 */
bool DVSState_StripDvsWithNoPersistFlag(DVSwitch *parked[32], char removedIds[32][64], bool park);

/*
 * Puts the switches of the given ids, as far as the global table has them, into free slots of `table`, and
 * then exchanges `table` and the global table: the ids' switches join the parked ones, and what the global
 * table held besides is left in `table`. All 32 rows count; an unused one is an empty text. C callers cast
 * their rows to const. Holds the lock throughout.
 */
void DVSState_UpdateGlobalSwsArray(DVSwitch *table[32], const char ids[32][64]);

/*
 * Frees all switches: those of the global table, which ends up empty, and those of `table`, whose pointers
 * are not to be used afterwards. Holds the lock throughout.
 */
void DVSState_FreeDVSArray(DVSwitch *table[32]);

#ifdef __cplusplus
}
#endif

#endif
