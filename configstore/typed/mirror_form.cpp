/* SPDX-License-Identifier: Apache-2.0 */
// Mirror sessions as people read and write them (own_form.h). A save drops packet lengths and all addresses
// but the last; a load reads no VLANs and addresses, puts the transmit sources over the receive sources and
// turns legacy mode round. Here nothing of it is lost.

#include <algorithm>

#include "configstore/converters/address.h"
#include "configstore/converters/common.h"
#include "configstore/layouts/mirror.h"
#include "configstore/typed/own_form.h"

namespace dvs::typed {
namespace {

using layout::Record;
using layout::StoreField;
using layout::mirror::kHeadSize;
using layout::mirror::kSession;

constexpr uint64_t kMagic = 0xFACEBEEF;
constexpr uint64_t kFormatVersion = 1;
constexpr uint64_t kNotSet = 0xFFFFFFFF;
constexpr uint32_t kHasEncapVlan = 0x08;
constexpr std::size_t kAddressOffset = 4; // in a field of the kind kTagged

struct TreeFlag {
    const char *name;
    bool when;
    uint32_t bits;
};
// Both bits of the third are what a load sets.
constexpr TreeFlag kFlags[] = {
    {"enabled", false, 0x20},
    {"strip_original_vlan", false, 0x04},
    {"normal_traffic_allowed", false, 0x03},
    {"legacy_mode", true, 0x10},
};

struct Connectee {
    const char *text;
    uint32_t bit;
};
constexpr Connectee kConnectees[] = {{"VM_VNIC", 0x1}, {"PNIC", 0x2}, {"HOST_HYP_VNIC", 0x8}};
constexpr uint32_t kAnyConnectee = 0x4;

struct Group {
    const char *object;     // of the session's tree
    const char *count;      // of the session's record
    const char *connectees; // likewise; null for destinations
};
// In the order of their records.
constexpr Group kGroups[] = {
    {"destination_port", "destination_count", nullptr},
    {"source_recv_port", "receive_count", "receive_connectee_types"},
    {"source_transmit_port", "transmit_count", "transmit_connectee_types"},
};

// A list of ports, and the records that its elements are.
struct PortList {
    const char *name;
    uint32_t kind;
};
constexpr PortList kPortLists[] = {
    {"port_keys", 0}, {"uplink_port_names", 1}, {"vlans", 0}, {"addresses", 0}};

// The lists that a group of a session of this type has.
std::vector<std::string_view> ListsOf(const Group &group, uint32_t sessionType) {
    const bool isDestination = group.connectees == nullptr;
    if (!isDestination && sessionType == layout::mirror::kRemoteDest) return {"vlans"};
    if (!isDestination) return {"port_keys"};
    switch (sessionType) {
    case layout::mirror::kRemoteSource:
        return {"uplink_port_names"};
    case layout::mirror::kEncapsulatedSource:
        return {"addresses"};
    case layout::mirror::kMixedDest:
        return {"port_keys", "uplink_port_names"};
    default:
        return {"port_keys"};
    }
}

uint64_t NumberIn(const Record &record, const char *name, std::span<const uint8_t> bytes) {
    const layout::Field *field = layout::Find(record, name);
    uint64_t number = 0;
    std::memcpy(&number, bytes.subspan(field->offset, field->width).data(), field->width);
    return number;
}

// --- Bytes to tree ---

// Puts the number where the form has it.
void AddNumber(const StoreField &form, std::string_view name, uint64_t number, Node *object) {
    const auto field = std::ranges::find(form.members, name, &StoreField::name);
    const auto behind = std::ranges::find_first_of(object->items, std::span(field, form.members.end()), {},
                                                   &Node::name, &StoreField::name);
    Node node;
    node.kind = Node::Kind::kNumber;
    node.name = name;
    node.number = static_cast<int64_t>(number);
    node.unit = field->unit;
    node.note = field->meaning;
    object->items.insert(behind, std::move(node));
}

// The tree of a session; those of one key have been saved over each other.
Node *Find(Node *tree, std::span<const uint8_t> session) {
    const layout::Field &field = *layout::Find(kSession, "key");
    const std::string_view key(reinterpret_cast<const char *>(session.data()) + field.offset, field.width);
    const auto found = std::ranges::find_if(tree->items, [&](const Node &node) {
        const Node *member = node.Find("key");
        return member && member->text == key.substr(0, key.find('\0'));
    });
    return found == tree->items.end() ? nullptr : &*found;
}

// A member of a member, null where there is none.
Node *Below(Node *object, std::string_view outer, std::string_view inner) {
    for (Node &item : object->items) {
        if (item.name != outer) continue;
        const auto found = std::ranges::find(item.items, inner, &Node::name);
        return found == item.items.end() ? nullptr : &*found;
    }
    return nullptr;
}

// What follows the 3 unused bytes of each destination.
void ReadAddresses(const Record &record, std::span<const uint8_t> ports, uint64_t count, Node *list) {
    list->items.clear();
    for (std::size_t i = 0; i < count; ++i) {
        const layout::Field &field = *layout::Find(record, "address");
        const auto address = ports.subspan(i * record.size + field.offset);
        Node node;
        node.kind = Node::Kind::kText;
        node.text = convert::FormatAddress(address.subspan<kAddressOffset, 16>(), address[0] != 0).text;
        list->items.push_back(std::move(node));
    }
}

// --- Tree to bytes ---

uint32_t TypeOf(const Node &session) {
    const Node *type = session.Find("session_type");
    if (!type) return 0;
    const std::span<const char *const> texts(SESSION_TYPE_LOCAL_ENUM_2_SCHEMA, VSPAN_SESSION_TYPE_NUM);
    return convert::EnumIndex(texts, type->text.c_str()).value_or(0); // unknown ones have been refused
}

uint32_t FlagsOf(const Node &session, uint32_t vlan) {
    uint32_t bits = vlan ? kHasEncapVlan : 0;
    for (const TreeFlag &flag : kFlags) {
        const Node *member = session.Find(flag.name);
        if (member && member->flag == flag.when) bits |= flag.bits;
    }
    return bits;
}

uint32_t ConnecteesOf(const Node &ports) {
    const Node *list = ports.Find("wildcard_port_connectee_types");
    uint32_t bits = list && !list->items.empty() ? kAnyConnectee : 0;
    for (const Connectee &connectee : kConnectees) {
        if (list && std::ranges::find(list->items, connectee.text, &Node::text) != list->items.end())
            bits |= connectee.bit;
    }
    return bits;
}

// The record that elements of the list are: one of the variants or the usual one.
const Record &RecordOf(const layout::Part &ports, std::string_view list) {
    for (const layout::Variant &variant : ports.variants) {
        const bool isAddress = variant.value == layout::mirror::kEncapsulatedSource;
        if (list == (isAddress ? "addresses" : "vlans")) return *variant.element;
    }
    return *ports.element;
}

Flaw AppendPort(const Record &record, const PortList &list, const Node &item, const std::string &path,
                std::vector<uint8_t> *value) {
    const std::size_t at = value->size();
    value->resize(at + record.size);
    const auto bytes = std::span(*value).subspan(at);
    SetNumber(record, "kind", list.kind, bytes);
    if (const layout::Field *field = layout::Find(record, "address")) {
        const auto address = bytes.subspan(field->offset);
        bool isIpv6 = false;
        (void)convert::ParseAddress(item.text.c_str(), address.subspan<kAddressOffset, 16>(),
                                    &isIpv6); // it has been looked at before
        address[0] = isIpv6;
        return {};
    }
    Node member = item;
    member.name = item.kind == Node::Kind::kNumber ? "vlan_id" : "name";
    return PutField(record, member, path, bytes);
}

// Appends the records of a group; `count` is how many.
Flaw AppendGroup(const layout::Part &part, const Group &group, const Node &session, const std::string &path,
                 std::vector<uint8_t> *value, uint64_t *count) {
    const Node *ports = session.Find(group.object);
    if (!ports) return {};
    const uint32_t type = TypeOf(session);
    const auto wanted = ListsOf(group, type);
    for (const PortList &list : kPortLists) {
        const Node *items = ports->Find(list.name);
        if (!items || items->items.empty()) continue;
        const std::string listPath = path + "." + group.object + "." + list.name;
        if (std::ranges::find(wanted, list.name) == wanted.end()) {
            std::string known;
            for (const std::string_view name : wanted)
                known += std::string(known.empty() ? "" : " and ") + std::string(name);
            return {listPath, std::string("has no place in a session of type ") +
                                  SESSION_TYPE_LOCAL_ENUM_2_SCHEMA[type] + ", which takes " + known +
                                  " here"};
        }
        for (std::size_t i = 0; i < items->items.size(); ++i, ++*count) {
            const std::string itemPath = listPath + "[" + std::to_string(i) + "]";
            if (Flaw flaw = AppendPort(RecordOf(part, list.name), list, items->items[i], itemPath, value))
                return flaw;
        }
    }
    return {};
}

// `first` is the index of the session's first port record, and then of the next session's.
Flaw EncodeSession(const layout::Part &part, const Node &session, const std::string &path,
                   std::span<uint8_t> bytes, std::vector<uint8_t> *ports, uint64_t *first) {
    SetNumber(kSession, "mirrored_packet_length", kNotSet, bytes);
    for (const Node &member : session.items) {
        if (Flaw flaw = PutField(kSession, member, path + "." + member.name, bytes)) return flaw;
    }
    const auto vlan = static_cast<uint32_t>(NumberIn(kSession, "encapsulation_vlan_id", bytes));
    SetNumber(kSession, "flags", FlagsOf(session, vlan), bytes);
    SetNumber(kSession, "first_record", *first, bytes);
    for (const Group &group : kGroups) {
        uint64_t count = 0;
        if (Flaw flaw = AppendGroup(part, group, session, path, ports, &count)) return flaw;
        SetNumber(kSession, group.count, count, bytes);
        *first += count;
        const Node *object = session.Find(group.object);
        if (group.connectees && object) SetNumber(kSession, group.connectees, ConnecteesOf(*object), bytes);
    }
    return {};
}

} // namespace

void CompleteSessions(const Record &record, std::span<const uint8_t> value, const StoreField &form,
                      Node *tree) {
    const layout::Part &part = record.parts[1];
    const std::size_t sessions = NumberIn(record, "session_count", value);
    if (sessions == 0) return; // the value may end before its head does
    auto ports = value.subspan(kHeadSize + sessions * kSession.size);
    for (std::size_t i = 0; i < sessions; ++i) {
        const auto session = value.subspan(kHeadSize + i * kSession.size, kSession.size);
        const uint64_t destinations = NumberIn(kSession, "destination_count", session);
        if (Node *node = Find(tree, session)) {
            DropUnset(form, node);
            const uint64_t length = NumberIn(kSession, "mirrored_packet_length", session);
            if (length != kNotSet) AddNumber(form, "mirrored_packet_length", length, node);
            if (Node *list = Below(node, "destination_port", "addresses"))
                ReadAddresses(RecordOf(part, "addresses"), ports, destinations, list);
        }
        for (const Group &group : kGroups)
            ports = ports.subspan(NumberIn(kSession, group.count, session) * part.element->size);
    }
}

Flaw EncodeSessions(const Record &record, const Node &tree, std::vector<uint8_t> *value) {
    value->assign(kHeadSize + tree.items.size() * kSession.size, 0);
    SetNumber(record, "magic", kMagic, *value);
    SetNumber(record, "version", kFormatVersion, *value);
    SetNumber(record, "session_count", tree.items.size(), *value);
    std::vector<uint8_t> ports;
    uint64_t count = 0;
    for (std::size_t i = 0; i < tree.items.size(); ++i) {
        const auto bytes = std::span(*value).subspan(kHeadSize + i * kSession.size, kSession.size);
        const std::string path = "[" + std::to_string(i) + "]";
        if (Flaw flaw = EncodeSession(record.parts[1], tree.items[i], path, bytes, &ports, &count))
            return flaw;
    }
    SetNumber(record, "port_count", count, *value);
    value->insert(value->end(), ports.begin(), ports.end());
    return {};
}

} // namespace dvs::typed
