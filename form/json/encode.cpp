/* SPDX-License-Identifier: Apache-2.0 */
// From the model to its JSON form.

#include <algorithm>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>

#include "dvs/state.h"
#include "form/json/codec.h"
#include "form/json/pretty.h"
#include "form/json/typed.h"
#include "form/value.h"

namespace dvs::form {

namespace {

namespace json = boost::json;

constexpr std::size_t kClassNameSize = sizeof(DVSwitch::className);

json::object BytesToJson(Bytes bytes) {
    json::object object;
    if (bytes.size() <= kMostHexBytes)
        object["hex"] = ToHexDigits(bytes);
    else
        object["base64"] = ToBase64(bytes);
    return object;
}

json::object PaddedTextToJson(std::string_view text, std::size_t size) {
    json::object object;
    object["text"] = text;
    object["size"] = size;
    return object;
}

json::object NamesToJson(Bytes value, std::size_t slot) {
    json::array names;
    for (const std::string_view name : NamesOf(value, slot))
        names.emplace_back(name);
    json::object object;
    object["names"] = std::move(names);
    object["slot"] = slot;
    return object;
}

struct Notation {
    TypedForm form;
    TypedViews views = {};
};

void AddTyped(Notation &notation, const Owner &owner, const Property &property, json::object &object) {
    const typed::View &view = notation.views.Of(owner, property);
    if (notation.form == TypedForm::Beside) {
        AddMeaning(view, object);
        return;
    }
    if (view.state != typed::State::kTyped) return;
    json::value tree = NodeToJson(view.tree);
    if (tree != object.at("value") && notation.views.IsExact(owner, property)) {
        object.erase("value");
        object["typed"] = std::move(tree);
    }
}

json::array PropertiesToJson(Notation &notation, const Owner &owner, std::span<const Property> list) {
    json::array properties;
    properties.reserve(list.size());
    for (const Property &property : list) {
        json::object object = PropertyToJson(property);
        if (notation.form != TypedForm::None) AddTyped(notation, owner, property, object);
        properties.emplace_back(std::move(object));
    }
    return properties;
}

// The class is a fixed field: a string stands for all of it, zeros included.
json::value ClassToJson(Bytes value) {
    const std::string_view all = AsText(value);
    const std::string_view text = all.substr(0, all.find('\0'));
    const bool usual = value.size() == kClassNameSize && text.size() < kClassNameSize && IsUtf8(text) &&
                       all.find_first_not_of('\0', text.size()) == std::string_view::npos;
    return usual ? json::value(text) : ValueToJson(value);
}

// The number fields are numbers whatever their bytes look like.
json::value NumberFieldToJson(Bytes value) {
    const auto number = AsNumber(value);
    return number ? json::value(*number) : ValueToJson(value);
}

// True when "kind" says everything about the kind property: the last of the list, as the library appends it.
bool KindStandsForProperty(const Entry &port) {
    if (port.list.empty() || port.kind == DVS_PORT_ACTIVE || !KindName(port.kind)) return false;
    const Property &last = port.list.back();
    return last.name == kKindProperty && last.type == kStateType && AsNumber(last.value) == port.kind &&
           std::count_if(port.list.begin(), port.list.end(),
                         [](const Property &p) { return p.name == kKindProperty; }) == 1;
}

json::object PortToJson(Notation &notation, const Switch &sw, const Entry &port) {
    json::object object;
    object["id"] = NameToJson(port.name);
    if (port.type != kStateType) object["type"] = port.type;
    if (KindName(port.kind)) object["kind"] = KindName(port.kind);
    std::span<const Property> list = port.list;
    if (KindStandsForProperty(port)) list = list.first(list.size() - 1);
    object["properties"] = PropertiesToJson(notation, OwnerOf(sw, port), list);
    return object;
}

// The order and the types that the library writes; anything else is written entry by entry.
bool IsUsual(const Switch &sw) {
    Role least = Role::Version;
    for (const Entry &entry : sw.entries) {
        if (entry.role < least) return false;
        least = entry.role;
        if (entry.role == Role::Other || (entry.role != Role::Port && entry.type != kStateType)) return false;
    }
    return true;
}

// Here nothing but the name tells what a list is, so bytes are what is kept.
json::array EntriesToJson(const Switch &sw, TypedForm form) {
    Notation notation{form == TypedForm::Instead ? TypedForm::None : form};
    json::array entries;
    for (const Entry &entry : sw.entries) {
        if (!entry.IsList()) {
            entries.emplace_back(PropertyToJson(entry));
            continue;
        }
        json::object object;
        object["name"] = NameToJson(entry.name);
        object["type"] = entry.type;
        object["properties"] = PropertiesToJson(notation, OwnerOf(sw, entry), entry.list);
        entries.emplace_back(std::move(object));
    }
    return entries;
}

void UsualToJson(Notation &notation, const Switch &sw, json::object &object) {
    json::array ports;
    for (const Entry &entry : sw.entries) {
        switch (entry.role) {
        case Role::Version:
            object["version"] = NumberFieldToJson(entry.value);
            break;
        case Role::ClassName:
            object["class"] = ClassToJson(entry.value);
            break;
        case Role::MaxPorts:
            object["max_ports"] = NumberFieldToJson(entry.value);
            break;
        case Role::GlobalList:
            object["global"] = PropertiesToJson(notation, OwnerOf(sw, entry), entry.list);
            break;
        case Role::HostList:
            object["host"] = PropertiesToJson(notation, OwnerOf(sw, entry), entry.list);
            break;
        case Role::Port:
            ports.emplace_back(PortToJson(notation, sw, entry));
            break;
        case Role::Other:
            break; // not in a usual switch
        }
    }
    object["ports"] = std::move(ports);
}

} // namespace

json::value ValueToJson(Bytes value) {
    const ValueLook look = LookAt(value);
    switch (look.form) {
    case ValueForm::Text:
        return json::value(look.text);
    case ValueForm::Number:
        return look.number;
    case ValueForm::PaddedText:
        if (value.size() <= kMostPaddedBytes) return PaddedTextToJson(look.text, value.size());
        break;
    case ValueForm::NameList:
        return NamesToJson(value, look.slot);
    case ValueForm::Raw:
        break;
    }
    return BytesToJson(value);
}

json::value NameToJson(std::string_view name) {
    return IsUtf8(name) ? json::value(name) : json::value(BytesToJson(AsBytes(name)));
}

json::object PropertyToJson(const Property &property) {
    json::object object;
    object["name"] = NameToJson(property.name);
    object["type"] = property.type;
    object["value"] = ValueToJson(property.value);
    return object;
}

json::array SwitchesToJson(const State &state, TypedForm form) {
    Notation notation{form};
    json::array switches;
    for (const Switch &sw : state.switches) {
        json::object object;
        object["id"] = NameToJson(sw.name);
        if (sw.type != kStateType) object["type"] = sw.type;
        if (sw.isOther)
            object["value"] = ValueToJson(sw.value);
        else if (IsUsual(sw))
            UsualToJson(notation, sw, object);
        else
            object["entries"] = EntriesToJson(sw, form);
        switches.emplace_back(std::move(object));
    }
    return switches;
}

std::string StateToJsonText(const State &state, TypedForm form) {
    json::object document;
    document["schema_version"] = kSchemaVersion;
    document["switches"] = SwitchesToJson(state, form);
    return PrettyJson(std::move(document));
}

} // namespace dvs::form
