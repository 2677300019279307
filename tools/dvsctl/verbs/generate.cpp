/* SPDX-License-Identifier: Apache-2.0 */
// `dvsctl generate`: states of any size for trials. Values are drawn in the typed form (generate_values.h)
// and become bytes the way those of a JSON document do; the same seed gives the same bytes on every machine.

#include <algorithm>
#include <charconv>
#include <unordered_map>

#include <boost/json/object.hpp>
#include <boost/json/serialize.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "dvs/configstore.h"
#include "dvs/state.h"
#include "dvsdata/format.h"
#include "form/encode.h"
#include "form/json/typed.h"
#include "tools/dvsctl/cli/commands.h"
#include "tools/dvsctl/verbs/generate_values.h"
#include "tools/dvsctl/verbs/put.h"

namespace dvs::ctl {

namespace {

using Buffer = std::vector<std::uint8_t>;

constexpr std::uint32_t kMostSwitches = 32;
constexpr std::uint32_t kMostPorts = 65536;
constexpr std::uint32_t kOpaqueType = 0x18;
constexpr std::string_view kClasses[] = {"etherswitch", "vswitch", "cswitch", "ovlvswitch", "stub-vswitch"};

Buffer NumberBytes(std::uint32_t number) {
    Buffer bytes(sizeof number);
    data::Store32(bytes.data(), number);
    return bytes;
}

Buffer TextBytes(std::string_view text, std::size_t size) {
    Buffer bytes(text.begin(), text.end());
    bytes.resize(size);
    return bytes;
}

NewEntry Text(std::string name, const std::string &text) {
    return {std::move(name), kDefaultType, TextBytes(text, text.size() + 1)};
}

/// Bytes of typed values. Ports are much alike: what has been built once is not built again.
class Values {
public:
    const Buffer &Of(const Owner &owner, const TypedProperty &property) {
        const std::string key = fmt::format("{} {} {} {}", owner.propClass, owner.version, property.name,
                                            boost::json::serialize(property.typed));
        if (const auto known = built_.find(key); known != built_.end()) return known->second;
        if (built_.size() >= kMostRemembered) built_.clear();
        NodeFlaw flaw;
        const auto node = NodeFromJson(property.typed, flaw);
        typed::Built built;
        if (node) built = typed::Build(owner.propClass, property.name, *node, {owner.version});
        if (!built.ok || !built.differences.empty())
            throw Error(ErrorKind::Failed, "a generated value does not fit its property")
                .At(std::string(property.name))
                .Field(built.field)
                .Because(!built.differences.empty() ? built.differences.front() : built.reason + flaw.reason);
        return built_[key] = std::move(built.bytes);
    }

private:
    static constexpr std::size_t kMostRemembered = 1 << 16;
    std::unordered_map<std::string, Buffer> built_;
};

std::vector<NewEntry> ToEntries(Values &values, const Owner &owner,
                                const std::vector<TypedProperty> &properties) {
    std::vector<NewEntry> entries;
    for (const TypedProperty &property : properties)
        entries.push_back({std::string(property.name), kStateType, values.Of(owner, property)});
    return entries;
}

// What has no row of its own: extra configuration, and bytes that only their owner understands.
void AddUnmapped(Random &r, std::vector<NewEntry> &global) {
    const std::uint32_t rack = r.Between(1, 40);
    global.push_back(Text("com.orbeno.extraconfig.site.location",
                          fmt::format("Rack {}, row {}", rack, r.OneOf({"A", "B", "C"}))));
    Buffer blob(r.Between(8, 64));
    for (std::uint8_t &byte : blob)
        byte = static_cast<std::uint8_t>(r.Below(256));
    global.push_back({"com.orbeno.common.inventory.blob", kOpaqueType, std::move(blob)});
}

// One port in eight is not active, of each kind in turn.
std::uint32_t KindOf(Random &r, const SwitchPlan &plan, std::uint32_t port) {
    constexpr std::uint32_t kOthers[] = {DVS_PORT_SHADOW, DVS_PORT_ZOMBIE, DVS_PORT_LOCAL_CACHE};
    const bool isOther = r.Percent(12);
    if (port < plan.uplinks) return DVS_PORT_ACTIVE;
    const std::uint32_t guest = port - plan.uplinks;
    return isOther || guest % 16 >= 13 ? kOthers[guest % std::size(kOthers)] : std::uint32_t{DVS_PORT_ACTIVE};
}

NewEntry MakePort(Random &r, Values &values, const SwitchPlan &plan, std::uint32_t port) {
    auto list = ToEntries(values, {DVS_PROP_CLASS_PORT, plan.version}, DrawPortProperties(r, plan, port));
    if (port >= plan.uplinks && r.Percent(50)) {
        const std::uint32_t guest = r.Below(100000);
        list.push_back(Text("com.orbeno.port.extraConfig.vnic.external.id",
                            fmt::format("vm-{}-nic{}", guest, r.Below(4))));
    }
    const std::uint32_t kind = KindOf(r, plan, port);
    if (kind != DVS_PORT_ACTIVE) list.push_back({std::string(kKindProperty), kStateType, NumberBytes(kind)});
    return {plan.ports[port], kStateType, EncodeList(list)};
}

NewEntry MakeSwitch(Random &r, Values &values, std::uint32_t number, SwitchSort sort, std::uint32_t ports) {
    std::string id;
    for (int i = 0; i < 16; ++i)
        id += fmt::format("{}{:02x}", i == 0 ? "" : i == 8 ? "-" : " ", r.Below(256));
    const SwitchPlan plan = PlanSwitch(r, number, sort, ports);
    auto global = ToEntries(values, {DVS_PROP_CLASS_GLOBAL, plan.version},
                            DrawSwitchProperties(r, plan, DVS_PROP_CLASS_GLOBAL));
    AddUnmapped(r, global);
    const auto host = ToEntries(values, {DVS_PROP_CLASS_HOST, plan.version},
                                DrawSwitchProperties(r, plan, DVS_PROP_CLASS_HOST));
    std::vector<NewEntry> entries;
    const auto add = [&](Role role, Buffer value) {
        entries.push_back({RoleName(role), kStateType, std::move(value)});
    };
    add(Role::Version, NumberBytes(plan.version));
    add(Role::ClassName, TextBytes(plan.className, sizeof(DVSwitch::className)));
    add(Role::MaxPorts, NumberBytes(std::max(ports, 512u)));
    add(Role::GlobalList, EncodeList(global));
    add(Role::HostList, EncodeList(host));
    for (std::uint32_t port = 0; port < ports; ++port)
        entries.push_back(MakePort(r, values, plan, port));
    return {std::move(id), kStateType, EncodeList(entries)};
}

std::uint64_t NumberOf(const char *option, const std::optional<std::string> &text, std::uint64_t otherwise,
                       std::uint64_t most) {
    if (!text) return otherwise;
    std::uint64_t number = 0;
    const char *end = text->data() + text->size();
    const auto [stop, error] = std::from_chars(text->data(), end, number);
    if (error != std::errc() || stop != end || number > most)
        throw Error(ErrorKind::Usage, fmt::format("{} is no number from 0 to {}", option, most)).At(*text);
    return number;
}

SwitchSort SortFor(const Options &options, std::uint32_t number) {
    SwitchSort sort = SortOf(number);
    if (options.switchVersion) {
        sort.version =
            static_cast<std::uint32_t>(NumberOf("--switch-version", options.switchVersion, 0, UINT32_MAX));
        if (VersionText(sort.version).empty())
            throw Error(ErrorKind::Usage, "there is no such switch version")
                .At(*options.switchVersion)
                .Because("a version is 4 to 12, 100, or 107 to 112");
    }
    if (!options.className) return sort;
    const auto known = std::ranges::find(kClasses, *options.className);
    if (known == std::end(kClasses))
        throw Error(ErrorKind::Usage, "there is no such switch class")
            .At(*options.className)
            .Because(fmt::format("the classes are {}", fmt::join(kClasses, ", ")));
    sort.className = *known;
    return sort;
}

} // namespace

Exit RunGenerate(Context &context) {
    const Options &options = context.options;
    const auto switches =
        static_cast<std::uint32_t>(NumberOf("--switches", options.switchCount, 3, kMostSwitches));
    const auto ports = static_cast<std::uint32_t>(NumberOf("--ports", options.portCount, 16, kMostPorts));
    Random random(NumberOf("--seed", options.seed, 1, UINT64_MAX));
    const auto to = OpenSource(options.target);
    CheckPutOptions(options, *to);
    Values values;
    std::vector<NewEntry> list;
    for (std::uint32_t i = 0; i < switches; ++i)
        list.push_back(MakeSwitch(random, values, i, SortFor(options, i), ports));
    return PutState(context, {"generate", "wrote"}, JudgeState(*to, {EncodeList(list), {}}), *to);
}

} // namespace dvs::ctl
