/* SPDX-License-Identifier: Apache-2.0 */
// The store double (fake_store.h). Nodes are shared pointers so that addresses stay while siblings come and
// go.

#include "configstore/fake_store.h"

#include <algorithm>
#include <cstring>
#include <limits>
#include <map>
#include <memory>
#include <sstream>
#include <utility>
#include <vector>

namespace configstore {

// One node of a tree: an object with members, or a plain value. `items` are the elements of a list.
struct Object {
    enum class Kind { Bool, Number, Text, Bytes, Object, EmptyList, Texts, Numbers, Instances };
    Kind kind = Kind::Object;
    bool flag = false;
    int64_t number = 0;
    std::string text; // a text's value, bytes of a binary
    std::vector<std::pair<std::string, std::unique_ptr<Object>>> items;
    std::string id; // of an instance or a root
    std::string address;

    Object *Find(const std::string &name) {
        for (auto &[key, node] : items)
            if (key == name) return node.get();
        return nullptr;
    }
    Object *Member(const std::string &name) {
        if (auto *node = Find(name)) return node;
        return items.emplace_back(name, std::make_unique<Object>()).second.get();
    }
    bool Erase(const std::string &name) {
        return std::erase_if(items, [&](const auto &item) { return item.first == name; }) != 0;
    }
    std::unique_ptr<Object> Copy() const {
        auto copy = std::make_unique<Object>();
        copy->kind = kind;
        copy->flag = flag;
        copy->number = number;
        copy->text = text;
        copy->id = id;
        copy->address = address;
        for (const auto &[name, node] : items)
            copy->items.emplace_back(name, node->Copy());
        return copy;
    }
    void Become(Kind newKind) {
        kind = newKind;
        items.clear();
        text.clear();
    }
};

struct FilterSpec {
    std::string key, group, component, instanceId;
};

namespace {

using Kind = Object::Kind;
using Layer = std::map<std::string, std::unique_ptr<Object>>; // by address and id
struct Content {
    Layer current, desired;
    Content Copy() const {
        Content copy;
        for (const auto &[name, node] : current)
            copy.current[name] = node->Copy();
        for (const auto &[name, node] : desired)
            copy.desired[name] = node->Copy();
        return copy;
    }
};

Content g_committed;
std::vector<std::string> g_calls;
std::size_t g_failAt = 0;
int32_t g_failStatus = FAILED;
std::string g_failName;
int32_t g_failNameStatus = FAILED;
bool g_failed = false;
bool g_noStore = false;
int g_open = 0;
uint32_t g_nextId = 0;

// Counts the call; the status it is to fail with, 0 to go on.
int32_t Enter(const char *name) {
    g_calls.emplace_back(name);
    if (g_calls.size() == g_failAt) {
        g_failed = true;
        return g_failStatus;
    }
    if (g_failName == name) {
        g_failed = true;
        return g_failNameStatus;
    }
    return OK;
}
// The double's own memory is not what tests of running out of it are about.
extern "C" void fault_suspend() __attribute__((weak));
extern "C" void fault_resume() __attribute__((weak));
class Suspended {
public:
    Suspended() {
        if (fault_suspend) fault_suspend();
    }
    ~Suspended() {
        if (fault_resume) fault_resume();
    }
    Suspended(const Suspended &) = delete;
    Suspended &operator=(const Suspended &) = delete;
};
#define ENTER                                                                                                \
    const Suspended suspended;                                                                               \
    if (const int32_t staged = Enter(__func__)) return staged

std::string Str(const char *text) {
    return text ? text : "";
}
std::string Address(const char *key, const char *group, const char *component) {
    return Str(key) + "/" + Str(group) + "/" + Str(component);
}
char *HandOut(const std::string &text) {
    ++g_open;
    return strdup(text.c_str());
}
Object **HandOut(const std::vector<Object *> &objects, int32_t *count) {
    ++g_open;
    auto **array = new Object *[objects.size() + 1];
    std::copy(objects.begin(), objects.end(), array);
    *count = static_cast<int32_t>(objects.size());
    return array;
}

bool IsPlain(const Object &node) {
    return node.kind != Kind::Object && node.kind != Kind::Instances;
}
bool IsList(const Object &node) {
    return node.kind == Kind::Instances || node.kind == Kind::EmptyList;
}

// A member of the kind a setter needs; null where an object of that name is in the way.
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

void Print(const Object &node, const std::string &path, std::ostream &out) {
    const auto escaped = [&] {
        std::ostringstream text;
        for (const char c : node.text) {
            const auto byte = static_cast<unsigned char>(c);
            if (byte >= 0x20 && byte < 0x7f)
                text << c;
            else
                text << "\\x"
                     << "0123456789abcdef"[byte >> 4] << "0123456789abcdef"[byte & 15];
        }
        return text.str();
    };
    switch (node.kind) {
    case Kind::Bool:
        out << path << " = " << (node.flag ? "true" : "false") << "\n";
        break;
    case Kind::Number:
        out << path << " = " << node.number << "\n";
        break;
    case Kind::Text:
        out << path << " = \"" << escaped() << "\"\n";
        break;
    case Kind::Bytes:
        out << path << " = bytes \"" << escaped() << "\"\n";
        break;
    case Kind::EmptyList:
        out << path << " = []\n";
        break;
    case Kind::Object:
        out << path << " {}\n";
        for (const auto &[name, child] : node.items)
            Print(*child, path + "/" + name, out);
        break;
    case Kind::Instances:
        for (const auto &[id, child] : node.items)
            Print(*child, path + "[" + id + "]", out);
        break;
    case Kind::Texts:
    case Kind::Numbers:
        for (const auto &[id, child] : node.items)
            Print(*child, path + "[]", out);
        break;
    }
}

} // namespace

struct Store {
    bool inTransaction = false;
    Content pending;
    Content &content() { return inTransaction ? pending : g_committed; }
};

int32_t GetStore(Store **store) {
    ENTER;
    *store = nullptr;
    if (g_noStore) return OK;
    *store = new Store;
    ++g_open;
    return OK;
}
void DestroyStore(Store *store) {
    if (!store) return;
    --g_open;
    delete store;
}
int32_t BeginTransaction(Store *store) {
    ENTER;
    if (store->inTransaction) return BUSY;
    store->pending = g_committed.Copy();
    store->inTransaction = true;
    return OK;
}
int32_t CommitTransaction(Store *store) {
    ENTER;
    if (!store->inTransaction) return BAD_PARAMETER;
    g_committed = std::move(store->pending);
    store->inTransaction = false;
    return OK;
}
int32_t CancelTransaction(Store *store) {
    ENTER;
    store->pending = {};
    store->inTransaction = false;
    return OK;
}

int32_t CreateFilterSpecObject(const char *key, const char *group, const char *component,
                               const char *instanceId, FilterSpec **spec) {
    ENTER;
    *spec = new FilterSpec{Str(key), Str(group), Str(component), Str(instanceId)};
    ++g_open;
    return OK;
}
void DestroyFilterSpecObject(FilterSpec *spec) {
    if (!spec) return;
    --g_open;
    delete spec;
}

namespace {
int32_t List(const Layer &layer, const std::string &address, const std::string &id, Object ***objects,
             int32_t *count) {
    std::vector<Object *> found;
    for (const auto &[name, node] : layer) {
        if (node->address != address || (!id.empty() && node->id != id)) continue;
        found.push_back(node->Copy().release());
    }
    g_open += static_cast<int>(found.size());
    *objects = HandOut(found, count);
    return OK;
}
} // namespace

int32_t GetInstances(Store *store, const FilterSpec *spec, Object ***objects, int32_t *count) {
    ENTER;
    return List(store->content().current,
                Address(spec->key.c_str(), spec->group.c_str(), spec->component.c_str()), spec->instanceId,
                objects, count);
}
int32_t GetDesiredUserConfigInstances(Store *store, const char *key, const char *group, const char *component,
                                      Object ***objects, int32_t *count) {
    ENTER;
    return List(store->content().desired, Address(key, group, component), "", objects, count);
}
int32_t Get(Store *store, const char *key, const char *group, const char *component, const char *instanceId,
            Object **object) {
    ENTER;
    const auto &layer = store->content().current;
    const auto found = layer.find(Address(key, group, component) + "#" + Str(instanceId));
    if (found == layer.end()) return NOT_FOUND;
    *object = found->second->Copy().release();
    ++g_open;
    return OK;
}
int32_t Set(Store *store, Object *object, const char *source) {
    ENTER;
    const std::string layer = Str(source);
    if (layer != "EXTERNAL" && layer != "USER") return BAD_PARAMETER;
    auto &content = store->content();
    (layer == "USER" ? content.desired : content.current)[object->address + "#" + object->id] =
        object->Copy();
    return OK;
}
int32_t Delete(Store *store, const char *key, const char *group, const char *component,
               const char *instanceId) {
    ENTER;
    return store->content().current.erase(Address(key, group, component) + "#" + Str(instanceId)) ? OK
                                                                                                  : NOT_FOUND;
}
int32_t CreateObject(const char *key, const char *group, const char *component, const char *instanceId,
                     const char *json, Object **object) {
    ENTER;
    if (Str(json) != "{}") return BAD_PARAMETER; // the double reads no JSON
    *object = new Object;
    (*object)->address = Address(key, group, component);
    (*object)->id = Str(instanceId);
    ++g_open;
    return OK;
}
void DestroyObject(Object *object) {
    if (!object) return;
    --g_open;
    delete object;
}
void DestroyObjects(Object **objects, int32_t count) {
    if (!objects) return;
    for (int32_t i = 0; i < count; ++i)
        DestroyObject(objects[i]);
    FreeSubObjectArray(objects);
}

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

namespace fake_store {

using namespace configstore;

void Reset() {
    g_committed = {};
    g_calls = {};
    g_failAt = 0;
    g_failName.clear();
    g_failed = false;
    g_noStore = false;
    g_nextId = 0;
}
std::string Dump() {
    std::ostringstream out;
    for (const auto &[name, node] : g_committed.current)
        Print(*node, "current " + name, out);
    for (const auto &[name, node] : g_committed.desired)
        Print(*node, "desired " + name, out);
    return out.str();
}
std::string Dump(const Object *object) {
    std::ostringstream out;
    Print(*object, "", out);
    return out.str();
}
int Calls() {
    return static_cast<int>(g_calls.size());
}
std::string CallName(int n) {
    return g_calls.at(static_cast<std::size_t>(n - 1));
}
void FailCall(int n, int32_t status) {
    g_failAt = n ? g_calls.size() + static_cast<std::size_t>(n) : 0;
    g_failStatus = status;
    g_failed = false;
}
void FailFunction(const char *name, int32_t status) {
    g_failName = name ? name : "";
    g_failNameStatus = status;
    g_failed = false;
}
bool Failed() {
    return g_failed;
}
void GiveNoStore(bool none) {
    g_noStore = none;
}
int OpenHandles() {
    return g_open;
}

} // namespace fake_store
