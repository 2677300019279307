/* SPDX-License-Identifier: Apache-2.0 */
// Converters of single values (scalars.h); called through the converter table.

#include "configstore/converters/scalars.h"

#include "configstore/converters/common.h"

namespace dvs::convert {
namespace {

constexpr uint32_t kPassthroughAllowed = 2;

// What a bool field loads as. The texts' lengths are the ones readers of these properties have always been
// given: "true" with its NUL, in one case with a stray 'f' behind it, and "false" without a NUL.
constexpr uint8_t kTrueText[] = {'t', 'r', 'u', 'e', 0};
constexpr uint8_t kTrueTextLong[] = {'t', 'r', 'u', 'e', 0, 'f'};
constexpr uint8_t kFalseText[] = {'f', 'a', 'l', 's', 'e'};
constexpr uint8_t kEnabledText[] = {'e', 'n', 'a', 'b', 'l', 'e', 'd', 0};

// Reads the leaf as a bool and stores the bytes that stand for it; no bytes mean no property.
int32_t LoadBoolAs(const LoadArgs &args, std::span<const uint8_t> whenTrue,
                   std::span<const uint8_t> whenFalse) {
    bool flag = false;
    const int32_t status = configstore::GetValueBool(args.parent, args.leaf, &flag);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    const auto value = flag ? whenTrue : whenFalse;
    return value.empty() ? 0 : Store(args, value);
}

} // namespace

int32_t SaveUint32(const SaveArgs &args) {
    if (args.value.size() < sizeof(uint32_t)) return kFailed;
    return configstore::SetValueUint32(args.parent, args.leaf, GetU32(args.value, 0));
}

int32_t LoadUint32(const LoadArgs &args) {
    uint32_t number = 0;
    const int32_t status = configstore::GetValueUint32(args.parent, args.leaf, &number);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    return StoreNumber(args, number);
}

int32_t LoadMtu(const LoadArgs &args) {
    const bool wanted = args.key == "com.orbeno.common.portset.mtu" ||
                        (args.context.switchClass == 1 && args.key == "com.orbeno.vswitch.mtu") ||
                        (args.context.switchClass == 0 && args.key == "com.orbeno.etherswitch.mtu");
    return wanted ? LoadUint32(args) : 0;
}

int32_t SaveText(const SaveArgs &args) {
    return SetText(args.parent, args.leaf, args.value);
}

int32_t LoadText(const LoadArgs &args) {
    if (args.context.switchClass == 0 ? args.key == "com.orbeno.vswitch.multicastFilter"
                            : args.key == "com.orbeno.etherswitch.multicastFilter")
        return 0;
    StoreText text;
    const int32_t status = text.Read(args.parent, args.leaf);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    return Store(args, text.bytes());
}

int32_t SaveBoolByte(const SaveArgs &args) {
    if (args.value.empty()) return kFailed;
    return configstore::SetValueBool(args.parent, args.leaf, args.value[0] != 0);
}

int32_t LoadBoolByte(const LoadArgs &args) {
    constexpr uint8_t one[] = {1};
    constexpr uint8_t zero[] = {0};
    return LoadBoolAs(args, one, zero);
}

int32_t SaveBoolText(const SaveArgs &args) {
    return configstore::SetValueBool(args.parent, args.leaf, BeginsWithText(args.value, "true"));
}

int32_t LoadBoolText(const LoadArgs &args) {
    return LoadBoolAs(args, kTrueTextLong, kFalseText);
}

int32_t LoadOverlayFlag(const LoadArgs &args) {
    return LoadBoolAs(args, kTrueText, kFalseText);
}

int32_t SavePassthrough(const SaveArgs &args) {
    if (args.value.size() < sizeof(uint32_t)) return kFailed;
    return configstore::SetValueBool(args.parent, args.leaf, GetU32(args.value, 0) == kPassthroughAllowed);
}

int32_t LoadPassthrough(const LoadArgs &args) {
    constexpr uint8_t allowed[] = {kPassthroughAllowed, 0, 0, 0};
    constexpr uint8_t denied[] = {0, 0, 0, 0};
    return LoadBoolAs(args, allowed, denied);
}

int32_t SavePortIpfix(const SaveArgs &args) {
    return configstore::SetValueBool(args.parent, args.leaf, BeginsWithText(args.value, "enabled"));
}

int32_t LoadPortIpfix(const LoadArgs &args) {
    return LoadBoolAs(args, kEnabledText, {});
}

} // namespace dvs::convert
