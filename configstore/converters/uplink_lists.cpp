/* SPDX-License-Identifier: Apache-2.0 */
// Converters of the uplink lists (uplink_lists.h); called through the converter table.

#include "configstore/converters/uplink_lists.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/scalars.h"

namespace dvs::convert {
namespace {

constexpr std::size_t kCountSize = sizeof(uint32_t);
constexpr std::size_t kKeySlotSize = layout::scalar::kKey.size;
constexpr std::size_t kNameSlotSize = layout::scalar::kName.size;

int32_t AppendSlots(const SaveArgs &args, uint32_t count, std::size_t slotSize) {
    for (uint32_t slot = 0; slot < count; ++slot) {
        const auto text = args.value.subspan(kCountSize + slot * slotSize);
        if (const int32_t status = AppendText(args.parent, args.leaf, text)) return status;
    }
    return 0;
}

int32_t StoreSlots(const LoadArgs &args, std::span<char *const> texts, std::size_t slotSize,
                   const char *noMemory) {
    Block value;
    if (!value.Allocate(texts.size() * slotSize + kCountSize)) {
        args.context.messages.Error("%s\n", noMemory);
        return kFailed;
    }
    PutU32(value.bytes(), 0, static_cast<uint32_t>(texts.size()));
    std::size_t offset = kCountSize;
    for (const char *text : texts) {
        CopyUnbounded(value.bytes(), offset, text);
        offset += slotSize;
    }
    return Store(args, value.bytes());
}

} // namespace

int32_t SaveUplinkKeys(const SaveArgs &args) {
    const auto count = CountOf(args.value, kKeySlotSize);
    if (!count) return kFailed;
    if (const int32_t status = configstore::SetValueEmptyList(args.parent, args.leaf)) return status;
    return AppendSlots(args, *count, kKeySlotSize);
}

int32_t LoadUplinkKeys(const LoadArgs &args) {
    StoreTexts texts;
    const int32_t status = texts.Read(args.parent, args.leaf);
    if (texts.items().empty()) return 0; // whatever the status
    if (status && status != configstore::NOT_FOUND) return status;
    return StoreSlots(args, texts.items(), kKeySlotSize, "Failed to alloc memory for DVSUplinkPortIds");
}

int32_t SaveUplinkNames(const SaveArgs &args) {
    const auto count = CountOf(args.value, kNameSlotSize);
    if (!count) return kFailed;
    if (*count == 0) return 0;
    (void)configstore::SetValueEmptyList(args.parent,
                                         args.leaf); // a list that cannot be emptied fails its appends
    return AppendSlots(args, *count, kNameSlotSize);
}

int32_t LoadUplinkNames(const LoadArgs &args) {
    StoreTexts texts;
    const int32_t status = texts.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    if (texts.items().empty()) return 0;
    return StoreSlots(args, texts.items(), kNameSlotSize, "Failed to alloc memory for DVSUplinkPorts");
}

} // namespace dvs::convert
