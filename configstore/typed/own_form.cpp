/* SPDX-License-Identifier: Apache-2.0 */
// Which types have a form of their own (own_form.h), the short ones among them, and putting tree members into
// record fields.

#include "configstore/typed/own_form.h"

#include <cstdlib>

#include "configstore/converters/common.h"
#include "configstore/layouts/records.h"

namespace dvs::typed {
namespace {

using layout::Field;
using layout::Kind;
using layout::Record;

Flaw PutNumber(const Field &field, int64_t number, const std::string &path, std::span<uint8_t> bytes) {
    const int64_t most = field.width >= 4 ? INT64_C(0xffffffff) : (INT64_C(1) << 8 * field.width) - 1;
    if (number < 0 || number > most)
        return {path, std::to_string(number) + " is out of range, expected 0 to " + std::to_string(most)};
    std::memcpy(bytes.subspan(field.offset, field.width).data(), &number, field.width);
    return {};
}

// Only one of them is kept.
Flaw EncodeVlan(const Record &, const Node &tree, std::vector<uint8_t> *) {
    const Node *first = nullptr;
    for (const Node &member : tree.items) {
        if (first)
            return {member.name,
                    "excludes " + first->name + ": a port has one of vlan_id, pvlan_id and trunk_vlan_ids"};
        first = &member;
    }
    return {};
}

// A value that was never told of failure criteria has none, rather than some that are all false: writing
// those would leave a load's mark.
void CompleteTeaming(const Record &record, std::span<const uint8_t> value, const layout::StoreField &,
                     Node *tree) {
    for (const char *name : {"failure_flags", "percentage", "full_duplex", "speed"}) {
        const Field &field = *layout::Find(record, name);
        for (const uint8_t byte : value.subspan(field.offset, field.width)) {
            if (byte) return;
        }
    }
    std::erase_if(tree->items, [](const Node &member) { return member.name == "failure_criteria"; });
}

// Only so many names have a slot.
Flaw CountUplinks(const Record &record, const Node &tree) {
    const Node *order = tree.Find("uplink_port_order");
    if (!order) return {};
    std::size_t count = 0;
    for (const Node &list : order->items)
        count += list.items.size();
    const std::size_t most = record.parts[0].count;
    if (count <= most) return {};
    return {"uplink_port_order",
            "names " + std::to_string(count) + " uplinks, at most " + std::to_string(most) + " fit"};
}

// The three criteria that a load looks for beside their object.
Flaw EncodeTeaming(const Record &record, const Node &tree, std::vector<uint8_t> *value) {
    if (Flaw flaw = CountUplinks(record, tree)) return flaw;
    const Node *criteria = tree.Find("failure_criteria");
    if (!criteria || value->size() < record.size) return {};
    for (const char *name : {"full_duplex", "percentage", "speed"}) {
        const Node *member = criteria->Find(name);
        if (!member) continue;
        if (Flaw flaw = PutField(record, *member, std::string("failure_criteria.") + name, *value))
            return flaw;
    }
    return {};
}

const std::vector<Node> &ItemsOf(const Node &object, std::string_view list) {
    static const std::vector<Node> none;
    const Node *member = object.Find(list);
    return member ? member->items : none;
}

void EncodeParameters(const Record &record, const std::vector<Node> &texts, std::span<uint8_t> bytes) {
    for (std::size_t i = 0; i < texts.size(); ++i) {
        const auto parameter = bytes.subspan(i * record.size, record.size);
        SetNumber(record, "ordinal", i, parameter);
        Node text = texts[i];
        text.name = "text";
        (void)PutField(record, text, "", parameter); // measured when it was written
    }
}

// Each filter behind the parameters of the one before.
Flaw EncodeFilters(const Record &record, const Node &tree, std::vector<uint8_t> *value) {
    const Record &filterRecord = *record.parts[0].element;
    const Record &parameterRecord = *filterRecord.parts[0].element;
    const std::vector<Node> &filters = ItemsOf(tree, "network_filters");
    value->assign(record.size, 0);
    SetNumber(record, "filter_count", filters.size(), *value);
    for (const Node &filter : filters) {
        const std::vector<Node> &parameters = ItemsOf(filter, "parameters");
        const std::size_t at = value->size();
        value->resize(at + filterRecord.size + parameters.size() * parameterRecord.size);
        const auto bytes = std::span(*value).subspan(at);
        if (const Node *slot = filter.Find("slot_number"))
            SetNumber(filterRecord, "slot_number", std::strtoul(slot->text.c_str(), nullptr, 10), bytes);
        if (const Node *agent = filter.Find("agent_name"))
            (void)PutField(filterRecord, *agent, "", bytes); // measured when it was written
        const Node *onFailure = filter.Find("on_failure");
        SetNumber(filterRecord, "on_failure", onFailure && onFailure->text == "FAIL_OPEN", bytes);
        SetNumber(filterRecord, "parameter_count", parameters.size(), bytes);
        EncodeParameters(parameterRecord, parameters, bytes.subspan(filterRecord.size));
    }
    return {};
}

constexpr OwnForm kOwnForms[] = {
    {ConverterType::kMirrorSessions, CompleteSessions, EncodeSessions},
    {ConverterType::kEtherswitchTeaming, CompleteTeaming, EncodeTeaming},
    {ConverterType::kVswitchTeaming, CompleteTeaming, EncodeTeaming},
    {ConverterType::kEtherswitchPortVlan, nullptr, EncodeVlan},
    {ConverterType::kVswitchPortVlan, nullptr, EncodeVlan},
    {ConverterType::kFilters, nullptr, EncodeFilters},
};

} // namespace

const OwnForm *OwnFormOf(ConverterType type) {
    for (const OwnForm &form : kOwnForms) {
        if (form.type == type) return &form;
    }
    return nullptr;
}

void SetNumber(const Record &record, std::string_view field, uint64_t number, std::span<uint8_t> bytes) {
    const Field *found = layout::Find(record, field);
    std::memcpy(bytes.subspan(found->offset, found->width).data(), &number, found->width);
}

Flaw PutField(const Record &record, const Node &member, const std::string &path, std::span<uint8_t> bytes) {
    const Field *field = layout::Find(record, member.name);
    if (!field) return {};
    switch (member.kind) {
    case Node::Kind::kBool:
        bytes[field->offset] = member.flag;
        return {};
    case Node::Kind::kNumber:
        return PutNumber(*field, member.number, path, bytes);
    case Node::Kind::kText:
        break;
    default:
        return {};
    }
    if (field->kind == Kind::kEnum) {
        const auto index = convert::EnumIndex(layout::Texts(*field->domain), member.text.c_str());
        return PutNumber(*field, index.value_or(0), path, bytes);
    }
    if (member.text.size() >= field->width)
        return {path, "is " + std::to_string(member.text.size()) + " bytes long, at most " +
                          std::to_string(field->width - 1) + " fit"};
    std::memcpy(bytes.subspan(field->offset, field->width).data(), member.text.data(), member.text.size());
    return {};
}

} // namespace dvs::typed
