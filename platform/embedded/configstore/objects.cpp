/* SPDX-License-Identifier: Apache-2.0 */
// Objects, sub-objects and filter specs of the client interface (platform/configstore.h): a thin face over
// the tree of node.h.

#include <algorithm>
#include <cstdlib>
#include <memory>
#include <sys/random.h>
#include <utility>

#include "platform/embedded/configstore/document.h"
#include "platform/embedded/configstore/log.h"
#include "platform/embedded/configstore/node.h"

namespace configstore {

namespace {

/// Handles found, in the block that the caller gets.
class Handles {
public:
    Handles() = default;
    ~Handles() { std::free(static_cast<void *>(data_)); }
    Handles(const Handles &) = delete;
    Handles &operator=(const Handles &) = delete;
    void Reserve(std::size_t more) {
        if (capacity_ - count_ < more) Grow(more);
    }
    void Add(Object *handle, std::size_t times = 1) {
        Reserve(times);
        count_ = static_cast<std::size_t>(std::fill_n(data_ + count_, times, handle) - data_);
    }
    [[nodiscard]] std::size_t Count() const { return count_; }
    [[nodiscard]] Object *First() const { return data_[0]; }
    Object **Release() { return std::exchange(data_, nullptr); }

private:
    void Grow(std::size_t more) {
        const std::size_t capacity = std::max(count_ * 2, count_ + more);
        void *const data = std::realloc(static_cast<void *>(data_), capacity * sizeof(Object *));
        if (!data) throw std::bad_alloc();
        data_ = static_cast<Object **>(data);
        capacity_ = capacity;
    }

