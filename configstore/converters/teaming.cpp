/* SPDX-License-Identifier: Apache-2.0 */
// Teaming policies: one record of 2616 bytes <-> the object "uplink_teaming_policy". Called through the
// converter table (table.cpp).

#include "configstore/converters/teaming.h"

#include <algorithm>

#include "configstore/converters/common.h"
#include "configstore/layouts/teaming.h"

const char *TEAMING_POLICY_SCHEMA[] = {
    nullptr,
    "LOADBALANCE_IP",
    "LOADBALANCE_SRCMAC",
    "LOADBALANCE_SRCID",
    "LOADBALANCE_LOADBASED",
    "FAILOVER_EXPLICIT",
    nullptr,
};

// By slot of the table above. The last two stand in the kernel's order, which is not that table's: a save
// takes the value for the slot and a load goes through here, so 4 comes back as 5 and 5 as 4.
int32_t TEAMING_POLICY_ENUM[] = {0, 1, 2, 3, 5, 4};

const char *NIC_TEAMING_POLICY_MODE_2_CHARS[] = {
    nullptr,
    "LOADBALANCE_IP",
    "LOADBALANCE_SRCMAC",
    "LOADBALANCE_SRCID",
    "FAILOVER_EXPLICIT",
    "LOADBALANCE_LOADBASED",
};

int32_t TeamingPolicyFromSchema(const char *text, int32_t *value) {
    const auto slot = text ? dvs::convert::EnumIndex(TEAMING_POLICY_SCHEMA, text) : std::nullopt;
    *value = slot && *slot < std::size(TEAMING_POLICY_ENUM) ? TEAMING_POLICY_ENUM[*slot] : 0;
    return 0;
}

namespace dvs::convert {
namespace {

static_assert(std::size(NIC_TEAMING_POLICY_MODE_2_CHARS) == layout::teaming::kPolicies.textCount);

using layout::At;
using layout::kTeamingPolicy;

constexpr auto kPolicy = At<int32_t>(kTeamingPolicy, "policy");
constexpr auto kFailureFlags = At<uint32_t>(kTeamingPolicy, "failure_flags");
constexpr auto kPercentage = At<uint8_t>(kTeamingPolicy, "percentage");
constexpr auto kFullDuplex = At<uint8_t>(kTeamingPolicy, "full_duplex");
constexpr auto kSpeed = At<uint16_t>(kTeamingPolicy, "speed");
constexpr auto kBehaviourFlags = At<uint32_t>(kTeamingPolicy, "behaviour_flags");
constexpr auto kActiveCount = At<uint32_t>(kTeamingPolicy, "active_count");
constexpr auto kStandbyCount = At<uint32_t>(kTeamingPolicy, "standby_count");

constexpr std::size_t kNamesOffset = kTeamingPolicy.size;
constexpr std::size_t kNameSize = layout::teaming::kName.size;
constexpr std::size_t kNameSlots = layout::teaming::kNameSlots;
constexpr std::size_t kRecordSize = kNamesOffset + kNameSlots * kNameSize;

constexpr uint32_t kCheckBeacon = 0x20;
constexpr uint32_t kLinkStateOnly = 0x80;
constexpr uint32_t kFromStore = 0x200;

enum class Family { kEtherswitch, kVswitch };

struct NamedBit {
    const char *name;
    uint32_t bit;
};
// In the order in which they are written.
constexpr NamedBit kBehaviour[] = {
    {"reverse_policy", 0x02}, {"rolling_order", 0x08}, {"notify_switches", 0x20},
    {"best_effort", 0x04},    {"shotgun", 0x10},
};

int32_t SaveFailureCriteria(const SaveArgs &args, configstore::Object *criteria, Family family) {
    const uint32_t flags = Get(args.value, kFailureFlags);
    int32_t status = configstore::SetValueBool(criteria, "check_beacon", flags & kCheckBeacon);
    if (status) return status;
    status = configstore::SetValueBool(criteria, "lc_link_state", flags & kLinkStateOnly);
    if (status) return status;
    status = configstore::SetValueUint16(criteria, "percentage", Get(args.value, kPercentage));
    if (status) return status;
    status = configstore::SetValueBool(criteria, "full_duplex", Get(args.value, kFullDuplex) != 0);
    if (status) return status;
    const uint16_t speed = Get(args.value, kSpeed);
    return family == Family::kEtherswitch ? configstore::SetValueUint16(criteria, "speed", speed)
                                          : configstore::SetValueInt(criteria, "speed", speed);
}

int32_t SaveUplinkOrder(const SaveArgs &args, configstore::Object *policy) {
    configstore::Object *order = nullptr;
    int32_t status = GetOrCreateSubObject(true, policy, "uplink_port_order", nullptr, &order);
    if (status) return status;
    status = configstore::SetValueEmptyList(order, "active_uplink_ports");
    if (status) return status;
    status = configstore::SetValueEmptyList(order, "standby_uplink_ports");
    const uint64_t active = Get(args.value, kActiveCount);
    const uint64_t all = active + Get(args.value, kStandbyCount);
    for (uint64_t i = 0; i < all && !status; ++i) {
        const char *list = i < active ? "active_uplink_ports" : "standby_uplink_ports";
        status = AppendText(order, list, args.value.subspan(kNamesOffset + i * kNameSize));
    }
    return status;
}

int32_t SaveTeaming(const SaveArgs &args, Family family) {
    if (!HoldsRecords(args.value, kNamesOffset, 0, kNameSize)) return kFailed;
    const uint64_t names = uint64_t{Get(args.value, kActiveCount)} + Get(args.value, kStandbyCount);
    if (!HoldsRecords(args.value, kNamesOffset, names, kNameSize)) return kFailed;

    configstore::Object *policy = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &policy);
    if (status == configstore::NOT_FOUND && family == Family::kEtherswitch) return 0;
    if (status) return status;

