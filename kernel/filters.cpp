/* SPDX-License-Identifier: Apache-2.0 */
// The exported name filters over property lists, used by retrieval and queries.

#include "kernel/filters.h"

#include <cstring>

#include "dvs/hyp.h"

namespace {

constexpr std::size_t kNameSize = sizeof(DVSDataEntry::name);

bool NameContains(const DVSDataEntry *entry, const char *needle) {
    return std::strstr(DVSData_Name(entry), needle) != nullptr;
}

bool IsListed(const DVSDataEntry *entry, const char **names) {
    if (!names) return false;
    for (; *names; names++) {
        if (std::strncmp(DVSData_Name(entry), *names, kNameSize) == 0) return true;
    }
    return false;
}

} // namespace

extern "C" HYP_ReturnStatus DVSHYPStripNamedProp(DVSData *list, const char *needle) {
    return dvs::hyp::KeepIf(list, [&](const DVSDataEntry *entry) { return !NameContains(entry, needle); });
}

extern "C" HYP_ReturnStatus DVSHYPStripNamedPropForType(DVSData *list, const char *needle, const char **keep,
                                                        uint32_t propType) {
    return dvs::hyp::KeepIf(list, [&](const DVSDataEntry *entry) {
        return (DVSData_IsSamePropType(entry, propType) && !NameContains(entry, needle)) ||
               IsListed(entry, keep);
    });
}

extern "C" HYP_ReturnStatus DVSHYPExtractNamedPropForType(DVSData *list, const char *needle,
                                                          uint32_t propType) {
    return dvs::hyp::KeepIf(list, [&](const DVSDataEntry *entry) {
        return DVSData_IsSamePropType(entry, propType) && NameContains(entry, needle);
    });
}
