/* SPDX-License-Identifier: Apache-2.0 */
// The store double's sub-objects and values (fake_store.h). Nodes are owned by pointer, so that addresses
// stay valid while siblings are added and removed.

#include <cstdlib>
#include <limits>

#include "configstore/fake_tree.h"

namespace fake_store {

uint32_t g_nextId = 0;

}

namespace configstore {

using namespace fake_store;

namespace {

bool IsPlain(const Object &node) {
    return node.kind != Kind::Object && node.kind != Kind::Instances;
}
bool IsList(const Object &node) {
    return node.kind == Kind::Instances || node.kind == Kind::EmptyList;
}

// A member of the kind a setter needs; null if an object has that name.
Object *ForValue(Object *object, const char *name, Kind kind) {
    auto *node = object->Member(name);
    if (node->kind == Kind::Object && !node->items.empty()) return nullptr;
    if (node->kind == Kind::Instances) return nullptr;
    node->Become(kind);
    return node;
}
int32_t SetNumber(Object *object, const char *name, int64_t value) {
    if (!object || !name) return BAD_PARAMETER;
    auto *node = ForValue(object, name, Kind::Number);
    if (!node) return SCHEMA_VIOLATION;
    node->number = value;
    return OK;
}
template <typename T> int32_t GetNumber(Object *object, const char *name, T *value) {
    if (!object || !name) return BAD_PARAMETER;
    const auto *node = object->Find(name);
    if (!node) return NOT_FOUND;
    if (node->kind != Kind::Number) return SCHEMA_VIOLATION;
    if (node->number < std::numeric_limits<T>::min()) return SCHEMA_VIOLATION;
    if (node->number > static_cast<int64_t>(std::numeric_limits<T>::max())) return SCHEMA_VIOLATION;
    *value = static_cast<T>(node->number);
    return OK;
}
int32_t Append(Object *object, const char *name, Kind kind, const std::string &text, int64_t number) {
    auto *node = object->Find(name);
    if (!node) {
        node = object->Member(name);
        node->kind = Kind::EmptyList;
    }
    if (node->kind == Kind::EmptyList) node->kind = kind;
    if (node->kind != kind) return SCHEMA_VIOLATION;
    auto element = std::make_unique<Object>();
    element->kind = kind == Kind::Texts ? Kind::Text : Kind::Number;
    element->text = text;
    element->number = number;
    node->items.emplace_back("", std::move(element));
    return OK;
}

void Select(Object *object, const FilterSpec &spec, std::vector<Object *> *found) {
    if (auto *member = object->Find(spec.key)) {
        if (member->kind != Kind::Instances && member->kind != Kind::Texts) return;
        for (auto &[id, node] : member->items)
            if (spec.instanceId.empty() || id == spec.instanceId) found->push_back(node.get());
        return;
    }
    for (auto &[name, node] : object->items)
        if (node->kind == Kind::Object) Select(node.get(), spec, found);
}

} // namespace

int32_t GetSubObject(Object *parent, const char *name, const char *instanceId, Object **out) {
    ENTER;
    if (!parent || !name) return BAD_PARAMETER;
    auto *node = parent->Find(name);
    if (!node) return NOT_FOUND;
    const std::string id = Str(instanceId);
    if (IsList(*node)) {
        node = node->Find(id);
        if (!node) return NOT_FOUND;
    } else if (IsPlain(*node) || !id.empty()) {
        return SCHEMA_VIOLATION;
    }
    *out = node;
    return OK;
}
int32_t CreateSubObject(Object *parent, const char *name, const char *instanceId, Object **out) {
    ENTER;
    if (!parent || !name) return BAD_PARAMETER;
    auto *node = parent->Find(name);
    const std::string id = Str(instanceId);
    if (!node) {
        node = parent->Member(name);
        node->kind = id.empty() ? Kind::Object : Kind::Instances;
    } else if (node->kind == Kind::EmptyList && !id.empty()) {
        node->Become(Kind::Instances);
    } else if (node->kind != (id.empty() ? Kind::Object : Kind::Instances)) {
        return SCHEMA_VIOLATION;
    }
    if (!id.empty()) node = node->Member(id);
    node->Become(Kind::Object);
    node->id = id;
    *out = node;
    return OK;
}
int32_t DeleteSubObject(Object *parent, const char *name, const char *instanceId) {
    ENTER;
    auto *node = parent->Find(name);
    const std::string id = Str(instanceId);
    if (!node) return NOT_FOUND;
    if (!id.empty()) return IsList(*node) ? (node->Erase(id) ? OK : NOT_FOUND) : SCHEMA_VIOLATION;
    if (node->kind != Kind::Object) return SCHEMA_VIOLATION;
    parent->Erase(name);
    return OK;
}
int32_t GetSubObjectInstances(Object *parent, const FilterSpec *spec, Object ***objects, int32_t *count) {
    ENTER;
    if (!parent || !spec) return BAD_PARAMETER;
    std::vector<Object *> found;
    Select(parent, *spec, &found);
    if (found.empty()) return NOT_FOUND;
    *objects = HandOut(found, count);
    return OK;
}
int32_t DeleteSubObjectInstances(Object *parent, const FilterSpec *spec) {
    ENTER;
    auto *node = parent->Find(spec->key);
    if (!node) return NOT_FOUND;
    if (!IsList(*node)) return SCHEMA_VIOLATION;
    parent->Erase(spec->key);
    return OK;
}
void FreeSubObjectArray(Object **objects) {
    if (!objects) return;
    --g_open;
    delete[] objects;
}

int32_t GenerateInstanceId(char **id) {
    ENTER;
    *id = HandOut("generated-" + std::to_string(++g_nextId));
    return OK;
}
void FreeString(char *text) {
    if (!text) return;
    --g_open;
    std::free(text);
}

int32_t SetValueBool(Object *object, const char *name, bool value) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    auto *node = ForValue(object, name, Kind::Bool);
    if (!node) return SCHEMA_VIOLATION;
    node->flag = value;
    return OK;
}
int32_t SetValueUint16(Object *object, const char *name, uint16_t value) {
    ENTER;
    return SetNumber(object, name, value);
}
int32_t SetValueUint32(Object *object, const char *name, uint32_t value) {
    ENTER;
    return SetNumber(object, name, value);
}
int32_t SetValueInt(Object *object, const char *name, int32_t value) {
    ENTER;
    return SetNumber(object, name, value);
}
int32_t SetValueLong(Object *object, const char *name, int64_t value) {
    ENTER;
    return SetNumber(object, name, value);
}
int32_t SetValueStr(Object *object, const char *name, const char *value) {
    ENTER;
    if (!object || !name || !value) return BAD_PARAMETER;
    auto *node = ForValue(object, name, Kind::Text);
    if (!node) return SCHEMA_VIOLATION;
    node->text = value;
    return OK;
}
int32_t SetValueBinary(Object *object, const char *name, const void *data, uint32_t len) {
    ENTER;
    if (!object || !name || (!data && len)) return BAD_PARAMETER;
    auto *node = ForValue(object, name, Kind::Bytes);
    if (!node) return SCHEMA_VIOLATION;
    node->text.assign(static_cast<const char *>(data), len);
    return OK;
}
int32_t SetValueEmptyList(Object *object, const char *name) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    auto *node = object->Member(name);
    if (node->kind == Kind::Object && !node->items.empty()) return SCHEMA_VIOLATION;
    node->Become(Kind::EmptyList);
    return OK;
}
int32_t AppendValueString(Object *object, const char *name, const char *text) {
    ENTER;
    if (!object || !name || !text) return BAD_PARAMETER;
    return Append(object, name, Kind::Texts, text, 0);
}
int32_t AppendValueInt(Object *object, const char *name, int32_t value) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    return Append(object, name, Kind::Numbers, "", value);
}

