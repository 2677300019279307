/* SPDX-License-Identifier: Apache-2.0 */
// Trees in and out of store objects (tree.h).

#include "configstore/typed/tree.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <optional>

#include "configstore/converters/address.h"
#include "configstore/converters/common.h"

namespace dvs::typed {
namespace {

using convert::Instances;
using convert::StoreText;
using convert::StoreTexts;
using layout::Form;
using layout::StoreField;

const StoreField *FindField(const StoreField &form, std::string_view member) {
    const auto field = std::ranges::find(form.members, member, &StoreField::name);
    return field == form.members.end() ? nullptr : &*field;
}

Node Make(const StoreField &form, Node::Kind kind) {
    Node node;
    node.kind = kind;
    node.unit = form.unit;
    node.note = form.meaning;
    return node;
}

Node TextNode(const char *text) {
    Node node;
    node.kind = Node::Kind::kText;
    node.text = text;
    return node;
}

// --- Reading ---

// Absent or unreadable is kNull throughout.
Node ReadBool(const StoreField &form, const Place &place) {
    bool flag = false;
    if (configstore::GetValueBool(place.parent, place.name, &flag)) return {};
    Node node = Make(form, Node::Kind::kBool);
    node.flag = flag;
    return node;
}

Node ReadNumber(const StoreField &form, const Place &place) {
    int64_t number = 0;
    if (configstore::GetValueLong(place.parent, place.name, &number)) return {};
    Node node = Make(form, Node::Kind::kNumber);
    node.number = number;
    return node;
}

Node ReadText(const StoreField &form, const Place &place) {
    StoreText text;
    if (text.Read(place.parent, place.name)) return {};
    Node node = Make(form, Node::Kind::kText);
    node.text = text.get();
    return node;
}

Node ReadTexts(const StoreField &form, const Place &place) {
    StoreTexts texts;
    if (texts.Read(place.parent, place.name)) return {};
    Node node = Make(form, Node::Kind::kList);
    for (const char *text : texts.items())
        node.items.push_back(TextNode(text));
    return node;
}

Node ReadNumbers(const StoreField &form, const Place &place) {
    int32_t *numbers = nullptr;
    int32_t count = 0;
    if (configstore::GetValueIntArray(place.parent, place.name, &numbers, &count)) return {};
    Node node = Make(form, Node::Kind::kList);
    for (int32_t i = 0; i < count; ++i) {
        node.items.emplace_back().kind = Node::Kind::kNumber;
        node.items.back().number = numbers[i];
    }
    configstore::FreeIntArray(numbers);
    return node;
}

Node ReadMember(const StoreField &form, const Place &place);

Node ReadObject(const StoreField &form, configstore::Object *object) {
    Node node = Make(form, Node::Kind::kObject);
    for (const StoreField &member : form.members) {
        Node value = ReadMember(member, {object, member.name, nullptr});
        if (value.kind == Node::Kind::kNull) continue;
        value.name = member.name;
        node.items.push_back(std::move(value));
    }
    return node;
}

Node ReadMember(const StoreField &form, const Place &place) {
    switch (form.form) {
    case Form::kBool:
        return ReadBool(form, place);
    case Form::kUint16:
    case Form::kUint32:
    case Form::kInt:
    case Form::kLong:
        return ReadNumber(form, place);
    case Form::kText:
        return ReadText(form, place);
    case Form::kTexts:
        return ReadTexts(form, place);
    case Form::kInts:
        return ReadNumbers(form, place);
    case Form::kObject: {
        configstore::Object *object = nullptr;
        if (configstore::GetSubObject(place.parent, place.name, place.id, &object)) return {};
        return ReadObject(form, object);
    }
    case Form::kInstances: {
        Instances instances;
        if (instances.Read(place.parent, place.name)) return {};
        Node node = Make(form, Node::Kind::kList);
        for (configstore::Object *object : instances.items())
            node.items.push_back(ReadObject(form, object));
        return node;
    }
    case Form::kNone:
        break;
    }
    return {};
}

// --- Writing ---

const char *NameOf(Node::Kind kind) {
    constexpr const char *kNames[] = {"null", "a truth value", "a number", "a text", "a list", "an object"};
    return kNames[static_cast<std::size_t>(kind)];
}

Flaw Refused(const std::string &field, int32_t status) {
    return {field, "the store refuses it with status " + std::to_string(status)};
}

Flaw Expect(const Node &node, Node::Kind kind, const std::string &path) {
    if (node.kind == kind) return {};
    return {path, std::string("is ") + NameOf(node.kind) + ", expected " + NameOf(kind)};
}

constexpr int64_t kLastVlan = 4095;

// The address in the form that reads back; nothing for a text that names none.
std::optional<std::string> CanonicalAddress(const std::string &text) {
    uint8_t bytes[16] = {};
    bool isIpv6 = false;
    if (text.find('\0') != std::string::npos || !convert::ParseAddress(text.c_str(), bytes, &isIpv6))
        return std::nullopt;
    return convert::FormatAddress(bytes, isIpv6).text;
}

bool IsDecimal(const std::string &text) {
    uint32_t number = 0;
    const char *end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    return error == std::errc() && stop == end;
}

// Whether a text or a number is what people may write there.
Flaw CheckRule(const StoreField &form, const Node &node, const std::string &path) {
    const std::string quoted = "\"" + node.text + "\"";
    switch (form.rule) {
    case layout::Rule::kVlan:
        if (node.number >= 0 && node.number <= kLastVlan) return {};
        return {path, std::to_string(node.number) + " is no VLAN id, expected 0 to 4095"};
    case layout::Rule::kIpv4: {
        const auto address = CanonicalAddress(node.text);
        if (address && address->find(':') == std::string::npos) return {};
        return {path, quoted + " is no IPv4 address, expected one as 192.0.2.1"};
    }
    case layout::Rule::kAddress:
        if (CanonicalAddress(node.text)) return {};
        return {path, quoted + " is no IP address, expected one as 192.0.2.1 or 2001:db8::1"};
    case layout::Rule::kSlot:
        if (IsDecimal(node.text)) return {};
        return {path, quoted + " is no number, expected 0 to 4294967295 in digits"};
    case layout::Rule::kBits:
        if (node.number >= 0 && node.number % 8 == 0) return {};
        return {path, std::to_string(node.number) +
                          (node.number < 0 ? " is negative"
                                           : " is no multiple of 8, and only whole bytes are kept")};
    case layout::Rule::kUnset:
    case layout::Rule::kNone:
        break;
    }
    return {};
}

Flaw CheckText(const StoreField &form, const Node &node, const std::string &path) {
    if (Flaw flaw = Expect(node, Node::Kind::kText, path)) return flaw;
    if (node.text.find('\0') != std::string::npos) return {path, "contains a NUL"};
    if (form.maxText && node.text.size() > form.maxText) {
        return {path, "is " + std::to_string(node.text.size()) + " bytes long, at most " +
                          std::to_string(form.maxText) + " fit"};
    }
    if (!form.domain) return CheckRule(form, node, path);
    std::string known;
    for (uint32_t i = 0; i < form.domain->textCount; ++i) {
        const char *text = form.domain->texts[i];
        if (!text) continue;
        if (node.text == text) return {};
        known += std::string(known.empty() ? "" : ", ") + text;
    }
    return {path, "\"" + node.text + "\" is not known; expected one of " + known};
}

Flaw CheckNumber(const StoreField &form, const Node &node, int64_t least, int64_t most,
                 const std::string &path) {
    if (Flaw flaw = Expect(node, Node::Kind::kNumber, path)) return flaw;
    const bool hasRange = form.rule == layout::Rule::kVlan || form.rule == layout::Rule::kBits;
    if (hasRange) return CheckRule(form, node, path);
    if (node.number >= least && node.number <= most) return {};
    return {path, std::to_string(node.number) + " is out of range, expected " + std::to_string(least) +
                      " to " + std::to_string(most)};
}

template <typename T, typename Set>
Flaw WriteNumber(const StoreField &form, const Place &place, const Node &node, const std::string &path,
                 Set set) {
    if (Flaw flaw =
            CheckNumber(form, node, std::numeric_limits<T>::min(), std::numeric_limits<T>::max(), path))
        return flaw;
    const int32_t status = set(place.parent, place.name, static_cast<T>(node.number));
    return status ? Refused(path, status) : Flaw{};
}

Flaw WriteList(const StoreField &form, const Place &place, const Node &node, const std::string &path) {
    if (Flaw flaw = Expect(node, Node::Kind::kList, path)) return flaw;
    int32_t status = configstore::SetValueEmptyList(place.parent, place.name);
    if (status) return Refused(path, status);
    for (std::size_t i = 0; i < node.items.size(); ++i) {
        const Node &item = node.items[i];
        const std::string itemPath = path + "[" + std::to_string(i) + "]";
        const bool isText = form.form == Form::kTexts;
        if (Flaw flaw =
                isText ? CheckText(form, item, itemPath) : CheckNumber(form, item, 0, UINT16_MAX, itemPath))
            return flaw;
        status =
            isText ? configstore::AppendValueString(place.parent, place.name, item.text.c_str())
                   : configstore::AppendValueInt(place.parent, place.name, static_cast<int32_t>(item.number));
        if (status) return Refused(itemPath, status);
    }
    return {};
}

Flaw WriteMember(const StoreField &form, const Place &place, const Node &node, const std::string &path);

Flaw WriteMembers(const StoreField &form, configstore::Object *object, const Node &node,
                  const std::string &path) {
    const std::string prefix = path.empty() ? "" : path + ".";
    for (const Node &item : node.items) {
        const StoreField *member = FindField(form, item.name);
        if (!member) {
            std::string known;
            for (const StoreField &field : form.members)
                known += (known.empty() ? "" : ", ") + std::string(field.name);
            return {prefix + item.name, "is no field of this value; there are " + known};
        }
        if (Flaw flaw = WriteMember(*member, {object, member->name, nullptr}, item, prefix + item.name))
            return flaw;
    }
    for (const StoreField &field : form.members) {
        if (field.isNeeded && !node.Find(field.name))
            return {prefix + field.name, "is missing; the value needs it"};
    }
    return {};
}

Flaw WriteInstances(const StoreField &form, const Place &place, const Node &node, const std::string &path) {
    if (Flaw flaw = Expect(node, Node::Kind::kList, path)) return flaw;
    const int32_t status = configstore::SetValueEmptyList(place.parent, place.name);
    if (status) return Refused(path, status);
    for (std::size_t i = 0; i < node.items.size(); ++i) {
        const Node &item = node.items[i];
        const std::string itemPath = path + "[" + std::to_string(i) + "]";
        if (Flaw flaw = Expect(item, Node::Kind::kObject, itemPath)) return flaw;
        std::string id = std::to_string(i);
        if (form.id) {
            const Node *member = item.Find(form.id);
            const std::string memberPath = itemPath + "." + form.id;
            if (!member) return {memberPath, "is missing; it tells the entries apart"};
            if (Flaw flaw = Expect(*member, Node::Kind::kText, memberPath)) return flaw;
            if (member->text.empty()) return {memberPath, "is empty; it tells the entries apart"};
            id = member->text;
            if (!item.name.empty())
                return {memberPath, "is \"" + id + "\", but the entry is named \"" + item.name + "\""};
        }
        configstore::Object *object = nullptr;
        if (configstore::GetSubObject(place.parent, place.name, id.c_str(), &object) == 0) {
            return {itemPath + "." + form.id, "\"" + id + "\" is there twice"};
        }
        const int32_t created = configstore::CreateSubObject(place.parent, place.name, id.c_str(), &object);
        if (created) return Refused(itemPath, created);
        if (Flaw flaw = WriteMembers(form, object, item, itemPath)) return flaw;
    }
    return {};
}

Flaw WriteMember(const StoreField &form, const Place &place, const Node &node, const std::string &path) {
    switch (form.form) {
    case Form::kBool: {
        if (Flaw flaw = Expect(node, Node::Kind::kBool, path)) return flaw;
        const int32_t status = configstore::SetValueBool(place.parent, place.name, node.flag);
        return status ? Refused(path, status) : Flaw{};
    }
    case Form::kUint16:
        return WriteNumber<uint16_t>(form, place, node, path, configstore::SetValueUint16);
    case Form::kUint32:
        return WriteNumber<uint32_t>(form, place, node, path, configstore::SetValueUint32);
    case Form::kInt:
        return WriteNumber<int32_t>(form, place, node, path, configstore::SetValueInt);
    case Form::kLong:
        return WriteNumber<int64_t>(form, place, node, path, configstore::SetValueLong);
    case Form::kText: {
        if (Flaw flaw = CheckText(form, node, path)) return flaw;
        const int32_t status = configstore::SetValueStr(place.parent, place.name, node.text.c_str());
        return status ? Refused(path, status) : Flaw{};
    }
    case Form::kTexts:
    case Form::kInts:
        return WriteList(form, place, node, path);
    case Form::kObject: {
        if (Flaw flaw = Expect(node, Node::Kind::kObject, path)) return flaw;
        configstore::Object *object = nullptr;
        const int32_t status = configstore::CreateSubObject(place.parent, place.name, place.id, &object);
        return status ? Refused(path, status) : WriteMembers(form, object, node, path);
    }
    case Form::kInstances:
        return WriteInstances(form, place, node, path);
    case Form::kNone:
        break;
    }
    return {path, "has no typed form"};
}

using Check = Flaw (*)(const StoreField &form, const Node &leaf, const std::string &path);

// The first flaw of a leaf, elements of lists included. Its path is put together on the way back: hardly ever
// is there one.
Flaw FindFlaw(const StoreField &form, const Node &node, Check check) {
    const bool isList = node.kind == Node::Kind::kList;
    if (!isList && node.kind != Node::Kind::kObject) return check(form, node, "");
    for (std::size_t i = 0; i < node.items.size(); ++i) {
        const Node &item = node.items[i];
        const StoreField *field = isList ? &form : FindField(form, item.name);
        if (!field) continue;
        if (Flaw flaw = FindFlaw(*field, item, check)) {
            const bool isMember = !flaw.field.empty() && flaw.field.front() != '[';
            const std::string step = isList ? "[" + std::to_string(i) + "]" : item.name;
            flaw.field = step + (isMember ? "." : "") + flaw.field;
            return flaw;
        }
    }
    return {};
}

Flaw CheckLength(const StoreField &form, const Node &leaf, const std::string &path) {
    if (leaf.kind == Node::Kind::kText && form.maxText && leaf.text.size() > form.maxText)
        return {path, "has no end inside its field"};
    return {};
}

void NormalizeMembers(const StoreField &form, Node *object) {
    DropUnset(form, object);
    for (Node &member : object->items) {
        if (const StoreField *field = FindField(form, member.name)) member = Normalized(*field, member);
    }
}

// For a message: long lists are counted, and long texts cut.
std::string Told(const Node &node) {
    constexpr std::size_t kMostElements = 8, kMostBytes = 200;
    if (node.kind == Node::Kind::kList && node.items.size() > kMostElements)
        return std::to_string(node.items.size()) + " elements";
    std::string line = ToLine(node);
    if (line.size() <= kMostBytes) return line;
    std::size_t cut = kMostBytes;
    while (cut > 0 && (static_cast<unsigned char>(line[cut]) & 0xc0) == 0x80)
        --cut; // not inside a character
    return line.substr(0, cut) + "…";
}

void CompareAt(const Node &given, const Node *found, const std::string &path, std::vector<std::string> *out) {
    if (given.kind == Node::Kind::kObject && found) {
        for (const Node &item : given.items) {
            CompareAt(item, found->Find(item.name), path.empty() ? item.name : path + "." + item.name, out);
        }
        return;
    }
    if (given.kind == Node::Kind::kList && found && given.items.size() == found->items.size()) {
        for (std::size_t i = 0; i < given.items.size(); ++i) {
            CompareAt(given.items[i], &found->items[i], path + "[" + std::to_string(i) + "]", out);
        }
        return;
    }
    if (given.kind == Node::Kind::kNumber && found && found->kind == given.kind &&
        found->number == given.number)
        return;
    if (given.kind == Node::Kind::kList && given.items.empty() && !found) return; // none either way
    if (found && ToLine(given) == ToLine(*found)) return;
    out->push_back((path.empty() ? "the value" : path) + ": " + Told(given) + " reads back as " +
                   (found ? Told(*found) : "absent"));
}

} // namespace

const Node *Node::Find(std::string_view member) const {
    const auto item =
        std::find_if(items.begin(), items.end(), [&](const Node &node) { return node.name == member; });
    return item == items.end() ? nullptr : &*item;
}

Node ReadTree(const layout::StoreField &form, const Place &place) {
    Node node = ReadMember(form, place);
    const bool isList = form.form == Form::kInstances || form.form == Form::kTexts;
    return node.kind == Node::Kind::kNull && isList ? Make(form, Node::Kind::kList) : node;
}

void DropUnset(const layout::StoreField &form, Node *object) {
    std::erase_if(object->items, [&](const Node &member) {
        const auto *field = FindField(form, member.name);
        return field && field->rule == layout::Rule::kUnset && member.number == UINT32_MAX;
    });
}

Node Normalized(const layout::StoreField &form, const Node &node) {
    Node result = node;
    if (form.rule == layout::Rule::kAddress && node.kind == Node::Kind::kText)
        result.text = CanonicalAddress(node.text).value_or(node.text);
    if (form.form == Form::kInstances && node.kind == Node::Kind::kObject) {
        result.kind = Node::Kind::kList;
        for (Node &item : result.items) {
            const Node *const own = form.id ? item.Find(form.id) : nullptr;
            if (form.id && !own) {
                Node id = TextNode(item.name.c_str());
                id.name = form.id;
                item.items.insert(item.items.begin(), std::move(id));
            }
            // A name that its entry contradicts stays, and is refused. The store names slots as signed numbers.
            const bool isRight =
                !own || own->text == item.name || FindField(form, form.id)->rule == layout::Rule::kSlot;
            if (isRight) item.name.clear();
        }
    }
    for (Node &item : result.items) {
        if (result.kind == Node::Kind::kList && form.form == Form::kInstances) {
            NormalizeMembers(form, &item);
            continue;
        }
        if (result.kind == Node::Kind::kList && form.form == Form::kTexts) item = Normalized(form, item);
    }
    if (result.kind == Node::Kind::kObject) NormalizeMembers(form, &result);
    return result;
}

Flaw WriteTree(const layout::StoreField &form, const Place &place, const Node &node) {
    return WriteMember(form, place, node, "");
}

Flaw FindLongText(const layout::StoreField &form, const Node &node) {
    return FindFlaw(form, node, CheckLength);
}

Flaw FindBrokenRule(const layout::StoreField &form, const Node &node) {
    return FindFlaw(form, node, CheckRule);
}

std::vector<std::string> Compare(const Node &given, const Node &found) {
    std::vector<std::string> differences;
    CompareAt(given, &found, "", &differences);
    return differences;
}

} // namespace dvs::typed
