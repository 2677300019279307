/* SPDX-License-Identifier: Apache-2.0 */
// Traffic shaping of a port, one record for each direction <-> the objects "in_shaping_policy" and
// "out_shaping_policy". Called through the converter table.

#include "configstore/converters/shaping.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/shaping.h"

namespace dvs::convert {
namespace {

using layout::At;
using layout::kShapingPolicy;
using layout::Slot;

constexpr uint64_t kBitsPerByte = 8;

struct NamedSlot {
    const char *name;
    Slot<uint64_t> slot;
};
constexpr NamedSlot kLimits[] = {
    {"average_bandwidth", At<uint64_t>(kShapingPolicy, "average_bandwidth")},
    {"peak_bandwidth", At<uint64_t>(kShapingPolicy, "peak_bandwidth")},
    {"burst_size", At<uint64_t>(kShapingPolicy, "burst_size")},
};

// Each direction's key goes with its own leaf and no other.
bool IsDirection(const LoadArgs &args, std::string_view key, const char *leaf) {
    return args.key == key && std::strcmp(args.leaf, leaf) == 0;
}

} // namespace

int32_t SaveShaping(const SaveArgs &args) {
    if (args.value.size() < kShapingPolicy.size) return kFailed;
    configstore::Object *policy = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &policy);
    if (status) return status;
    status = configstore::SetValueBool(policy, "enabled", true);
    for (const NamedSlot &limit : kLimits) {
        if (status) return status;
        // Modulo 2^64, as the product always was.
        const uint64_t bits = Get(args.value, limit.slot) * kBitsPerByte;
        status = configstore::SetValueLong(policy, limit.name, static_cast<int64_t>(bits));
    }
    return status;
}

int32_t LoadShaping(const LoadArgs &args) {
    if (!IsDirection(args, "com.orbeno.common.port.shaper.input", "in_shaping_policy") &&
        !IsDirection(args, "com.orbeno.common.port.shaper.output", "out_shaping_policy")) {
        return 0;
    }
    configstore::Object *policy = nullptr;
    if (configstore::GetSubObject(args.parent, args.leaf, nullptr, &policy) || !policy) return 0;
    uint8_t value[kShapingPolicy.size] = {};
    for (const NamedSlot &limit : kLimits) {
        int64_t bits = 0;
        if (configstore::GetValueLong(policy, limit.name, &bits)) continue;
        Put(std::span<uint8_t>(value), limit.slot,
            static_cast<uint64_t>(bits / static_cast<int64_t>(kBitsPerByte)));
    }
    return Store(args, value);
}

} // namespace dvs::convert