    Object **data_ = nullptr;
    std::size_t count_ = 0;
    std::size_t capacity_ = 0;
};

std::string_view IdOf(const char *instanceId) {
    return instanceId ? std::string_view(instanceId) : std::string_view();
}

bool IsObject(const Object *object) {
    return object && object->kind == Kind::Object;
}

/// A member as a list of instances: null when it is something else.
Object *AsInstances(Object *member) {
    if ((member->kind == Kind::Raw || member->kind == Kind::Later) && !Expand(TreeOf(member), member))
        return nullptr;
    if (member->kind == Kind::Object && !TreatAsInstances(TreeOf(member), member)) return nullptr;
    return member->kind == Kind::Instances ? member : nullptr;
}

/// A member or instance as an object: null when it is something else.
Object *AsObject(Object *node) {
    if (node->kind == Kind::Raw && !Expand(TreeOf(node), node)) return nullptr;
    return node->kind == Kind::Object ? node : nullptr;
}

int32_t Find(Object *parent, const char *name, const char *instanceId, Object **out) {
    Object *const member = FindMember(parent, name);
    if (!member) return NOT_FOUND;
    const std::string_view id = IdOf(instanceId);
    Object *node = member;
    if (!id.empty()) {
        if (member->kind == Kind::EmptyList) return NOT_FOUND;
        Object *const list = AsInstances(member);
        if (!list) return SCHEMA_VIOLATION;
        node = FindInstance(list, id);
        if (!node) return NOT_FOUND;
    }
    node = AsObject(node);
    if (!node) return SCHEMA_VIOLATION;
    *out = node;
    return OK;
}

int32_t CreateSingleton(Tree *tree, Object *parent, const char *name, Place place, Object **out) {
    Object *member = place.member;
    if (member) {
        if (!AsObject(member)) return SCHEMA_VIOLATION;
        RemoveAllChildren(member);
    } else {
        member = AddMember(tree, parent, place.field, name);
        MakeObject(member);
    }
    Judge(tree, member);
    *out = member;
    return OK;
}

int32_t CreateInstance(Tree *tree, Object *parent, const char *name, Place place, std::string_view id,
                       Object **out) {
    Object *member = place.member;
    if (!member) {
        member = AddMember(tree, parent, place.field, name);
        member->kind = Kind::EmptyList;
    }
    if (member->kind == Kind::EmptyList) MakeInstances(tree, member);
    if (!AsInstances(member)) return SCHEMA_VIOLATION;
    Object *instance = FindInstance(member, id);
    if (!instance) {
        instance = AddInstance(tree, member, id);
    } else {
        if (!AsObject(instance)) return SCHEMA_VIOLATION;
        RemoveAllChildren(instance);
    }
    Judge(tree, member);
    *out = instance;
    return OK;
}

void RemoveInstance(Object *parent, Object *list, Object *instance) {
    RemoveChild(list, instance);
    if (list->table->count == 0) RemoveChild(parent, list); // as if it had never been there
}

/// Whether a search for `key` goes on in the child: in singletons. What is kept as text of an object that the
/// schema does not know counts as one, and is read only where it has that name in it.
bool LeadsOn(Object *child, std::string_view key) {
    if (child->kind != Kind::Raw || child->described) return child->kind == Kind::Object;
    Buffer name;
    WriteText(key, false, &name);
    const std::string_view text(child->span.data, child->span.size);
    return text.front() == '{' && text.find(name.View()) != std::string_view::npos && AsObject(child);
}

/// What a filter spec selects on one object that has a member of its key.
int32_t SelectMember(Object *member, const FilterSpec &spec, Handles *found) {
    if (member->kind == Kind::Raw && !Expand(TreeOf(member), member)) return OK;
    if (member->kind == Kind::TextList) {
        // The elements have nothing to tell but how many they are: each is the list's own handle.
        found->Add(member, member->list->count);
        return OK;
    }
    if (!AsInstances(member)) return OK;
    if (!spec.instance.empty()) {
        Object *const instance = FindInstance(member, spec.instance);
        if (instance && !AsObject(instance)) return SCHEMA_VIOLATION;
        if (instance) found->Add(instance);
        return OK;
    }
    found->Reserve(member->table->count);
    for (Object *instance = member->table->first; instance; instance = instance->next) {
        if (!AsObject(instance)) return SCHEMA_VIOLATION;
        found->Add(instance);
    }
    return OK;
}

/// Whether members of the key's name may stand in singletons below the object.
bool MayLeadOn(Object *object, std::string_view key) {
    const Shape *const shape = ShapeOf(object);
    return !shape || shape->HasBelow(key) || TreeOf(object)->hasUnknown;
}

int32_t Select(Object *object, const FilterSpec &spec, Handles *found) {
    if (Object *const member = FindMember(object, spec.key)) return SelectMember(member, spec, found);
    if (!MayLeadOn(object, spec.key)) return OK;
    for (Object *child = object->members.first; child; child = child->next) {
        if (!LeadsOn(child, spec.key)) continue;
        if (const int32_t status = Select(child, spec, found); status != OK) return status;
    }
    return OK;
}

bool DeleteSelected(Object *object, const FilterSpec &spec) {
    if (Object *const member = FindMember(object, spec.key)) {
        if (member->kind == Kind::Later && spec.instance.empty()) {
            RemoveChild(object, member);
            return true;
        }
        Handles found;
        if (SelectMember(member, spec, &found) != OK) {
            // Something among the instances is not one; deleting them all gets rid of that as well.
            if (!spec.instance.empty()) return false;
            found.Add(member);
        }
        if (found.Count() == 0) return false;
        if (member->kind == Kind::Instances && !spec.instance.empty()) {
            RemoveInstance(object, member, found.First());
        } else {
            if (member->kind == Kind::Instances) RemoveAllChildren(member);
            RemoveChild(object, member);
        }
        return true;
    }
    bool any = false;
    Object *next = nullptr;
    for (Object *child = object->members.first; child; child = next) {
        next = child->next;
        if (LeadsOn(child, spec.key)) any |= DeleteSelected(child, spec);
    }
    return any;
}

} // namespace

int32_t CreateFilterSpecObject(const char *key, const char *group, const char *component,
                               const char *instanceId, FilterSpec **spec) {
    if (!key || !group || !component || !spec) return BAD_PARAMETER;
    return Guarded([&] {
        *spec = new FilterSpec{key, group, component, std::string(IdOf(instanceId))};
        return OK;
    });
}

void DestroyFilterSpecObject(FilterSpec *spec) {
    delete spec;
}

int32_t CreateObject(const char *key, const char *group, const char *component, const char *instanceId,
                     const char *json, Object **object) {
    if (!key || !group || !component || !json || !object) return BAD_PARAMETER;
    return Guarded([&]() -> int32_t {
        auto tree = std::make_unique<Tree>(
            Address{Layer::Current, key, group, component, std::string(IdOf(instanceId))});
        std::string why;
        if (!ReadDocument(json, Reading::Tolerant, tree.get(), &why)) {
            Log("config store: document given for %s: %s", AddressText(tree->address).c_str(), why.c_str());
            return BAD_PARAMETER;
        }
        *object = &tree.release()->root;
        return OK;
    });
}

void DestroyObject(Object *object) {
    if (object && object->isRoot) delete reinterpret_cast<Tree *>(object);
}

void DestroyObjects(Object **objects, int32_t count) {
    for (int32_t i = 0; objects && i < count; i++)
        DestroyObject(objects[i]);
    std::free(static_cast<void *>(objects));
}

int32_t GetSubObject(Object *parent, const char *name, const char *instanceId, Object **out) {
    if (!IsObject(parent) || !name || !out) return BAD_PARAMETER;
    return Guarded([&] { return Find(parent, name, instanceId, out); });
}

int32_t CreateSubObject(Object *parent, const char *name, const char *instanceId, Object **out) {
    if (!IsObject(parent) || !name || !*name || !out) return BAD_PARAMETER;
    return Guarded([&]() -> int32_t {
        Tree *const tree = TreeOf(parent);
        if (!tree) return BAD_PARAMETER;
        const Place place = FindPlace(parent, name);
        const std::string_view id = IdOf(instanceId);
        if (id.empty()) return CreateSingleton(tree, parent, name, place, out);
        return CreateInstance(tree, parent, name, place, id, out);
    });
}

int32_t DeleteSubObject(Object *parent, const char *name, const char *instanceId) {
    if (!IsObject(parent) || !name) return BAD_PARAMETER;
    return Guarded([&] {
        Object *node = nullptr;
        const int32_t status = Find(parent, name, instanceId, &node);
        if (status != OK) return status;
        if (node->parent == parent)
            RemoveChild(parent, node);
        else
            RemoveInstance(parent, node->parent, node);
        return static_cast<int32_t>(OK);
    });
}

int32_t GetSubObjectInstances(Object *parent, const FilterSpec *spec, Object ***objects, int32_t *count) {
    if (!IsObject(parent) || !spec || !objects || !count) return BAD_PARAMETER;
    return Guarded([&]() -> int32_t {
        Handles found;
        if (const int32_t status = Select(parent, *spec, &found); status != OK) return status;
        if (found.Count() == 0) return NOT_FOUND;
        if (found.Count() > INT32_MAX) return FAILED;
        *count = static_cast<int32_t>(found.Count());
        *objects = found.Release();
        return OK;
    });
}

int32_t DeleteSubObjectInstances(Object *parent, const FilterSpec *spec) {
    if (!IsObject(parent) || !spec) return BAD_PARAMETER;
    return Guarded([&]() -> int32_t { return DeleteSelected(parent, *spec) ? OK : NOT_FOUND; });
}

void FreeSubObjectArray(Object **objects) {
    std::free(static_cast<void *>(objects));
}

int32_t GenerateInstanceId(char **id) {
    if (!id) return BAD_PARAMETER;
    unsigned char random[16];
    if (getrandom(random, sizeof random, 0) != static_cast<ssize_t>(sizeof random)) return FAILED;
    random[6] = static_cast<unsigned char>((random[6] & 0x0f) | 0x40); // version 4, variant 1: a random UUID
    random[8] = static_cast<unsigned char>((random[8] & 0x3f) | 0x80);
    auto *const text = static_cast<char *>(std::malloc(37));
    if (!text) return NO_MEMORY;
    constexpr char kHex[] = "0123456789abcdef";
    char *at = text;
    for (std::size_t i = 0; i < sizeof random; i++) {
        if (i == 4 || i == 6 || i == 8 || i == 10) *at++ = '-';
        *at++ = kHex[random[i] >> 4];
        *at++ = kHex[random[i] & 15];
    }
    *at = '\0';
    *id = text;
    return OK;
}

void FreeString(char *text) {
    std::free(text);
}

} // namespace configstore
