/* SPDX-License-Identifier: Apache-2.0 */
#ifndef DVS_CONFIGSTORE_H
#define DVS_CONFIGSTORE_H

#include <stdbool.h>
#include <stdint.h>

#ifdef __cplusplus
extern "C" {
#endif

/*
 * The switches in the host's configuration store: saving a state buffer, loading one back, carrying an older
 * host's state file over, and the tables that say where each property lives in the store.
 *
 * Results are int32_t: 0, the store's own status (6 for what is absent, 2 for a busy store, …), or -1 for a
 * failure of the library's own. State buffers are those of DVSState_ConfigSerialize.
 *
 * Every save and the upgrade take the switch-state lock for their whole run and use the process-wide switch
 * table as scratch: it is reset before and after, so a caller must not keep switches of its own in it
 * meanwhile. The load and GetDvsBasicInfoFromFileHyp take no lock; run one operation of this family at a
 * time.
 *
 * Messages go to standard output as far as dvsconfigstore_debug lets them, the saves' and the upgrade's
 * start, end and timings to syslog. A sink set with DVSLog_SetSink gets all of them.
 */

/* Level of the messages: errors print at 0 or above, traces above 0. 10 at start. */
extern int32_t dvsconfigstore_debug;

/*
 * Saves the switches of a state buffer, each as one store object, all in one transaction: an object that
 * exists is emptied of everything this library writes and written afresh.
 *
 * buf, len  the state buffer. A buffer that does not deserialize counts as one without switches, which in a
 *           save of all deletes every switch of the store: DVSState_SaveBufToConfigStoreChecked refuses such
 *           a buffer.
 * switchId  saves this switch only and leaves all other objects alone. Where the buffer lacks it, its own
 *           object is deleted. NULL saves all, and deletes the objects of switches that the buffer does not
 *           hold.
 *
 * Returns 0 when everything is committed; -1 when the store cannot be opened, an object cannot be created,
 * memory is short or a value cannot be expressed; else the status of the store call that failed. The store is
 * then as it was. The switch-state lock stays held, and the table loaded, where the store cannot be opened
 * (-1) or the transaction cannot be begun (its status): callers of those two paths release it with
 * DVSwitchHandleUnlock.
 */
int32_t DVSState_SaveBufToConfigStore_ByInstance(const void *buf, uint32_t len, const char *switchId);

/* DVSState_SaveBufToConfigStore_ByInstance with no switch id. */
int32_t DVSState_SaveBufToConfigStore(const void *buf, uint32_t len);

/*
 * Fetches the kernel's persistent state (DVSHYP_PersistentStateGet) and saves it like
 * DVSState_SaveBufToConfigStore_ByInstance. -1 when it cannot be fetched, after a message with the cause.
 */
int32_t DVSState_SaveToConfigStore_ByInstance(const char *switchId);

/* DVSState_SaveToConfigStore_ByInstance with no switch id. */
int32_t DVSState_SaveToConfigStore(void);

/*
 * The save for everyone who is not sure of the buffer: verifies it first, every level of it, then saves as
 * DVSState_SaveBufToConfigStore_ByInstance does.
 *
 * Returns, with neither the store nor the switch table touched, the HYP_ReturnStatus of the fault as a signed
 * number where the buffer does not verify: HYP_BAD_PARAM (malformed), HYP_BAD_CHECKSUM, HYP_NOT_FOUND (a
 * switch without a field it must have), HYP_EXISTS (a port twice), HYP_LIMIT_EXCEEDED (more switches or ports
 * than this host takes), or what the host answers when asked for its limit. A message names the fault and
 * where it is.
 */
int32_t DVSState_SaveBufToConfigStoreChecked(const void *buf, uint32_t len, const char *switchId);

/*
 * Rebuilds a state buffer from the store's switch objects.
 *
 * out, outLen  receive the buffer and its length in bytes; released with free(). Untouched unless a buffer
 *              was made.
 * desired      loads the desired user configuration, each object completed with the "portset_name" of the
 *              current object at the same position; -1 where the two layers hold different numbers of
 *              switches.
 *
 * Returns 0 or the failing status. A switch that cannot be rebuilt ends the load WITHOUT a buffer and, where
 * its "uuid" still reads, with the result 0: test the buffer as well as the result.
 */
int32_t DVSState_LoadFromConfigStoreAsBuf(void **out, uint32_t *outLen, bool desired);

/*
 * Carries the identity of every switch of the host's state file into the store: name, uuid, port limit and,
 * from the host property "com.orbeno.common.host.portset", the port set's name. Switches without that
 * property are left as they are. A state file that is empty or cannot be read is no failure and touches
 * nothing.
 *
 * Returns 0, -1 or the failing store status. As with the saves, the switch-state lock stays held where the
 * store cannot be opened or the transaction cannot be begun.
 */
int32_t DVSState_RetrieveDVSUpgradeInfo(void);

/* What GetDvsBasicInfoFromFileHyp says of one switch. All pointers are lent by the switch table. */
typedef struct {
    const char *switchId;    /* the switch's id */
    const char *name;        /* its display name; "unknown" where it has none */
    const char *portsetName; /* the host property "com.orbeno.common.host.portset"; NULL where it is absent */
} DvsBasicInfoEntry;

typedef struct {
    DvsBasicInfoEntry entries[32]; /* `count` of them, in the order of the switch table */
    int32_t count;                 /* 0 where the state file cannot be read */
} DvsBasicInfo;

/*
 * Lists the switches of the host's state file. The switches stay in the switch table and the file's buffer
 * stays allocated: what the result points to is valid until the table is next reset. Takes no lock.
 */
DvsBasicInfo GetDvsBasicInfoFromFileHyp(void);

/* Whether `s` equals one of the first `n` texts of `array`; false where either is NULL or n is 0. */
bool StringExistInArray(const char *s, const char **array, uint32_t n);

/* Whose property it is; selects the mapping table. */
enum {
    DVS_PROP_CLASS_GLOBAL = 0, /* a switch's global property */
    DVS_PROP_CLASS_HOST = 1,   /* a switch's property on this host */
    DVS_PROP_CLASS_PORT = 2    /* a property of one port */
};

/* One row of a mapping table: where a property lives in the store, and which converter carries it there and
 * back. */
typedef struct {
    const char *key;   /* the property's key; "DEFAULT": the row for what no other takes; NULL at the end */
    char path[5][128]; /* names from the switch's or port's object down to the leaf; unused slots all zero */
    uint32_t depth;    /* how many names the path has; 0 at the end */
    uint32_t converterType; /* 0 to 36; 37 at the end */
    uint32_t loadPropType;  /* type word of what a load rebuilds from this row: 16; 0 at the end */
    uint32_t reserved;      /* always 0 */
} DVSProp2ConfigEntry;

#ifdef __cplusplus
static_assert(sizeof(DVSProp2ConfigEntry) == 664, "the rows are exported data");
#else
_Static_assert(sizeof(DVSProp2ConfigEntry) == 664, "the rows are exported data");
#endif

/*
 * The mapping tables, read from their first row to the end row: a save takes the first row of a key, a load
 * goes through them in order. Ordinary writable data: a changed row counts from the next switch on; nothing
 * locks them.
 */
extern DVSProp2ConfigEntry dvsGlobalProp2Config[], dvsPortProp2Config[], dvsHostProp2Config[];

/* The three tables by property class. */
extern DVSProp2ConfigEntry *dvsConfigMaps[];

/* dvsConfigMaps[kind]; the kind is not checked. */
DVSProp2ConfigEntry *GetConfigMap(int kind);

/* What a save clears out of an object that exists, each list ended by NULL: values, singleton sub-objects,
 * and lists of instances. */
extern const char *UNUSED_PRIMITIVE_PROPS[], *UNUSED_SINGLETON_PROPS[], *UNUSED_NON_SINGLETON_PROPS[];

/*
 * Enumerations: the store's text at the index of the value, NULL in an empty slot; and, named the other way
 * round, the value at the position of the text.
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
extern int32_t CHARS_2_CDP_MODE[];                     /* 3 values; the last stands for an unknown text */
extern int32_t CHARS_2_CDP_OPERATION[];                /* 5 values; the last stands for an unknown text */

#ifdef __cplusplus
}
#endif

#endif
