/* SPDX-License-Identifier: Apache-2.0 */
/* A C program like an agent: it uses only the public headers and the shared library. */

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include "dvs/dvs.h"

#define CHECK(condition)                                                                                     \
    do {                                                                                                     \
        if (!(condition)) {                                                                                  \
            fprintf(stderr, "%s:%d: %s does not hold\n", __FILE__, __LINE__, #condition);                    \
            return 1;                                                                                        \
        }                                                                                                    \
    } while (0)

static void *allocate(uint64_t size) { return malloc(size); }

static bool count_entry(const char *name, const void *data, uint32_t length, uint32_t type, void *arg) {
    (void)name, (void)data, (void)length, (void)type;
    ++*(int *)arg;
    return false;
}

static int lists(void) {
    DVSData *list = NULL, *copy = NULL;
    void *buffer = NULL;
    uint32_t length = 0, value = 1500;
    int entries = 0;

    CHECK(DVSData_Alloc(&list, allocate, free) == HYP_OK);
    CHECK(DVSData_Append(list, "com.orbeno.common.portset.mtu", &value, sizeof value, 0x20) == HYP_OK);
    CHECK(DVSData_Serialize(list, &buffer, &length, 9) == HYP_OK);
    CHECK(length == 164);
    CHECK(DVSData_Deserialize(&copy, buffer, length, allocate, free) == HYP_OK);
    DVSData_ForEach(copy, count_entry, &entries);
    CHECK(entries == 1);
    DVSData_FreeAssocData(list, buffer);
    DVSData_Free(copy);
    DVSData_Free(list);
    return 0;
}

static int switches(void) {
    void *state = NULL;
    uint32_t length = 0;
    DVSData *data = NULL;

    CHECK(DVSState_SwitchAdd("dvs-1", "etherswitch", 8, 9) == HYP_OK);
    CHECK(DVSState_SwitchAdd("dvs-1", "etherswitch", 8, 9) == HYP_EXISTS);
    CHECK(DVSState_GlobalPropSet("dvs-1", "com.orbeno.common.alias", "uplinks", 8, 0x20) == HYP_OK);
    CHECK(strcmp(DVS_SwitchName(DVSState_SwitchFind("dvs-1")), "uplinks") == 0);
    CHECK(DVSData_Alloc(&data, allocate, free) == HYP_OK);
    CHECK(DVSState_PortAdd("dvs-1", "p-1", data) == HYP_OK);
    CHECK(DVSState_ConfigSerialize(&state, &length) == HYP_OK);
    CHECK(DVSState_ConfigReset() == HYP_OK);
    CHECK(DVSState_SwitchFind("dvs-1") == NULL);
    CHECK(DVSState_ConfigDeserialize(state, length) == HYP_OK);
    CHECK(DVSState_PortFind("dvs-1", "p-1") != NULL);
    CHECK(DVSState_ConfigReset() == HYP_OK);
    free(state);
    return 0;
}

int main(void) { return lists() || switches(); }
