/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_CONFIGSTORE_H
#define DVS_CONFIGSTORE_H

#include <stdbool.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * Saves and loads switches in the host's configuration store: save a state buffer, load one back, import an
 * older host's state file. Also the tables that map each property to its place in the store.
 *
 * Results are int32_t: 0, the store's own status (6 not found, 2 store busy, …), or -1 for a failure inside
 * the library. State buffers are those of DVSState_ConfigSerialize.
 *
 * Every save and the upgrade hold the switch-state lock for their whole run and use the process-wide switch
 * table as scratch: it is reset before and after. Do not call them while the table holds your own switches.
 * The load and GetDvsBasicInfoFromFileHyp take no lock; run one operation of this family at a time.
 *
 * Messages go to standard output according to dvsconfigstore_debug; the start, end and timings of saves and
 * of the upgrade go to syslog. A sink set with DVSLog_SetSink receives all of them.
 */

/* Level of the messages: errors print at 0 or above, traces above 0. Initially 10. */
extern int32_t dvsconfigstore_debug;

/*
 * Saves the switches of a state buffer, one store object each, in one transaction. An existing object is
 * cleared of everything this library writes, then written again.
 *
 * buf, len  the state buffer. A buffer that does not deserialize counts as one without switches; saving all
 *           then deletes every switch in the store. DVSState_SaveBufToConfigStoreChecked rejects such a
 *           buffer.
 * switchId  saves only this switch and does not touch other objects. If the buffer does not contain it, its
 *           object is deleted. NULL saves all switches and deletes the objects of switches that are not in
 *           the buffer.
 *
 * Returns 0 when everything is committed; -1 if the store cannot be opened, an object cannot be created,
 * memory runs out or a value cannot be converted; else the status of the failed store call. On failure the
 * store is unchanged. If the store cannot be opened (-1) or the transaction cannot be started (its status),
 * the switch-state lock stays held and the table stays loaded; the caller releases the lock with
 * DVSwitchHandleUnlock. If the transaction cannot be started, the store also stays open.
 */
int32_t DVSState_SaveBufToConfigStore_ByInstance(const void *buf, uint32_t len, const char *switchId);

/* DVSState_SaveBufToConfigStore_ByInstance with no switch id. */
int32_t DVSState_SaveBufToConfigStore(const void *buf, uint32_t len);

/*
 * Fetches the kernel's persistent state (DVSHYP_PersistentStateGet) and saves it like
 * DVSState_SaveBufToConfigStore_ByInstance. -1 if the fetch fails, after a message with the cause.
 */
int32_t DVSState_SaveToConfigStore_ByInstance(const char *switchId);

/* DVSState_SaveToConfigStore_ByInstance with no switch id. */
int32_t DVSState_SaveToConfigStore(void);

/*
 * The save for untrusted buffers: verifies every level of the buffer, then saves like
 * DVSState_SaveBufToConfigStore_ByInstance.
 *
 * If the buffer does not verify, touches neither the store nor the switch table and returns the
 * HYP_ReturnStatus of the fault as a signed number: HYP_BAD_PARAM (malformed), HYP_BAD_CHECKSUM,
 * HYP_NOT_FOUND (a switch lacks a required field), HYP_EXISTS (duplicate port), HYP_LIMIT_EXCEEDED (more
 * switches or ports than this host allows), or the status of the failed query for the host's limit. A message
 * names the fault and its location.
 */
int32_t DVSState_SaveBufToConfigStoreChecked(const void *buf, uint32_t len, const char *switchId);

/*
 * Rebuilds a state buffer from the store's switch objects.
 *
 * out, outLen  receive the buffer and its length in bytes; released with free(). Untouched if no buffer is
 *              created.
 * desired      true loads the desired user configuration; each object gets the "portset_name" of the current
 *              object at the same position. -1 if the two layers hold different numbers of switches.
 *
 * Returns 0 or the failing status. If a switch cannot be rebuilt, the load returns NO buffer and, if the
 * switch's "uuid" is readable, still returns 0: check the buffer as well as the result.
 */
int32_t DVSState_LoadFromConfigStoreAsBuf(void **out, uint32_t *outLen, bool desired);

/*
 * Copies the identity of every switch in the host's state file into the store: name, uuid, port limit and,
 * from the host property "com.orbeno.common.host.portset", the port set's name. Skips switches without that
 * property. An empty or unreadable state file is not a failure; nothing is touched.
 *
 * Returns 0, -1 or the failing store status. As with the saves, the switch-state lock stays held if the
 * store cannot be opened or the transaction cannot be started.
 */
int32_t DVSState_RetrieveDVSUpgradeInfo(void);

