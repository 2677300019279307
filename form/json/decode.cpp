/* SPDX-License-Identifier: Apache-2.0 */
// From the JSON form to serialized bytes. Everything here comes from outside: each member is asked for by
// name and type, unknown ones are refused, and an error says where in the document it is.

#include <algorithm>
#include <array>
#include <cstring>

#include <boost/json/array.hpp>
#include <boost/json/object.hpp>
#include <boost/json/value.hpp>
#include <fmt/format.h>

#include "configstore/layouts/registry.h"
#include "dvs/configstore.h"
#include "dvs/state.h"
#include "dvsdata/format.h"
#include "form/encode.h"
#include "form/error.h"
#include "form/json/codec.h"
#include "form/json/parse.h"
#include "form/json/typed.h"
#include "form/value.h"

namespace dvs::form {

namespace {

namespace json = boost::json;

using Buffer = std::vector<std::uint8_t>;

/// Where in the document a value stands; links to the place around it, so that nothing is built unless it is
/// shown.
struct Place {
    const Place *around = nullptr;
    std::string_view key;
    std::size_t index = 0;

    std::string Text() const {
        if (!around) return "$";
        return around->Text() + (key.empty() ? fmt::format("[{}]", index) : fmt::format(".{}", key));
    }
    Place Member(std::string_view name) const { return {this, name, 0}; }
    Place Element(std::size_t at) const { return {this, {}, at}; }