    const auto value = static_cast<uint32_t>(Get(args.value, kPolicy));
    if (const char *name = EnumText(TEAMING_POLICY_SCHEMA, value)) {
        status = configstore::SetValueStr(policy, "policy", name);
        if (status) return status;
    }

    configstore::Object *criteria = nullptr;
    status = GetOrCreateSubObject(true, policy, "failure_criteria", nullptr, &criteria);
    if (status && family == Family::kVswitch) return status;
    // The etherswitch policy does without its criteria where the object cannot be had.
    status = criteria ? SaveFailureCriteria(args, criteria, family) : 0;
    if (status) return status;

    const uint32_t behaviour = Get(args.value, kBehaviourFlags);
    for (const NamedBit &field : kBehaviour) {
        status = configstore::SetValueBool(policy, field.name, behaviour & field.bit);
        if (status) return status;
    }
    return SaveUplinkOrder(args, policy);
}

// A field that cannot be read counts as false.
bool ReadsTrue(configstore::Object *object, const char *name) {
    bool flag = false;
    return configstore::GetValueBool(object, name, &flag) == 0 && flag;
}

void LoadFailureCriteria(configstore::Object *policy, std::span<uint8_t> value) {
    configstore::Object *criteria = nullptr;
    if (configstore::GetSubObject(policy, "failure_criteria", nullptr, &criteria) || !criteria) return;
    uint32_t flags = kFromStore;
    if (ReadsTrue(criteria, "check_beacon")) flags |= kCheckBeacon;
    if (ReadsTrue(criteria, "lc_link_state")) flags |= kLinkStateOnly;
    Put(value, kFailureFlags, flags);
    // These three are looked for one level above the place where a save puts them, and the speed keeps its
    // low byte: the kernel has long been given zeros here, and keeps being given them.
    uint16_t number = 0;
    if (configstore::GetValueUint16(policy, "percentage", &number) == 0)
        Put(value, kPercentage, static_cast<uint8_t>(number));
    Put(value, kFullDuplex, ReadsTrue(policy, "full_duplex"));
    if (configstore::GetValueUint16(policy, "speed", &number) == 0)
        Put(value, kSpeed, static_cast<uint8_t>(number));
}

// Copies a list's names from slot `first` on and returns how many of them have a slot.
uint32_t LoadNames(configstore::Object *order, const char *list, std::span<uint8_t> value,
                   std::size_t first) {
    StoreTexts names;
    if (names.Read(order, list)) return 0;
    const std::size_t count = std::min(names.items().size(), kNameSlots - first);
    for (std::size_t i = 0; i < count; ++i) {
        CopyUnbounded(value, kNamesOffset + (first + i) * kNameSize, names.items()[i]);
    }
    return static_cast<uint32_t>(count);
}

int32_t LoadTeaming(const LoadArgs &args) {
    configstore::Object *policy = nullptr;
    if (configstore::GetSubObject(args.parent, args.leaf, nullptr, &policy) || !policy) return 0;

    uint8_t record[kRecordSize] = {};
    const std::span<uint8_t> value(record);
    StoreText name;
    if (name.Read(policy, "policy") == 0) {
        int32_t number = 0;
        (void)TeamingPolicyFromSchema(name.get(), &number); // never fails
        Put(value, kPolicy, number);
    }
    LoadFailureCriteria(policy, value);

    uint32_t behaviour = 0;
    for (const NamedBit &field : kBehaviour) {
        if (ReadsTrue(policy, field.name)) behaviour |= field.bit;
    }
    Put(value, kBehaviourFlags, behaviour);

    configstore::Object *order = nullptr;
    if (configstore::GetSubObject(policy, "uplink_port_order", nullptr, &order) == 0 && order) {
        const uint32_t active = LoadNames(order, "active_uplink_ports", value, 0);
        Put(value, kActiveCount, active);
        Put(value, kStandbyCount, LoadNames(order, "standby_uplink_ports", value, active));
    }
    return Store(args, value);
}

} // namespace

int32_t SaveEtherswitchTeaming(const SaveArgs &args) {
    return SaveTeaming(args, Family::kEtherswitch);
}

int32_t LoadEtherswitchTeaming(const LoadArgs &args) {
    return args.context.switchClass == 0 ? LoadTeaming(args) : 0;
}

int32_t SaveVswitchTeaming(const SaveArgs &args) {
    return args.context.switchClass == 0 ? 0 : SaveTeaming(args, Family::kVswitch);
}

int32_t LoadVswitchTeaming(const LoadArgs &args) {
    return args.context.switchClass == 0 ? 0 : LoadTeaming(args);
}

} // namespace dvs::convert
