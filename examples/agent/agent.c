/* SPDX-License-Identifier: Apache-2.0 */
/*
 * A minimal management agent: it sets up a switch in the switching module, then saves the module's live state
 * into the host's configuration store. Like real agents, it is plain C and links only the shared library.
 *
 *   agent setup SWITCH PORTS   adds a switch with PORTS named ports
 *   agent save [SWITCH]        saves one switch, or all of them
 *   agent list SWITCH          prints the switch's active ports with their connection ids
 *
 * Exit status: 0 success, 1 failure, 2 usage error.
 */
#include <inttypes.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <dvs/dvs.h>

/* The type word of values that the store supports. */
enum { PROP_TYPE = 0x10, SWITCH_VERSION = 12 };

static int failed(const char *what, HYP_ReturnStatus status) {
    fprintf(stderr, "agent: %s: status 0x%08" PRIx32 "\n", what, status);
    return 1;
}

static void *heap_alloc(uint64_t size) {
    return malloc(size);
}

/* A port is sent as its serialized property list. */
static HYP_ReturnStatus add_port(const char *sw, unsigned number) {
    char id[48];
    char alias[64];
    snprintf(id, sizeof id, "%u", number);
    snprintf(alias, sizeof alias, "port %u of the example", number);

    DVSData *data = NULL;
    HYP_ReturnStatus status = DVSData_Alloc(&data, heap_alloc, free);
    if (status != HYP_OK) return status;
    status =
        DVSData_Append(data, "com.orbeno.common.port.alias", alias, (uint32_t)strlen(alias) + 1, PROP_TYPE);
    void *buf = NULL; /* null: the list allocates it */
    uint32_t len = 0;
    if (status == HYP_OK) status = DVSData_Serialize(data, &buf, &len, SWITCH_VERSION);
    if (status == HYP_OK) status = DVSHYP_PortAdd(sw, id, buf, len);
    if (buf) DVSData_FreeAssocData(data, buf);
    DVSData_Free(data);
    return status;
}

static int setup(const char *sw, unsigned ports) {
    static const char alias[] = "example";
    HYP_ReturnStatus status = DVSHYP_SwitchAdd(sw, "vswitch", 0, SWITCH_VERSION);
    if (status != HYP_OK) return failed("adding the switch", status);
    status = DVSHYP_GlobalPropSet(sw, "com.orbeno.common.alias", alias, sizeof alias, PROP_TYPE);
    if (status != HYP_OK) return failed("naming the switch", status);
    /* The store keeps the version as a switch property; a switch saved without it cannot be loaded. */
    const uint32_t version = SWITCH_VERSION;
    status = DVSHYP_GlobalPropSet(sw, "com.orbeno.common.version", &version, sizeof version, PROP_TYPE);
    if (status != HYP_OK) return failed("stating the version", status);
    for (unsigned i = 1; i <= ports; i++) {
        status = add_port(sw, i);
        if (status != HYP_OK) return failed("adding a port", status);
    }
    status = DVSHYP_SwitchAssociate(sw);
    return status == HYP_OK ? 0 : failed("associating the switch", status);
}

static int save(const char *sw) {
    const int32_t result = DVSState_SaveToConfigStore_ByInstance(sw);
    if (result == 0) return 0;
    fprintf(stderr, "agent: the save failed: %" PRId32 "\n", result);
    return 1;
}

static int list(const char *sw) {
    DVSHYPPortList *ports = NULL;
    const HYP_ReturnStatus status = DVSHYP_SwitchPortList(sw, &ports, DVS_PORT_ACTIVE);
    if (status != HYP_OK) return failed("listing the ports", status);
    for (uint32_t i = 0; i < ports->numEntries; i++)
        printf("%s %" PRIu32 "\n", ports->entries[i].portId, ports->entries[i].connectionId);
    DVSHYP_DataFree(ports);
    return fflush(stdout) == 0 ? 0 : 1;
}

int main(int argc, char **argv) {
    if (argc == 4 && strcmp(argv[1], "setup") == 0)
        return setup(argv[2], (unsigned)strtoul(argv[3], NULL, 10));
    if ((argc == 2 || argc == 3) && strcmp(argv[1], "save") == 0) return save(argc == 3 ? argv[2] : NULL);
    if (argc == 3 && strcmp(argv[1], "list") == 0) return list(argv[2]);
    fprintf(stderr, "usage: agent setup SWITCH PORTS | save [SWITCH] | list SWITCH\n");
    return 2;
}