/* One switch in the result of GetDvsBasicInfoFromFileHyp. The switch table owns the strings. */
typedef struct {
    const char *switchId;    /* the switch's id */
    const char *name;        /* its display name; "unknown" if it has none */
    const char *portsetName; /* the host property "com.orbeno.common.host.portset"; NULL if absent */
} DvsBasicInfoEntry;

typedef struct {
    DvsBasicInfoEntry entries[32]; /* the first `count` are valid, in the order of the switch table */
    int32_t count;                 /* 0 if the state file cannot be read */
} DvsBasicInfo;

/*
 * Lists the switches of the host's state file. The switches stay in the switch table and the file's buffer
 * stays allocated, so the result is valid until the next reset of the table. Takes no lock.
 */
DvsBasicInfo GetDvsBasicInfoFromFileHyp(void);

/* True if `s` equals one of the first `n` texts of `array`; false if either is NULL or n is 0. */
bool StringExistInArray(const char *s, const char **array, uint32_t n);

/* Class of a property; selects the mapping table. */
enum {
    DVS_PROP_CLASS_GLOBAL = 0, /* a switch's global property */
    DVS_PROP_CLASS_HOST = 1,   /* a switch's property on this host */
    DVS_PROP_CLASS_PORT = 2    /* a property of one port */
};

/* One row of a mapping table: where a property lives in the store, and which converter saves and loads it. */
typedef struct {
    const char *key;   /* the property's key; "DEFAULT" for keys without a row; NULL in the end row */
    char path[5][128]; /* names from the switch's or port's object down to the leaf; unused slots all zero */
    uint32_t depth;    /* number of names in the path; 0 in the end row */
    uint32_t converterType; /* 0 to 36; 37 in the end row */
    uint32_t loadPropType;  /* type word of the loaded property: 16; 0 in the end row */
    uint32_t reserved;      /* always 0 */
} DVSProp2ConfigEntry;

#ifdef __cplusplus
static_assert(sizeof(DVSProp2ConfigEntry) == 664, "the rows are exported data");
#else
_Static_assert(sizeof(DVSProp2ConfigEntry) == 664, "the rows are exported data");
#endif

/*
 * The mapping tables, from their first row to the end row. A save uses the first row with the key; a load
 * processes the rows in order. Ordinary writable data: a changed row takes effect from the next switch on.
 * No lock protects them.
 */
extern DVSProp2ConfigEntry dvsGlobalProp2Config[], dvsPortProp2Config[], dvsHostProp2Config[];

/* The three tables by property class. */
extern DVSProp2ConfigEntry *dvsConfigMaps[];

/* dvsConfigMaps[kind]; the kind is not checked. */
DVSProp2ConfigEntry *GetConfigMap(int kind);

/* What a save clears from an existing object: values, singleton sub-objects and lists of instances. Each list
 * is NULL-terminated. */
extern const char *UNUSED_PRIMITIVE_PROPS[], *UNUSED_SINGLETON_PROPS[], *UNUSED_NON_SINGLETON_PROPS[];

/*
 * Enumerations. Value-to-text arrays hold the store's text at the index of the value, NULL in an empty slot.
 * Text-to-value arrays hold the value at the position of the text.
 */
extern const char *TEAMING_POLICY_SCHEMA[]; /* 7 slots, the first and the last empty */
extern int32_t TEAMING_POLICY_ENUM[];       /* 6 values by slot of TEAMING_POLICY_SCHEMA; not its inverse */
extern const char *NIC_TEAMING_POLICY_MODE_2_CHARS[]; /* 6 slots: the kernel's order, the first empty */
extern const char *PVLAN_2_CHARS[];                   /* 5 slots, the first and the last empty */
extern int32_t CHARS_2_PVLAN[];                       /* 5 values */

enum { VSPAN_SESSION_TYPE_NUM = 6, VSPAN_ENCAP_TYPE_NUM = 3 };
extern const char *SESSION_TYPE_LOCAL_ENUM_2_SCHEMA[]; /* VSPAN_SESSION_TYPE_NUM slots, the last empty */
extern const char *ENCAP_TYPE_LOCAL_ENUM_2SCHEMA[];    /* VSPAN_ENCAP_TYPE_NUM slots */
extern const char *LACP_MODE_2_CAHRS[];                /* 4 slots, the last empty */
extern const char *LACP_LB_POLICY_SCHEMA[];            /* 22 slots, the last empty */
extern const char *CDP_MODE_2_CHARS[];                 /* 3 slots, the last empty */
extern const char *CDP_OPERATION_2_CHARS[];            /* 5 slots, the last empty */
extern int32_t CHARS_2_CDP_MODE[];                     /* 3 values; the last is for unknown texts */
extern int32_t CHARS_2_CDP_OPERATION[];                /* 5 values; the last is for unknown texts */

#ifdef __cplusplus
}
#endif

#endif
