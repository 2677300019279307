/* SPDX-License-Identifier: Apache-2.0 */
// Link discovery: two bytes <-> the object "link_discovery_protocol". Called through the converter table.

#include "configstore/converters/link_discovery.h"

#include "configstore/converters/common.h"
#include "configstore/layouts/link_discovery.h"

const char *CDP_MODE_2_CHARS[] = {"CDP", "LLDP", nullptr};
const char *CDP_OPERATION_2_CHARS[] = {"NONE", "LISTEN", "ADVERTISE", "BOTH", nullptr};
int32_t CHARS_2_CDP_MODE[] = {0, 1, 2};
int32_t CHARS_2_CDP_OPERATION[] = {0, 1, 2, 3, 4};

namespace dvs::convert {
namespace {

static_assert(std::size(CDP_MODE_2_CHARS) == layout::kCdpModes.textCount);
static_assert(std::size(CDP_OPERATION_2_CHARS) == layout::kCdpOperations.textCount);

constexpr auto kProtocol = layout::At<uint8_t>(layout::kLinkDiscovery, "protocol");
constexpr auto kOperation = layout::At<uint8_t>(layout::kLinkDiscovery, "operation");

// The value at a text's position, the last one for a text that has none.
uint8_t ValueOf(const char *text, std::span<const char *const> texts, std::span<const int32_t> values) {
    const auto index = EnumIndex(texts, text);
    return static_cast<uint8_t>(index ? values[*index] : values.back());
}

} // namespace

int32_t SaveLinkDiscovery(const SaveArgs &args) {
    if (args.value.size() < layout::kLinkDiscovery.size) return kFailed;
    configstore::Object *object = nullptr;
    if (GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &object) || !object) return kFailed;
    const int32_t status =
        configstore::SetValueStr(object, "protocol", EnumText(CDP_MODE_2_CHARS, Get(args.value, kProtocol)));
    if (status) return status;
    return configstore::SetValueStr(object, "operation",
                                    EnumText(CDP_OPERATION_2_CHARS, Get(args.value, kOperation)));
}

int32_t LoadLinkDiscovery(const LoadArgs &args) {
    configstore::Object *object = nullptr;
    int32_t status = configstore::GetSubObject(args.parent, args.leaf, nullptr, &object);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    StoreText protocol;
    status = protocol.Read(object, "protocol");
    if (status) return status;
    StoreText operation;
    status = operation.Read(object, "operation");
    if (status) return status;
    uint8_t record[layout::kLinkDiscovery.size];
    const std::span<uint8_t> value(record);
    Put(value, kProtocol, ValueOf(protocol.get(), CDP_MODE_2_CHARS, CHARS_2_CDP_MODE));
    Put(value, kOperation, ValueOf(operation.get(), CDP_OPERATION_2_CHARS, CHARS_2_CDP_OPERATION));
    return Store(args, value);
}

} // namespace dvs::convert
