/* SPDX-License-Identifier: Apache-2.0 */
// The object tree (node.h): finding, adding and removing nodes. What the content may be is judge.cpp's
// business, how it is written as a document that of document_*.cpp.

#include "platform/embedded/configstore/node.h"

#include <bit>
#include <cstring>
#include <utility>

namespace configstore {

namespace {

constexpr std::size_t kIndexFrom = 12; // shorter lists are walked

const Name *NewName(Arena &arena, std::string_view text) {
    auto *const name = static_cast<Name *>(arena.Allocate(offsetof(Name, text) + text.size() + 1));
    name->size = text.size();
    if (!text.empty()) std::memcpy(name->text, text.data(), text.size());
    name->text[text.size()] = '\0';
    return name;
}

} // namespace

uint64_t HashName(std::string_view id) {
    // Names come from documents too. The seed keeps their writers from choosing names that all fall together.
    static const uint64_t seed =
        (reinterpret_cast<uintptr_t>(&id) ^ reinterpret_cast<uintptr_t>(&HashName)) * 0x9e3779b97f4a7c15U;
    uint64_t hash = seed ^ id.size();
    const char *at = id.data();
    std::size_t left = id.size();
    while (left > 0) {
        uint64_t word = 0;
        const std::size_t step = left < 8 ? left : 8;
        std::memcpy(&word, at, step);
        hash = (hash ^ word) * 0xff51afd7ed558ccdU;
        hash ^= hash >> 32;
        at += step;
        left -= step;
    }
    return hash;
}

namespace {

void Insert(InstanceTable *table, Object *instance) {
    const std::size_t mask = table->slotCount - 1;
    std::size_t at = static_cast<std::size_t>(HashName(NameOf(instance))) & mask;
    while (table->slots[at])
        at = (at + 1) & mask;
    table->slots[at] = instance;
}

void DropIndex(InstanceTable *table) {
    std::free(table->slots);
    table->slots = nullptr;
    table->slotCount = 0;
}

/// If allocation fails, no index is kept; lookups walk the list.
void BuildIndex(Tree *tree, InstanceTable *table) {
    const std::size_t slotCount = std::bit_ceil(table->count * 2);
    auto **const slots = static_cast<Object **>(std::calloc(slotCount, sizeof(Object *)));
    if (!slots) return;
    DropIndex(table);
    table->slots = slots;
    table->slotCount = slotCount;
    for (Object *instance = table->first; instance; instance = instance->next)
        Insert(table, instance);
    if (table->isInTree) return;
    table->isInTree = true;
    table->nextInTree = std::exchange(tree->tables, table);
}

} // namespace

Tree::Tree(Address newAddress)
    : shape(FindSchema(newAddress.key, newAddress.group)), address(std::move(newAddress)) {
    root.parent = nullptr;
    root.next = nullptr;
    root.name = NewName(arena, address.instance);
    root.described = false;
    root.bad = false;
    root.isRoot = true;
    root.maybeBinary = false;
    MakeObject(&root);
}

Tree::~Tree() {
    for (InstanceTable *table = tables; table; table = table->nextInTree)
        DropIndex(table);
}

Object *FindUndescribed(const Object *object, std::string_view name) {
    if (!(object->present & kUndescribedMark)) return nullptr;
    Object *member = object->members.first;
    while (member && (member->described || NameOf(member) != name))
        member = member->next;
    return member;
}

Object *FindMember(Object *object, std::string_view name) {
    const Shape *const shape = ShapeOf(object);
    const Field *const field = shape ? shape->Find(name) : nullptr;
    return field ? WithField(object, field) : FindUndescribed(object, name);
}

Object *FindInstance(Object *list, std::string_view id) {
    InstanceTable *const table = list->table;
    if (!table->slots && table->count > kIndexFrom) BuildIndex(TreeOf(list), table);
    if (!table->slots) {
        for (Object *instance = table->first; instance; instance = instance->next) {
            if (NameOf(instance) == id) return instance;
        }
        return nullptr;
    }
    const std::size_t mask = table->slotCount - 1;
    for (std::size_t at = static_cast<std::size_t>(HashName(id)) & mask; table->slots[at];
         at = (at + 1) & mask) {
        if (NameOf(table->slots[at]) == id) return table->slots[at];
    }
    return nullptr;
}

Object *FirstChild(const Object *container) {
    return container->kind == Kind::Instances ? container->table->first : container->members.first;
}

std::string PathOf(const Object *node) {
    if (node->isRoot) return {};
    const std::string above = PathOf(node->parent);
    const std::string own(NameOf(node));
    if (node->parent->kind == Kind::Instances) return above + '[' + own + ']';
    return above.empty() ? own : above + '/' + own;
}

Object *AddMember(Tree *tree, Object *object, const Field *field, std::string_view name) {
    if (field) return AddDescribed(tree, object, field);
    const Name *const ownName = NewName(tree->arena, name);
    tree->hasUnknown = true;
    Object *const member = NewNode(tree->arena, object);
    member->name = ownName;
    LinkMember(object, member);
    return member;
}

Object *AddInstance(Tree *tree, Object *list, std::string_view id) {
    const Name *const name = NewName(tree->arena, id);
    Object *const instance = NewNode(tree->arena, list);
    instance->name = name;
    MakeObject(instance);
    InstanceTable *const table = list->table;
    if (table->last)
        table->last->next = instance;
    else
        table->first = instance;
    table->last = instance;
    table->count++;
    if (!table->slots) return instance;
    if (table->count * 4 <= table->slotCount * 3) {
        Insert(table, instance);
    } else {
        DropIndex(table); // the old one must not outlive a failure to build the larger one
        BuildIndex(tree, table);
    }
    return instance;
}

void MakeInstances(Tree *tree, Object *node) {
    auto *const table = static_cast<InstanceTable *>(tree->arena.Allocate(sizeof(InstanceTable)));
    *table = {};
    node->kind = Kind::Instances;
    node->table = table;
}

namespace {

/// Of a node and all below it: nobody need walk up from a node to know whether it is still there.
void MarkDead(Object *node) {
    if (node->kind == Kind::Object || node->kind == Kind::Instances) {
        for (Object *child = FirstChild(node); child; child = child->next)
            MarkDead(child);
    }
    node->kind = Kind::Dead;
}

} // namespace

void RemoveChild(Object *container, Object *child) {
    const bool instances = container->kind == Kind::Instances;
    Object *before = nullptr;
    for (Object *at = FirstChild(container); at != child; at = at->next)
        before = at;
    Object *&first = instances ? container->table->first : container->members.first;
    Object *&last = instances ? container->table->last : container->members.last;
    (before ? before->next : first) = child->next;
    if (last == child) last = before;
    MarkDead(child);
    if (instances) {
        container->table->count--;
        DropIndex(container->table);
    }
}

void RemoveAllChildren(Object *container) {
    for (Object *child = FirstChild(container); child; child = child->next)
        MarkDead(child);
    if (container->kind == Kind::Instances) {
        InstanceTable *const table = container->table;
        DropIndex(table);
        table->first = table->last = nullptr;
        table->count = 0;
    } else {
        container->members = {nullptr, nullptr};
        container->present = 0;
    }
}

PackedList *NewList(Tree *tree) {
    auto *const list = static_cast<PackedList *>(tree->arena.Allocate(sizeof(PackedList)));
    *list = {nullptr, 0, 0, 0};
    return list;
}

namespace {

char *Grow(Tree *tree, PackedList *list, std::size_t more) {
    if (list->capacity - list->size < more) {
        const std::size_t capacity = list->size * 2 + (more < 40 ? 56 : more);
        auto *const data = static_cast<char *>(tree->arena.Allocate(capacity));
        if (list->size > 0) std::memcpy(data, list->data, list->size);
        list->data = data;
        list->capacity = capacity;
    }
    char *const at = list->data + list->size;
    list->size += more;
    list->count++;
    return at;
}

} // namespace

char *AppendRoom(Tree *tree, PackedList *list, std::size_t size) {
    return Grow(tree, list, size + 1);
}

void AppendText(Tree *tree, PackedList *list, std::string_view text) {
    char *const at = AppendRoom(tree, list, text.size());
    if (!text.empty()) std::memcpy(at, text.data(), text.size());
    at[text.size()] = '\0';
}

void AppendInteger(Tree *tree, PackedList *list, int64_t value) {
    std::memcpy(Grow(tree, list, sizeof value), &value, sizeof value);
}

int64_t IntegerAt(const PackedList *list, std::size_t index) {
    int64_t value = 0;
    std::memcpy(&value, list->data + index * sizeof value, sizeof value);
    return value;
}

} // namespace configstore
