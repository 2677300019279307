/* SPDX-License-Identifier: Apache-2.0 */
// IPFIX flow export: a packed record of 36 bytes <-> the object "ipfix". Called through the converter table.

#include "configstore/converters/ipfix.h"

#include "configstore/converters/address.h"
#include "configstore/converters/common.h"
#include "configstore/layouts/ipfix.h"

namespace dvs::convert {
namespace {

using layout::At;
using layout::kIpfix;

constexpr auto kIdleTimeout = At<uint32_t>(kIpfix, "idle_flow_timeout");
constexpr auto kActiveTimeout = At<uint32_t>(kIpfix, "active_flow_timeout");
constexpr auto kAddress = layout::AreaOf(kIpfix, "collector_address");
constexpr auto kPort = At<uint16_t>(kIpfix, "collector_port");
constexpr auto kSamplingRate = At<uint32_t>(kIpfix, "sampling_rate");
constexpr auto kInternalOnly = At<uint8_t>(kIpfix, "internal_flows_only");
constexpr auto kIsIpv6 = At<uint8_t>(kIpfix, "is_ipv6");
constexpr auto kDomainId = At<uint32_t>(kIpfix, "observation_domain_id");

void LoadAddress(configstore::Object *ipfix, std::span<uint8_t> value) {
    StoreText text;
    if (text.Read(ipfix, "collector_address")) return;
    bool isIpv6 = false;
    // A text that is no address leaves none, and nobody is told.
    if (ParseAddress(text.get(), value.subspan<kAddress.offset, kAddress.size>(), &isIpv6))
        Put(value, kIsIpv6, isIpv6);
}

} // namespace

int32_t SaveIpfix(const SaveArgs &args) {
    if (args.value.size() < kIpfix.size) return kFailed;
    configstore::Object *ipfix = nullptr;
    int32_t status = GetOrCreateSubObject(true, args.parent, args.leaf, nullptr, &ipfix);
    if (status) return status;
    status = configstore::SetValueUint32(ipfix, "idle_flow_timeout", Get(args.value, kIdleTimeout));
    if (status) return status;
    status = configstore::SetValueUint32(ipfix, "active_flow_timeout", Get(args.value, kActiveTimeout));
    if (status) return status;
    const auto address = args.value.subspan<kAddress.offset, kAddress.size>();
    const AddressText text = FormatAddress(address, Get(args.value, kIsIpv6) != 0);
    status = configstore::SetValueStr(ipfix, "collector_address", text.text);
    if (status) return status;
    status = configstore::SetValueUint16(ipfix, "collector_port", Get(args.value, kPort));
    if (status) return status;
    status = configstore::SetValueUint32(ipfix, "sampling_rate", Get(args.value, kSamplingRate));
    if (status) return status;
    status = configstore::SetValueBool(ipfix, "internal_flows_only", Get(args.value, kInternalOnly) != 0);
    if (status) return status;
    return configstore::SetValueUint32(ipfix, "observation_domain_id", Get(args.value, kDomainId));
}

int32_t LoadIpfix(const LoadArgs &args) {
    configstore::Object *ipfix = nullptr;
    const int32_t status = configstore::GetSubObject(args.parent, args.leaf, nullptr, &ipfix);
    if (status) return status == configstore::NOT_FOUND ? 0 : status;
    uint8_t record[kIpfix.size] = {};
    const std::span<uint8_t> value(record);
    LoadNumber(ipfix, "idle_flow_timeout", value, kIdleTimeout);
    LoadNumber(ipfix, "active_flow_timeout", value, kActiveTimeout);
    LoadAddress(ipfix, value);
    uint16_t port = 0;
    if (configstore::GetValueUint16(ipfix, "collector_port", &port) == 0) Put(value, kPort, port);
    LoadNumber(ipfix, "sampling_rate", value, kSamplingRate);
    bool internalOnly = false;
    if (configstore::GetValueBool(ipfix, "internal_flows_only", &internalOnly) == 0)
        Put(value, kInternalOnly, internalOnly);
    LoadNumber(ipfix, "observation_domain_id", value, kDomainId);
    return Store(args, value);
}

} // namespace dvs::convert
