/* SPDX-License-Identifier: Apache-2.0 */
// Private VLAN map of a switch: entries of 8 bytes <-> the instances of "pvlans". Called through the
// converter table.

#include "configstore/converters/private_vlan.h"

#include "configstore/converters/common.h"
#include "configstore/converters/switch_version.h"
#include "configstore/layouts/private_vlan.h"
#include "dvsstate/versions.h"

const char *PVLAN_2_CHARS[] = {nullptr, "PROMISCUOUS", "ISOLATED", "COMMUNITY", nullptr};
int32_t CHARS_2_PVLAN[] = {-1, 1, 2, 3, -1};

namespace dvs::convert {
namespace {

static_assert(std::size(PVLAN_2_CHARS) == layout::pvlan::kPvlanTypes.textCount);

using layout::At;
using layout::pvlan::kEntry;

constexpr auto kPrimaryId = At<uint16_t>(kEntry, "primary_id");
constexpr auto kSecondaryId = At<uint16_t>(kEntry, "secondary_id");
constexpr auto kType = At<uint8_t>(kEntry, "type");

constexpr const char *kVswitchKey = "com.orbeno.vswitch.pvlanMap";
constexpr const char *kEtherswitchKey = "com.orbeno.etherswitch.pvlanMap";

int32_t SaveEntry(const SaveArgs &args, std::span<const uint8_t> entry) {
    StoreText id;
    int32_t status = id.Generate();
    if (status) return status;
    configstore::Object *instance = nullptr;
    status = GetOrCreateSubObject(true, args.parent, args.leaf, id.get(), &instance);
    if (status) return status;
    status = configstore::SetValueUint16(instance, "primary_id", Get(entry, kPrimaryId));
    if (status) return status;
    status = configstore::SetValueUint16(instance, "secondary_id", Get(entry, kSecondaryId));
    if (status) return status;
    return configstore::SetValueStr(instance, "type", EnumText(PVLAN_2_CHARS, Get(entry, kType)));
}

// The type byte of a store text; nothing, after a message, for a text that is none.
std::optional<uint8_t> ParseType(const Context &context, const char *text) {
    const auto index = EnumIndex(PVLAN_2_CHARS, text);
    if (!index) {
        context.messages.Error("Unknown PvlanType %s\n", text);
        return std::nullopt;
    }
    return static_cast<uint8_t>(CHARS_2_PVLAN[*index]);
}

int32_t LoadEntry(const Context &context, configstore::Object *instance, std::span<uint8_t> entry) {
    uint16_t id = 0;
    int32_t status = configstore::GetValueUint16(instance, "primary_id", &id);
    if (status) return status;
    Put(entry, kPrimaryId, id);
    status = configstore::GetValueUint16(instance, "secondary_id", &id);
    if (status) return status;
    Put(entry, kSecondaryId, id);
    StoreText text;
    status = text.Read(instance, "type");
    if (status) return status;
    const auto type = ParseType(context, text.get());
    if (!type) return kFailed;
    Put(entry, kType, *type);
    return 0;
}

// The one key that this switch keeps its map under.
int32_t ChooseKey(const Context &context, configstore::Object *switchObject, const char **key) {
    configstore::Object *product = nullptr;
    int32_t status = configstore::GetSubObject(switchObject, "product", nullptr, &product);
    if (status) {
        context.messages.Error("Failed to get product obj, rc: %d\n", status);
        return status;
    }
    StoreText forwardingClass;
    status = forwardingClass.Read(product, "forwarding_class");
    if (status) {
        context.messages.Error("Failed to get forwarding_class, rc: %d\n", status);
        return status;
    }
    SwitchVersion version = {};
    if (ReadSwitchVersion(context.messages, switchObject, &version)) return kFailed;
    const bool isVswitch =
        std::strcmp(forwardingClass.get(), "cswitch") == 0 || state::IsOverlayVersion(version.number);
    *key = isVswitch ? kVswitchKey : kEtherswitchKey;
    return 0;
}

} // namespace

int32_t SavePrivateVlans(const SaveArgs &args) {
    int32_t status = configstore::SetValueEmptyList(args.parent, args.leaf);
    const std::size_t count = args.value.size() / kEntry.size;
    for (std::size_t i = 0; i < count && !status; ++i) {
        status = SaveEntry(args, args.value.subspan(i * kEntry.size, kEntry.size));
    }
    return status;
}

int32_t LoadPrivateVlans(const LoadArgs &args) {
    const char *key = nullptr;
    int32_t status = ChooseKey(args.context, args.root, &key);
    if (status) return status;
    if (args.key != key) return 0;

    Instances entries;
    status = entries.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    if (entries.items().empty()) return 0;
    Block block;
    if (!block.Allocate(entries.items().size() * kEntry.size)) {
        args.context.messages.Error(key == kVswitchKey ? "Failed to alloc memory for VSPvlanMapEntry\n"
                                            : "Failed to alloc memory for ESPvlanMapEntry\n");
        return kFailed;
    }
    std::size_t at = 0;
    for (configstore::Object *instance : entries.items()) {
        status = LoadEntry(args.context, instance, block.bytes().subspan(at, kEntry.size));
        if (status) return status;
        at += kEntry.size;
    }
    return Store(args, block.bytes());
}

} // namespace dvs::convert
