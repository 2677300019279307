/* SPDX-License-Identifier: Apache-2.0 */
// Typed values of the client interface (platform/configstore.h). A setter takes any value, marks what the
// schema does not allow and leaves the verdict to Set; a getter refuses what is not of its type.

#include <cstdlib>
#include <cstring>
#include <limits>

#include "base/base64.h"
#include "platform/embedded/configstore/node.h"
#include "platform/embedded/configstore/text_code.h"

namespace configstore {

namespace {

/// The handle's tree, when the handle is an object's and the name one that a member can have.
Tree *CheckTarget(Object *object, const char *name) {
    if (!object || object->kind != Kind::Object || !name || !*name) return nullptr;
    return TreeOf(object);
}

/// Sets a member to what `fill` makes of its node. Sub-objects are not overwritten: handles into them may be
/// about.
template <typename Fill> int32_t Put(Object *object, const char *name, Fill &&fill) {
    return Guarded([&]() -> int32_t {
        Tree *const tree = CheckTarget(object, name);
        if (!tree) return BAD_PARAMETER;
        auto [member, field] = FindPlace(object, name);
        if (member && HoldsObjects(member)) return SCHEMA_VIOLATION;
        // What needs memory comes first: without it nothing is changed.
        Object content;
        content.span = {nullptr, 0};
        fill(tree, &content);
        if (!member)
            member = field ? AddDescribed(tree, object, field) : AddMember(tree, object, nullptr, name);
        member->kind = content.kind;
        member->span = content.span;
        member->maybeBinary = false; // it is known now what it is
        Judge(tree, member);
        return OK;
    });
}

int32_t PutInteger(Object *object, const char *name, int64_t value) {
    return Put(object, name, [value](Tree *, Object *node) {
        node->kind = Kind::Integer;
        node->integer = value;
    });
}

/// Finds a value for a getter; `out` is the getter's output, which must be there.
int32_t Lookup(Object *object, const char *name, const void *out, Object **value) {
    if (!out || !object || object->kind != Kind::Object || !name || !*name) return BAD_PARAMETER;
    Object *const member = FindMember(object, name);
    if (!member) return NOT_FOUND;
    *value = member;
    return OK;
}

template <typename Number> int32_t TakeInteger(Object *object, const char *name, Number *out) {
    Object *value = nullptr;
    const int32_t status = Lookup(object, name, out, &value);
    if (status != OK) return status;
    if (value->kind != Kind::Integer || value->integer < int64_t{std::numeric_limits<Number>::min()} ||
        value->integer > int64_t{std::numeric_limits<Number>::max()})
        return SCHEMA_VIOLATION;
    *out = static_cast<Number>(value->integer);
    return OK;
}

/// A copy that the caller releases with free(); a NUL follows the bytes.
char *CopyOut(const char *data, std::size_t size) {
    auto *const copy = static_cast<char *>(std::malloc(size + 1));
    if (!copy) throw std::bad_alloc();
    if (size > 0) std::memcpy(copy, data, size);
    copy[size] = '\0';
    return copy;
}

/// A document does not tell base64 from other text where the schema has nothing to say.
int32_t DecodeOut(Span text, void **data, uint32_t *len) {
    char *const bytes = CopyOut(text.data, text.size);
    std::size_t size = 0;
    if (!dvs::base::DecodeBase64({text.data, text.size}, bytes, &size) || size > UINT32_MAX) {
        std::free(bytes);
        return SCHEMA_VIOLATION;
    }
    *data = bytes;
    *len = static_cast<uint32_t>(size);
    return OK;
}

/// An instance's id stands in for a "key" that it does not have.
const std::string_view *ImpliedKey(Object *object, const char *name, std::string_view *id) {
    if (std::strcmp(name, "key") != 0) return nullptr;
    const bool instance = object->isRoot || object->parent->kind == Kind::Instances;
    *id = NameOf(object);
    return instance && !id->empty() ? id : nullptr;
}

/// The member as a list for a getter: its text form is read first if it has to be.
int32_t LookupList(Object *object, const char *name, const void *out, const void *count, Kind kind,
                   Object **list) {
    if (!count) return BAD_PARAMETER;
    const int32_t status = Lookup(object, name, out, list);
    if (status != OK) return status;
    if ((*list)->kind == Kind::Raw) (void)Expand(TreeOf(object), *list);
    const bool noInstances = (*list)->kind == Kind::Instances && (*list)->table->count == 0;
    if ((*list)->kind != kind && (*list)->kind != Kind::EmptyList && !noInstances) return SCHEMA_VIOLATION;
    return OK;
}

std::size_t CountOf(const Object *list) {
    return list->kind == Kind::TextList || list->kind == Kind::IntegerList ? list->list->count : 0;
}

/// The list that an element is appended to: an absent one is made, an empty one takes the element's kind.
template <typename AppendTo>
int32_t Append(Object *object, const char *name, Kind kind, bool (*fits)(const Field *, const void *),
               const void *element, AppendTo &&append) {
    return Guarded([&]() -> int32_t {
        Tree *const tree = CheckTarget(object, name);
        if (!tree) return BAD_PARAMETER;
        auto [member, field] = FindPlace(object, name);
        if (member && member->kind == Kind::Raw) (void)Expand(tree, member);
        const bool empty = !member || member->kind == Kind::EmptyList ||
                           (member->kind == Kind::Instances && member->table->count == 0);
        if (!empty && member->kind != kind) return SCHEMA_VIOLATION;
        PackedList *const list = empty ? NewList(tree) : member->list;
        append(tree, list);
        if (!member) member = AddMember(tree, object, field, name);
        if (empty) {
            member->kind = kind;
            member->list = list;
            Judge(tree, member);
        } else if (member->described && !fits(member->field, element)) {
            member->bad = tree->suspect = true; // the others have been judged
        }
        return OK;
    });
}

} // namespace

int32_t SetValueBool(Object *object, const char *name, bool value) {
    return Put(object, name, [value](Tree *, Object *node) {
        node->kind = Kind::Bool;
        node->boolean = value;
    });
}

int32_t SetValueUint16(Object *object, const char *name, uint16_t value) {
    return PutInteger(object, name, value);
}
int32_t SetValueUint32(Object *object, const char *name, uint32_t value) {
    return PutInteger(object, name, value);
}
int32_t SetValueInt(Object *object, const char *name, int32_t value) {
    return PutInteger(object, name, value);
}
int32_t SetValueLong(Object *object, const char *name, int64_t value) {
    return PutInteger(object, name, value);
}

int32_t SetValueStr(Object *object, const char *name, const char *value) {
    if (!value) return BAD_PARAMETER;
    return Put(object, name, [value](Tree *tree, Object *node) {
        const std::string_view text(value);
        node->kind = Kind::Text;
        node->span = {tree->arena.Copy(text), text.size()};
    });
}

int32_t SetValueBinary(Object *object, const char *name, const void *data, uint32_t len) {
    if (!data && len > 0) return BAD_PARAMETER;
    return Put(object, name, [data, len](Tree *tree, Object *node) {
        node->kind = Kind::Binary;
        node->span = {tree->arena.Copy({static_cast<const char *>(data), len}), len};
    });
}

int32_t SetValueEmptyList(Object *object, const char *name) {
    return Guarded([&]() -> int32_t {
        Tree *const tree = CheckTarget(object, name);
        if (!tree) return BAD_PARAMETER;
        auto [member, field] = FindPlace(object, name);
        if (member && member->kind == Kind::Object) return SCHEMA_VIOLATION;
        if (!member) member = AddMember(tree, object, field, name);
        if (member->kind == Kind::Instances)
            RemoveAllChildren(member);
        else if (member->described && member->field->type == FieldType::Instances)
            MakeInstances(tree, member);
        else
            member->kind = Kind::EmptyList;
        Judge(tree, member);
        return OK;
    });
}

int32_t AppendValueString(Object *object, const char *name, const char *text) {
    if (!text) return BAD_PARAMETER;
    return Append(
        object, name, Kind::TextList,
        [](const Field *field, const void *element) {
            return TextFits(field, std::strlen(static_cast<const char *>(element)));
        },
        text, [text](Tree *tree, PackedList *list) { AppendText(tree, list, text); });
}

int32_t AppendValueInt(Object *object, const char *name, int32_t value) {
    return Append(
        object, name, Kind::IntegerList,
        [](const Field *field, const void *element) {
            return IntegerFits(field, *static_cast<const int32_t *>(element));
        },
        &value, [value](Tree *tree, PackedList *list) { AppendInteger(tree, list, value); });
}

int32_t GetValueBool(Object *object, const char *name, bool *out) {
    Object *value = nullptr;
    const int32_t status = Lookup(object, name, out, &value);
    if (status != OK) return status;
    if (value->kind != Kind::Bool) return SCHEMA_VIOLATION;
    *out = value->boolean;
    return OK;
}

int32_t GetValueUint16(Object *object, const char *name, uint16_t *value) {
    return TakeInteger(object, name, value);
}
int32_t GetValueUint32(Object *object, const char *name, uint32_t *value) {
    return TakeInteger(object, name, value);
}
int32_t GetValueInt(Object *object, const char *name, int32_t *value) {
    return TakeInteger(object, name, value);
}
int32_t GetValueLong(Object *object, const char *name, int64_t *value) {
    return TakeInteger(object, name, value);
}

int32_t GetValueStr(Object *object, const char *name, char **out) {
    return Guarded([&] {
        Object *value = nullptr;
        const int32_t status = Lookup(object, name, out, &value);
        std::string_view id;
        if (status == NOT_FOUND && ImpliedKey(object, name, &id)) {
            *out = CopyOut(id.data(), id.size());
            return static_cast<int32_t>(OK);
        }
        if (status != OK) return status;
        if (value->kind != Kind::Text) return static_cast<int32_t>(SCHEMA_VIOLATION);
        *out = CopyOut(value->span.data, value->span.size);
        return static_cast<int32_t>(OK);
    });
}

int32_t GetValueBinary(Object *object, const char *name, void **data, uint32_t *len) {
    return Guarded([&]() -> int32_t {
        Object *value = nullptr;
        const int32_t status = Lookup(object, name, data, &value);
        if (status != OK) return status;
        if (!len) return BAD_PARAMETER;
        if (value->kind == Kind::Text && value->maybeBinary) return DecodeOut(value->span, data, len);
        if (value->kind != Kind::Binary || value->span.size > UINT32_MAX) return SCHEMA_VIOLATION;
        *data = CopyOut(value->span.data, value->span.size);
        *len = static_cast<uint32_t>(value->span.size);
        return OK;
    });
}

void FreeBinary(void *data) {
    std::free(data);
}

int32_t GetValueStringArray(Object *object, const char *name, char ***strings, int32_t *count) {
    return Guarded([&] {
        Object *value = nullptr;
        const int32_t status = LookupList(object, name, strings, count, Kind::TextList, &value);
        if (status != OK) return status;
        const std::size_t number = CountOf(value);
        if (number > INT32_MAX) return static_cast<int32_t>(FAILED);
        // One block: the pointers, then the texts as they stand in the list.
        const std::size_t bytes = number > 0 ? value->list->size : 0;
        auto **const array = static_cast<char **>(std::malloc((number + 1) * sizeof(char *) + bytes));
        if (!array) return static_cast<int32_t>(NO_MEMORY);
        char *at = reinterpret_cast<char *>(array + number + 1);
        if (bytes > 0) std::memcpy(at, value->list->data, bytes);
        for (std::size_t i = 0; i < number; i++) {
            array[i] = at;
            at += std::strlen(at) + 1;
        }
        array[number] = nullptr;
        *strings = array;
        *count = static_cast<int32_t>(number);
        return static_cast<int32_t>(OK);
    });
}

void FreeStringArray(char **strings, int32_t) {
    std::free(static_cast<void *>(strings));
}

int32_t GetValueIntArray(Object *object, const char *name, int32_t **values, int32_t *count) {
    return Guarded([&] {
        Object *value = nullptr;
        const int32_t status = LookupList(object, name, values, count, Kind::IntegerList, &value);
        if (status != OK) return status;
        const std::size_t number = CountOf(value);
        if (number > INT32_MAX) return static_cast<int32_t>(FAILED);
        auto *const array = static_cast<int32_t *>(std::malloc((number + 1) * sizeof(int32_t)));
        if (!array) return static_cast<int32_t>(NO_MEMORY);
        for (std::size_t i = 0; i < number; i++) {
            const int64_t element = IntegerAt(value->list, i);
            if (element < INT32_MIN || element > INT32_MAX) {
                std::free(array);
                return static_cast<int32_t>(SCHEMA_VIOLATION);
            }
            array[i] = static_cast<int32_t>(element);
        }
        *values = array;
        *count = static_cast<int32_t>(number);
        return static_cast<int32_t>(OK);
    });
}

void FreeIntArray(int32_t *values) {
    std::free(values);
}

int32_t RemoveValue(Object *object, const char *name) {
    if (!CheckTarget(object, name)) return BAD_PARAMETER;
    Object *const member = FindMember(object, name);
    if (!member) return NOT_FOUND;
    const bool anything = !member->described || member->field->type == FieldType::Any;
    if (HoldsObjects(member) && !anything) return SCHEMA_VIOLATION;
    if (member->kind == Kind::Instances) RemoveAllChildren(member);
    RemoveChild(object, member);
    return OK;
}

} // namespace configstore
