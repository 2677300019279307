/* SPDX-License-Identifier: Apache-2.0 */
// Traffic filters of a port: a count and filters of variable size <-> the instances of "network_filters" in
// the object "filter_policy". Called through the converter table.

#include "configstore/converters/filters.h"

#include <cinttypes>
#include <cstdio>
#include <limits>

#include "configstore/converters/common.h"
#include "configstore/layouts/filters.h"
#include "platform/runtime.h"

namespace dvs::convert {
namespace {

using layout::AreaOf;
using layout::At;
using layout::filters::kFilter;
using layout::filters::kParameter;

constexpr auto kFilterCount = At<uint32_t>(layout::kFilterConfig, "filter_count");
constexpr auto kSlotNumber = At<uint32_t>(kFilter, "slot_number");
constexpr auto kAgentName = AreaOf(kFilter, "agent_name");
constexpr auto kParameterCount = At<uint32_t>(kFilter, "parameter_count");
constexpr auto kOnFailure = At<uint32_t>(kFilter, "on_failure");
constexpr auto kOrdinal = At<uint32_t>(kParameter, "ordinal");
constexpr auto kParameterText = AreaOf(kParameter, "text");

constexpr std::size_t kHeadSize = layout::kFilterConfig.size;
constexpr uint32_t kFailOpen = 1;

std::size_t FilterSize(std::span<const uint8_t> filter) {
    return kFilter.size + std::size_t{Get(filter, kParameterCount)} * kParameter.size;
}

// Whether all filters that the count announces lie in the value, with all of their parameters.
bool IsWhole(std::span<const uint8_t> value) {
    if (value.size() < kHeadSize) return false;
    auto rest = value.subspan(kHeadSize);
    for (uint32_t i = 0, count = Get(value, kFilterCount); i < count; ++i) {
        if (rest.size() < kFilter.size) return false;
        if (!HoldsRecords(rest, kFilter.size, Get(rest, kParameterCount), kParameter.size)) return false;
        rest = rest.subspan(FilterSize(rest));
    }
    return true;
}

// `bytes` starts at the filter and runs to the value's end: a text that lacks its NUL ends there.
int32_t SaveFilter(configstore::Object *policy, std::span<const uint8_t> bytes) {
    char text[16];
    const uint32_t slot = Get(bytes, kSlotNumber);
    std::snprintf(text, sizeof text, "%" PRId32, static_cast<int32_t>(slot));
    configstore::Object *filter = nullptr;
    int32_t status = GetOrCreateSubObject(true, policy, "network_filters", text, &filter);
    if (status) return status;
    status = SetText(filter, "agent_name", bytes.subspan(kAgentName.offset));
    if (status) return status;
    // The same number once more, this time without its sign.
    std::snprintf(text, sizeof text, "%" PRIu32, slot);
    status = configstore::SetValueStr(filter, "slot_number", text);
    if (status) return status;
    const char *onFailure = Get(bytes, kOnFailure) == kFailOpen ? "FAIL_OPEN" : "FAIL_CLOSED";
    status = configstore::SetValueStr(filter, "on_failure", onFailure);
    if (status) return status;
    status = configstore::SetValueEmptyList(filter, "parameters");
    const std::size_t end = FilterSize(bytes);
    for (std::size_t at = kFilter.size; at < end && !status; at += kParameter.size) {
        status = AppendText(filter, "parameters", bytes.subspan(at + kParameterText.offset));
    }
    return status;
}

uint32_t SlotNumberOf(configstore::Object *filter) {
    StoreText text;
    uint32_t number = 0;
    if (text.Read(filter, "slot_number") == 0)
        number = static_cast<uint32_t>(std::strtoul(text.get(), nullptr, 10));
    return number;
}

// Copies with the check that ends the process where the text and its NUL do not fit.
void CopyChecked(std::span<uint8_t> record, layout::Area area, const char *text) {
    const auto slot = record.subspan(area.offset, area.size);
    Str_Strcpy(reinterpret_cast<char *>(slot.data()), text, slot.size());
}

void LoadFilter(configstore::Object *filter, std::span<uint8_t> bytes) {
    Put(bytes, kSlotNumber, SlotNumberOf(filter));
    StoreText text;
    if (text.Read(filter, "agent_name") == 0) CopyChecked(bytes, kAgentName, text.get());
    const bool isOpen = text.Read(filter, "on_failure") == 0 && std::strcmp(text.get(), "FAIL_OPEN") == 0;
    Put(bytes, kOnFailure, isOpen ? kFailOpen : 0);
    StoreTexts parameters;
    (void)parameters.Read(filter, "parameters"); // a list that cannot be read is no list
    auto items = parameters.items();
    // No room was made for a list that could not be read when it was counted.
    if (!HoldsRecords(bytes, kFilter.size, items.size(), kParameter.size)) items = {};
    Put(bytes, kParameterCount, static_cast<uint32_t>(items.size()));
    for (std::size_t i = 0; i < items.size(); ++i) {
        const auto parameter = bytes.subspan(kFilter.size + i * kParameter.size, kParameter.size);
        Put(parameter, kOrdinal, static_cast<uint32_t>(i));
        CopyChecked(parameter, kParameterText, items[i]);
    }
}

// Bytes for all filters and all of their parameters.
uint64_t SizeOf(std::span<configstore::Object *const> filters) {
    uint64_t size = kHeadSize + filters.size() * kFilter.size;
    for (configstore::Object *filter : filters) {
        StoreTexts parameters;
        if (parameters.Read(filter, "parameters") == 0) size += parameters.items().size() * kParameter.size;
    }
    return size;
}

} // namespace

int32_t SaveFilters(const SaveArgs &args) {
    if (!IsWhole(args.value)) return kFailed;
    configstore::Object *policy = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &policy);
    if (status) return status;
    status = configstore::SetValueEmptyList(policy, "network_filters");
    auto rest = args.value.subspan(kHeadSize);
    for (uint32_t i = 0, count = Get(args.value, kFilterCount); i < count && !status; ++i) {
        status = SaveFilter(policy, rest);
        rest = rest.subspan(FilterSize(rest));
    }
    return status;
}

int32_t LoadFilters(const LoadArgs &args) {
    configstore::Object *policy = nullptr;
    const int32_t status = configstore::GetSubObject(args.parent, args.leaf, nullptr, &policy);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    Instances filters;
    (void)filters.Read(policy, "network_filters"); // a list that cannot be read is no list
    const uint64_t size = SizeOf(filters.items());
    if (size > std::numeric_limits<int32_t>::max()) return kFailed;
    Block block;
    if (!block.Allocate(size)) {
        args.context.messages.Error("Failed to alloc memory for DVFilterConfig\n");
        return kFailed;
    }
    const auto value = block.bytes();
    Put(value, kFilterCount, static_cast<uint32_t>(filters.items().size()));
    std::size_t at = kHeadSize;
    for (configstore::Object *filter : filters.items()) {
        // Every filter goes behind the fixed part of the one before, over its parameters, and the room at the
        // end stays empty. Readers have been given this shape ever since.
        LoadFilter(filter, value.subspan(at));
        at += kFilter.size;
    }
    return Store(args, value);
}

} // namespace dvs::convert
