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

typedef struct MXUserRecLock MXUserRecLock;  typedef struct BitVector BitVector;  typedef struct DVSPort DVSPort;
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wpedantic"
typedef struct DVSwitch {
   uint32_t numPorts, maxPorts, newMaxPorts, version;  char switchId[64], className[128];
   DVSData *globalPropList, *hostPropList;  uint32_t classFlags;  BitVector *portBitmap;  DVSPort *ports[];
} DVSwitch;
#pragma GCC diagnostic pop
struct DVSPort { char portId[48]; DVSData *portData; DVSwitch *owner; uint32_t portType; };
typedef enum { DVS_PORT_ACTIVE = 1, DVS_PORT_SHADOW = 2, DVS_PORT_ZOMBIE = 3, DVS_PORT_LOCAL_CACHE = 4 } DVSPortType;  /* stored as u32 */
typedef bool (*DVSSwitchForEachFn)(DVSwitch *sw, void *arg);
typedef bool (*DVSPortForEachFn)(DVSPort *port, void *arg);
typedef bool (*DVSPropForEachFn)(DVSDataEntry *entry, void *arg);
extern int32_t dvs_debug;
extern uint32_t uwMaxNumActivePortsSystemWide;
MXUserRecLock *DVSwitchHandleLock(void);              void DVSwitchHandleUnlock(MXUserRecLock *lock);
HYP_ReturnStatus DVSState_SwitchAdd(const char *switchId, const char *className, uint32_t maxPorts, uint32_t version);
HYP_ReturnStatus DVSState_SwitchRemove(const char *switchId);
DVSwitch *DVSState_SwitchFind(const char *switchId);
DVSwitch *DVSState_SwitchFindByUUID(const uint8_t uuid[16]);
DVSwitch *DVSState_SwitchFindByAlias(const char *alias);
void      DVSState_SwitchForEach(DVSSwitchForEachFn callback, void *arg);
HYP_ReturnStatus DVSState_SwitchSetVersion(const char *switchId, uint32_t version);
const char *DVS_SwitchId(DVSwitch *sw);  const char *DVS_ClassName(DVSwitch *sw);  const char *DVS_SwitchName(DVSwitch *sw);
void DVS_SetClassName(DVSwitch *sw, const char *className);
uint32_t DVS_Version(DVSwitch *sw);  uint32_t DVS_GetMaxPorts(DVSwitch *sw);  uint32_t DVS_GetNewMaxPorts(DVSwitch *sw);  uint32_t DVS_UpdateMaxPorts(DVSwitch *sw);
HYP_ReturnStatus DVSState_PortAdd(const char *switchId, const char *portId, DVSData *data);
HYP_ReturnStatus DVSState_LocalCachePortAdd(const char *switchId, const char *portId, DVSData *data);
HYP_ReturnStatus DVSState_PortAddShadow(const char *switchId, const char *portId, const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_PortRemove(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_PortRemoveShadow(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_PortRemoveZombie(const char *switchId, const char *portId);
HYP_ReturnStatus DVSState_LocalCachePortRemove(const char *switchId, const char *portId);
DVSPort *DVSState_FindPortByIDAndType(DVSwitch *sw, const char *portId, uint32_t kind);
DVSPort *DVSState_PortFindOnDVSwitch(DVSwitch *sw, const char *portId);
DVSPort *DVSState_PortFind(const char *switchId, const char *portId);
DVSPort *DVSState_PortFindShadow(const char *switchId, const char *portId);
DVSPort *DVSState_PortFindZombie(const char *switchId, const char *portId);
DVSPort *DVSState_LocalCachePortFind(const char *switchId, const char *portId);
DVSPort *DVSState_PortFindByUUID(const uint8_t uuid[16], const char *portId);
DVSPort *DVSState_PortFindShadowByUUID(const uint8_t uuid[16], const char *portId);
DVSPort *DVSState_PortFindByAliasType(DVSwitch *sw, const char *alias, uint32_t kind);
DVSPort *DVSState_PortFindByAliasOnDVS(DVSwitch *sw, const char *alias);
DVSPort *DVSState_PortFindByAlias(const char *switchAlias, const char *portAlias);
DVSPort *DVSState_PortFindShadowByAlias(const char *switchAlias, const char *portAlias);
void     DVSState_PortForEach(DVSwitch *sw, DVSPortForEachFn callback, void *arg);
const char *DVS_PortId(DVSPort *port);  const char *DVS_PortAlias(DVSPort *port);
/* Host and global properties: two families alike, the first on hostPropList, the second on globalPropList. */
HYP_ReturnStatus DVSState_HostPropSet(const char *switchId, const char *name, const void *data, uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSState_HostPropClear(const char *switchId, const char *name);
HYP_ReturnStatus DVSState_HostPropLookup(const char *switchId, const char *name, DVSDataEntry **entry);
HYP_ReturnStatus DVSState_HostPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len);
bool             DVSState_HostPropIsSet(DVSwitch *sw, const char *name);
HYP_ReturnStatus DVSState_HostPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg);   /* 1 when the callback stopped it */
HYP_ReturnStatus DVSState_GlobalPropSet(const char *switchId, const char *name, const void *data, uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSState_GlobalPropClear(const char *switchId, const char *name);
HYP_ReturnStatus DVSState_GlobalPropLookup(const char *switchId, const char *name, DVSDataEntry **entry);
HYP_ReturnStatus DVSState_GlobalPropRead(DVSwitch *sw, const char *name, void **data, uint32_t *len);
bool             DVSState_GlobalPropIsSet(DVSwitch *sw, const char *name);
HYP_ReturnStatus DVSState_GlobalPropForEach(DVSwitch *sw, DVSPropForEachFn callback, void *arg);   /* 1 when the callback stopped it */
HYP_ReturnStatus DVSState_PortDataGet(DVSPort *port, const char *name, void **data, uint32_t *len);
HYP_ReturnStatus DVSState_PortDataSet(DVSPort *port, const char *name, const void *data, uint32_t len, uint32_t propType);
HYP_ReturnStatus DVSState_PortDataClear(DVSPort *port, const char *name);
HYP_ReturnStatus DVSState_PortDataRead(DVSPort *port, const char *name, void **data, uint32_t *len);
HYP_ReturnStatus DVSState_PortDataForEach(DVSPort *port, DVSPropForEachFn callback, void *arg);
HYP_ReturnStatus DVSState_PortSerialize(DVSPort *port, void **buf, uint32_t *len);
HYP_ReturnStatus DVSState_SwitchSerialize(DVSwitch *sw, void **buf, uint32_t *len);
HYP_ReturnStatus DVSState_ConfigSerialize(void **buf, uint32_t *len);
HYP_ReturnStatus DVSState_PortAddDeserialize(DVSwitch *sw, const char *portId, const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_PortDeserialize(const char *switchId, const char *portId, const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_SwitchDeserialize(const char *switchId, const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_ConfigDeserialize(const void *buf, uint32_t len);
HYP_ReturnStatus DVSState_ConfigReset(void);
bool DVSState_StripDvsWithNoPersistFlag(DVSwitch *parked[32], char removedIds[32][64], bool park);
void DVSState_UpdateGlobalSwsArray(DVSwitch *table[32], const char ids[32][64]);
void DVSState_FreeDVSArray(DVSwitch *table[32]);

#ifdef __cplusplus
}
#endif

#endif
