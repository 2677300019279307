/* SPDX-License-Identifier: Apache-2.0 */
// The store double's stores and root objects, its faults, and what can be seen of it (fake_store.h). Below
// the roots: fake_objects.cpp.

#include "configstore/fake_store.h"

#include <map>
#include <sstream>

#include "configstore/fake_tree.h"

namespace fake_store {

int g_open = 0;

namespace {

std::vector<std::string> g_calls;
std::size_t g_failAt = 0;
int32_t g_failStatus = configstore::FAILED;
std::string g_failName;
int32_t g_failNameStatus = configstore::FAILED;
bool g_failed = false;
bool g_noStore = false;
configstore::Store *g_lastStore = nullptr;

} // namespace

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
    return configstore::OK;
}

} // namespace fake_store

namespace configstore {

using namespace fake_store;

namespace {

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

std::string Address(const char *key, const char *group, const char *component) {
    return Str(key) + "/" + Str(group) + "/" + Str(component);
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
    *store = g_lastStore = new Store;
    ++g_open;
    return OK;
}
void DestroyStore(Store *store) {
    if (!store) return;
    --g_open;
    if (store == g_lastStore) g_lastStore = nullptr;
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
void DestroyKeptStore() {
    DestroyStore(g_lastStore);
}
int OpenHandles() {
    return g_open;
}

} // namespace fake_store