    /// `field` is inside of a typed value.
    [[noreturn]] void Refuse(std::string why, const std::string &field = {}) const {
        const bool isMember = !field.empty() && field.front() != '[';
        throw Error(ErrorKind::Malformed, "the JSON document does not describe a state")
            .At(Text() + (isMember ? "." : "") + field)
            .Field(field)
            .Because(std::move(why))
            .Try("correct the document there (its form is in json-form.md); nothing was changed");
    }
};

const char *TypeName(const json::value &value) {
    switch (value.kind()) {
    case json::kind::null:
        return "null";
    case json::kind::bool_:
        return "a boolean";
    case json::kind::int64:
    case json::kind::uint64:
    case json::kind::double_:
        return "a number";
    case json::kind::string:
        return "a string";
    case json::kind::array:
        return "an array";
    case json::kind::object:
        return "an object";
    }
    return "a value";
}

[[noreturn]] void WrongType(const Place &place, const json::value &value, std::string_view wanted) {
    place.Refuse(fmt::format("it is {}, {} is expected", TypeName(value), wanted));
}

const json::object &ObjectAt(const Place &place, const json::value &value) {
    if (!value.is_object()) WrongType(place, value, "an object");
    return value.get_object();
}

const json::array &ArrayAt(const Place &place, const json::value &value) {
    if (!value.is_array()) WrongType(place, value, "an array");
    return value.get_array();
}

std::uint32_t NumberAt(const Place &place, const json::value &value) {
    if (!value.is_number()) WrongType(place, value, "a whole number");
    if (value.is_double()) place.Refuse("it is no whole number from 0 to 4294967295");
    const bool fits = value.is_uint64()
                          ? value.get_uint64() <= UINT32_MAX
                          : value.get_int64() >= 0 && value.get_int64() <= std::int64_t{UINT32_MAX};
    if (!fits) place.Refuse("it is no whole number from 0 to 4294967295");
    return value.to_number<std::uint32_t>();
}

std::string_view StringAt(const Place &place, const json::value &value) {
    if (!value.is_string()) WrongType(place, value, "a string");
    return {value.get_string().data(), value.get_string().size()};
}

void AllowOnly(const Place &place, const json::object &object, std::initializer_list<std::string_view> keys) {
    for (const auto &member : object) {
        const std::string_view key(member.key().data(), member.key().size());
        if (key == "comment" || std::find(keys.begin(), keys.end(), key) != keys.end()) continue;
        std::string known;
        for (const std::string_view name : keys)
            known += fmt::format("{}\"{}\"", known.empty() ? "" : ", ", name);
        place.Member(key).Refuse("the key is not known here; known are " + known);
    }
}

const json::value *Find(const json::object &object, std::string_view key) {
    return object.if_contains({key.data(), key.size()});
}

const json::value &Require(const Place &place, const json::object &object, std::string_view key) {
    const json::value *value = Find(object, key);
    if (!value) place.Refuse(fmt::format("the key \"{}\" is missing", key));
    return *value;
}

Buffer NumberBytes(std::uint32_t number) {
    Buffer bytes(sizeof number);
    data::Store32(bytes.data(), number);
    return bytes;
}

Buffer TextBytes(std::string_view text, std::size_t size) {
    Buffer bytes(size, 0);
    std::copy(text.begin(), text.end(), bytes.begin());
    return bytes;
}

// {"names": […], "slot": …}: a count and slots of one width.
Buffer NamesAt(const Place &place, const json::object &object) {
    const Place namesPlace = place.Member("names"), slotPlace = place.Member("slot");
    const json::array &names = ArrayAt(namesPlace, object.at("names"));
    const std::uint32_t slot = NumberAt(slotPlace, object.at("slot"));
    if (slot < 1 || slot > kMostSlotBytes)
        slotPlace.Refuse(fmt::format("a slot has 1 to {} bytes", kMostSlotBytes));
    if (names.size() > UINT32_MAX / kMostSlotBytes) namesPlace.Refuse("there are too many");
    Buffer bytes = NumberBytes(static_cast<std::uint32_t>(names.size()));
    bytes.resize(bytes.size() + names.size() * slot, 0);
    auto to = bytes.begin() + sizeof(std::uint32_t);
    for (std::size_t i = 0; i < names.size(); ++i, to += slot) {
        const Place at = namesPlace.Element(i);
        const std::string_view name = StringAt(at, names[i]);
        if (name.size() >= slot)
            at.Refuse(fmt::format("it has {} bytes, the slot has room for {}", name.size(), slot - 1));
        std::copy(name.begin(), name.end(), to);
    }
    return bytes;
}

// {"hex": …}, {"base64": …}, {"text": …, "size": …} or {"names": […], "slot": …}.
Buffer BytesObjectAt(const Place &place, const json::object &object) {
    AllowOnly(place, object, {"hex", "base64", "text", "size", "names", "slot"});
    const auto alone = [&] { return object.size() == 1 + object.count("comment"); };
    if (object.contains("names") && object.contains("slot") && object.size() == 2 + object.count("comment"))
        return NamesAt(place, object);
    if (const json::value *hex = Find(object, "hex"); hex && alone()) {
        auto bytes = FromHexDigits(StringAt(place.Member("hex"), *hex));
        if (!bytes) place.Member("hex").Refuse("it is not made of pairs of hexadecimal digits");
        return std::move(*bytes);
    }
    if (const json::value *base64 = Find(object, "base64"); base64 && alone()) {
        auto bytes = FromBase64(StringAt(place.Member("base64"), *base64));
        if (!bytes) place.Member("base64").Refuse("it is not base64 with its padding");
        return std::move(*bytes);
    }
    const json::value *text = Find(object, "text"), *size = Find(object, "size");
    if (!text || !size || object.size() != 2 + object.count("comment"))
        place.Refuse("bytes are given as {\"hex\": …}, {\"base64\": …}, {\"text\": …, \"size\": …} or "
                     "{\"names\": […], \"slot\": …}");
    const std::string_view characters = StringAt(place.Member("text"), *text);
    const std::uint32_t wanted = NumberAt(place.Member("size"), *size);
    if (wanted < characters.size())
        place.Member("size").Refuse(fmt::format("the text has {} bytes", characters.size()));
    if (wanted > std::max(kMostPaddedBytes, characters.size() + 1))
        place.Member("size").Refuse(fmt::format("a text is padded to {} bytes at most", kMostPaddedBytes));
    return TextBytes(characters, wanted);
}

Buffer ValueAt(const Place &place, const json::value &value) {
    if (value.is_object()) return BytesObjectAt(place, value.get_object());
    if (value.is_number()) return NumberBytes(NumberAt(place, value));
    if (value.is_string()) {
        const std::string_view text = StringAt(place, value);
        return TextBytes(text, text.size() + 1);
    }
    WrongType(place, value, "a string, a number or an object of bytes");
}

Buffer ClassAt(const Place &place, const json::value &value) {
    if (!value.is_string()) return ValueAt(place, value);
    const std::string_view text = StringAt(place, value);
    constexpr std::size_t size = sizeof(DVSwitch::className);
    if (text.size() >= size || text.find('\0') != std::string_view::npos)
        place.Refuse(fmt::format("a class name has at most {} bytes and no NUL", size - 1));
    return TextBytes(text, size);
}

std::string NameAt(const Place &place, const json::value &value) {
    std::string name;
    if (value.is_object()) {
        const Buffer bytes = BytesObjectAt(place, value.get_object());
        name.assign(bytes.begin(), bytes.end());
    } else {
        name = StringAt(place, value);
    }
    if (name.size() > data::kMaxNameLen)
        place.Refuse(fmt::format("it has {} bytes, a name has at most {}", name.size(), data::kMaxNameLen));
    if (name.find('\0') != std::string::npos) place.Refuse("a name cannot hold a NUL");
    return name;
}

std::uint32_t TypeAt(const Place &place, const json::object &object, std::uint32_t otherwise) {
    const json::value *type = Find(object, "type");
    return type ? NumberAt(place.Member("type"), *type) : otherwise;
}

// The typed form of a property whose meaning is known.
Buffer TypedAt(const Place &place, const json::value &value, const Owner &owner, const std::string &name) {
    NodeFlaw flaw;
    const auto node = NodeFromJson(value, flaw);
    if (!node) place.Refuse(flaw.reason, flaw.field);
    typed::Built built = typed::Build(owner.propClass, name, *node, {owner.version});
    if (!built.ok) place.Refuse(built.reason, built.field);
    if (!built.differences.empty()) {
        // "vlan_id: 1 reads back as absent"
        const std::string &first = built.differences.front();
        const std::size_t end = first.find(": ");
        const std::string field = first.starts_with("the value") ? "" : first.substr(0, end);
        place.Refuse("the property cannot hold it as it is given: " + first.substr(end + 2), field);
    }
    return std::move(built.bytes);
}

// Beside "value", "typed" only says what the bytes mean. A document in which they disagree was edited in one
// of the two places, and which one was meant cannot be known.
void CheckTyped(const Place &place, const json::value &value, const Owner &owner, const NewEntry &entry) {
    const typed::View view =
        typed::Describe(owner.propClass, entry.name, entry.value, {owner.version}, typed::Ask::kResult);
    if (view.state == typed::State::kTyped && NodeToJson(view.tree) == value) return;
    place.Refuse("\"value\" says something else; leave out the one that is not meant");
}

// Under "value" stand bytes in one of their notations. A known property's fields there are a slip, and where
// they belong is said.
void RefuseFields(const Place &place, const json::value &value, const Owner &owner, const std::string &name) {
    if (value.is_string() || value.is_number() || value.is_null()) return;
    const auto isNotation = [](const auto &member) {
        constexpr std::string_view kMembers[] = {"hex", "base64", "text", "size", "names", "slot", "comment"};
        return std::ranges::find(kMembers, std::string_view(member.key())) != std::end(kMembers);
    };
    if (value.is_object() && std::ranges::any_of(value.get_object(), isNotation)) return;
    if (layout::FindProperty(owner.propClass, name))
        place.Refuse("these are no bytes; what a value means is given as \"typed\" in its place");
}

NewEntry PropertyAt(const Place &place, const json::value &value, const Owner &owner) {
    const json::object &object = ObjectAt(place, value);
    AllowOnly(place, object, {"name", "type", "value", "typed", "summary", "damage"});
    NewEntry entry{NameAt(place.Member("name"), Require(place, object, "name")), 0, {}};
    const json::value *raw = Find(object, "value"), *typed = Find(object, "typed");
    entry.type = TypeAt(place, object, typed && !raw ? kStateType : kDefaultType);
    if (!raw && !typed) place.Refuse("the key \"value\" or \"typed\" is missing");
    if (raw) RefuseFields(place.Member("value"), *raw, owner, entry.name);
    if (raw) entry.value = ValueAt(place.Member("value"), *raw);
    if (raw && typed) CheckTyped(place.Member("typed"), *typed, owner, entry);
    if (!raw) entry.value = TypedAt(place.Member("typed"), *typed, owner, entry.name);
    return entry;
}

NewEntry FieldAt(const Place &place, const json::value &value) {
    const json::object &object = ObjectAt(place, value);
    AllowOnly(place, object, {"name", "type", "value"});
    return {NameAt(place.Member("name"), Require(place, object, "name")), TypeAt(place, object, kDefaultType),
            ValueAt(place.Member("value"), Require(place, object, "value"))};
}

std::vector<NewEntry> PropertiesAt(const Place &place, const json::value &value, const Owner &owner) {
    const json::array &array = ArrayAt(place, value);
    std::vector<NewEntry> list;
    list.reserve(array.size());
    for (std::size_t i = 0; i < array.size(); ++i)
        list.push_back(PropertyAt(place.Element(i), array[i], owner));
    return list;
}

// "kind" stands for the kind property at the end of the list, unless the list has one of its own.
void ApplyKind(const Place &place, const json::value &value, std::vector<NewEntry> &list) {
    const std::string_view name = StringAt(place, value);
    const auto kind = KindFromName(name);
    if (!kind) place.Refuse("a port is \"active\", \"shadow\", \"zombie\" or \"local-cache\"");
    const auto own = std::find_if(list.begin(), list.end(), [](const NewEntry &e) {
        return e.name == kKindProperty && (e.type & data::kDeserializeTypeMask) != 0 &&
               e.value.size() >= sizeof(std::uint32_t);
    });
    if (own == list.end()) {
        if (*kind != DVS_PORT_ACTIVE)
            list.push_back({std::string(kKindProperty), kStateType, NumberBytes(*kind)});
    } else if (data::Load32(own->value.data()) != *kind) {
        place.Refuse(fmt::format("the port's property \"{}\" says otherwise", kKindProperty));
    }
}

NewEntry PortAt(const Place &place, const json::value &value, std::uint32_t version) {
    const json::object &object = ObjectAt(place, value);
    AllowOnly(place, object, {"id", "type", "kind", "properties"});
    NewEntry port{
        NameAt(place.Member("id"), Require(place, object, "id")), TypeAt(place, object, kStateType), {}};
    std::vector<NewEntry> list;
    if (const json::value *properties = Find(object, "properties"))
        list = PropertiesAt(place.Member("properties"), *properties, {DVS_PROP_CLASS_PORT, version});
    if (const json::value *kind = Find(object, "kind")) ApplyKind(place.Member("kind"), *kind, list);
    port.value = EncodeList(list);
    return port;
}

// `version` is the switch's so far: its entry stands before the lists in all but the oddest switches.
NewEntry EntryAt(const Place &place, const json::value &value, std::uint32_t *version) {
    const json::object &object = ObjectAt(place, value);
    if (!Find(object, "properties")) {
        NewEntry field = FieldAt(place, value);
        if (field.name == RoleName(Role::Version)) *version = AsNumber(field.value).value_or(0);
        return field;
    }
    AllowOnly(place, object, {"name", "type", "properties"});
    NewEntry entry{
        NameAt(place.Member("name"), Require(place, object, "name")), TypeAt(place, object, kStateType), {}};
    const std::uint32_t propClass = entry.name == RoleName(Role::GlobalList) ? DVS_PROP_CLASS_GLOBAL
                                    : entry.name == RoleName(Role::HostList) ? DVS_PROP_CLASS_HOST
                                                                             : DVS_PROP_CLASS_PORT;
    entry.value =
        EncodeList(PropertiesAt(place.Member("properties"), object.at("properties"), {propClass, *version}));
    return entry;
}

template <typename Decode>
void AppendEach(const Place &place, const json::value &value, std::vector<NewEntry> &entries, Decode decode) {
    const json::array &array = ArrayAt(place, value);
    for (std::size_t i = 0; i < array.size(); ++i)
        entries.push_back(decode(place.Element(i), array[i]));
}

std::vector<NewEntry> UsualEntriesAt(const Place &place, const json::object &object) {
    AllowOnly(place, object, {"id", "type", "version", "class", "max_ports", "global", "host", "ports"});
    std::vector<NewEntry> entries;
    const auto add = [&](std::string_view key, Role role, auto decode) {
        if (const json::value *value = Find(object, key))
            entries.push_back({RoleName(role), kStateType, decode(place.Member(key), *value)});
    };
    std::uint32_t version = 0;
    const auto list = [&](std::uint32_t propClass) {
        return [&version, propClass](const Place &at, const json::value &value) {
            return EncodeList(PropertiesAt(at, value, {propClass, version}));
        };
    };
    const auto port = [&](const Place &at, const json::value &value) { return PortAt(at, value, version); };
    add("version", Role::Version, ValueAt);
    if (!entries.empty()) version = AsNumber(entries.front().value).value_or(0);
    add("class", Role::ClassName, ClassAt);
    add("max_ports", Role::MaxPorts, ValueAt);
    add("global", Role::GlobalList, list(DVS_PROP_CLASS_GLOBAL));
    add("host", Role::HostList, list(DVS_PROP_CLASS_HOST));
    if (const json::value *ports = Find(object, "ports"))
        AppendEach(place.Member("ports"), *ports, entries, port);
    return entries;
}

NewEntry SwitchAt(const Place &place, const json::value &value) {
    const json::object &object = ObjectAt(place, value);
    NewEntry sw{
        NameAt(place.Member("id"), Require(place, object, "id")), TypeAt(place, object, kStateType), {}};
    if (const json::value *raw = Find(object, "value")) {
        AllowOnly(place, object, {"id", "type", "value"});
        sw.value = ValueAt(place.Member("value"), *raw);
        return sw;
    }
    std::vector<NewEntry> entries;
    if (const json::value *all = Find(object, "entries")) {
        AllowOnly(place, object, {"id", "type", "entries"});
        std::uint32_t version = 0;
        AppendEach(place.Member("entries"), *all, entries,
                   [&](const Place &at, const json::value &entry) { return EntryAt(at, entry, &version); });
    } else {
        entries = UsualEntriesAt(place, object);
    }
    sw.value = EncodeList(entries);
    return sw;
}

} // namespace

std::vector<std::uint8_t> StateFromJsonText(std::string_view text) {
    const json::value document = ParseJson(text);
    const Place root;
    const json::object &object = ObjectAt(root, document);
    AllowOnly(root, object, {"schema_version", "command", "source", "summary", "switches"});
    if (const json::value *version = Find(object, "schema_version")) {
        const std::uint32_t found = NumberAt(root.Member("schema_version"), *version);
        if (found != kSchemaVersion)
            root.Member("schema_version")
                .Refuse(fmt::format("it is {}, this program knows {}", found, kSchemaVersion));
    }
    std::vector<NewEntry> switches;
    AppendEach(root.Member("switches"), Require(root, object, "switches"), switches, SwitchAt);
    return EncodeList(switches);
}

} // namespace dvs::form