int32_t GetValueBool(Object *object, const char *name, bool *value) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    const auto *node = object->Find(name);
    if (!node) return NOT_FOUND;
    if (node->kind != Kind::Bool) return SCHEMA_VIOLATION;
    *value = node->flag;
    return OK;
}
int32_t GetValueUint16(Object *object, const char *name, uint16_t *value) {
    ENTER;
    return GetNumber(object, name, value);
}
int32_t GetValueUint32(Object *object, const char *name, uint32_t *value) {
    ENTER;
    return GetNumber(object, name, value);
}
int32_t GetValueInt(Object *object, const char *name, int32_t *value) {
    ENTER;
    return GetNumber(object, name, value);
}
int32_t GetValueLong(Object *object, const char *name, int64_t *value) {
    ENTER;
    return GetNumber(object, name, value);
}
int32_t GetValueStr(Object *object, const char *name, char **value) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    const auto *node = object->Find(name);
    if (!node && Str(name) == "key" && !object->id.empty()) {
        *value = HandOut(object->id);
        return OK;
    }
    if (!node) return NOT_FOUND;
    if (node->kind != Kind::Text) return SCHEMA_VIOLATION;
    *value = HandOut(node->text);
    return OK;
}
int32_t GetValueBinary(Object *object, const char *name, void **data, uint32_t *len) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    const auto *node = object->Find(name);
    if (!node) return NOT_FOUND;
    if (node->kind != Kind::Bytes) return SCHEMA_VIOLATION;
    *len = static_cast<uint32_t>(node->text.size());
    *data = std::malloc(node->text.size() + !node->text.size());
    std::memcpy(*data, node->text.data(), node->text.size());
    ++g_open;
    return OK;
}
void FreeBinary(void *data) {
    if (!data) return;
    --g_open;
    std::free(data);
}
int32_t GetValueStringArray(Object *object, const char *name, char ***strings, int32_t *count) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    const auto *node = object->Find(name);
    if (!node) return NOT_FOUND;
    if (node->kind != Kind::Texts && node->kind != Kind::EmptyList) return SCHEMA_VIOLATION;
    *count = static_cast<int32_t>(node->items.size());
    *strings = new char *[node->items.size() + 1];
    ++g_open;
    for (std::size_t i = 0; i < node->items.size(); ++i)
        (*strings)[i] = HandOut(node->items[i].second->text);
    return OK;
}
void FreeStringArray(char **strings, int32_t count) {
    if (!strings) return;
    for (int32_t i = 0; i < count; ++i)
        FreeString(strings[i]);
    --g_open;
    delete[] strings;
}
int32_t GetValueIntArray(Object *object, const char *name, int32_t **values, int32_t *count) {
    ENTER;
    if (!object || !name) return BAD_PARAMETER;
    const auto *node = object->Find(name);
    if (!node) return NOT_FOUND;
    if (node->kind != Kind::Numbers && node->kind != Kind::EmptyList) return SCHEMA_VIOLATION;
    *count = static_cast<int32_t>(node->items.size());
    *values = new int32_t[node->items.size() + 1];
    ++g_open;
    for (std::size_t i = 0; i < node->items.size(); ++i)
        (*values)[i] = static_cast<int32_t>(node->items[i].second->number);
    return OK;
}
void FreeIntArray(int32_t *values) {
    if (!values) return;
    --g_open;
    delete[] values;
}
int32_t RemoveValue(Object *object, const char *name) {
    ENTER;
    const auto *node = object->Find(name);
    if (!node) return NOT_FOUND;
    if (!IsPlain(*node)) return SCHEMA_VIOLATION;
    object->Erase(name);
    return OK;
}

} // namespace configstore
