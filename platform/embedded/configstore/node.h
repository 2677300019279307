/* SPDX-License-Identifier: Apache-2.0 */
#ifndef PLATFORM_EMBEDDED_CONFIGSTORE_NODE_H
#define PLATFORM_EMBEDDED_CONFIGSTORE_NODE_H

// The object tree behind the client interface (platform/configstore.h). A node is an object, a list of
// instances or a value; a handle is a node's address. Nodes live in their tree's arena: they never move,
// children keep their order, and instances are found by id through an index. Each node of a known field
// points to the field's descriptor (schema.h), by which its content is judged the moment it is set.
//
// Lists of texts and numbers are packed bytes and not nodes, and content of unknown names stays JSON text
// until somebody asks for it, so that no document costs many times its own size in memory.

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <vector>

#include "platform/configstore.h"
#include "platform/embedded/configstore/address.h"
#include "platform/embedded/configstore/arena.h"
#include "platform/embedded/configstore/schema.h"

namespace configstore {

class Buffer;

enum class Kind : uint8_t {
    Dead, // deleted, or below what is; kept so that a stale handle meets a refusal and not somebody else's
          // node
    Null,
    Bool,
    Integer,
    Unsigned /* above INT64_MAX */,
    Real,
    Text,
    Binary,
    EmptyList,
    TextList,
    IntegerList,
    Raw,       // JSON text of an array or object without a usable description
    Object,    // a singleton, an instance, or the root
    Instances, // a list of instances
    Later,     // instances, some, of a sound document: still its text, until somebody asks for one
};

struct Span {
    char *data; // a NUL follows
    std::size_t size;
};

/// A packed list: texts with a NUL behind each, or 64-bit numbers.
struct PackedList {
    char *data;
    std::size_t size;
    std::size_t capacity;
    std::size_t count;
};

struct Name {
    std::size_t size;
    char text[1]; // a NUL follows
};

struct Members {
    Object *first;
    Object *last;
};

struct InstanceTable {
    Object *first;
    Object *last;
    std::size_t count;
    Object **slots;            // null until the list is long, and after a removal
    std::size_t slotCount;     // a power of two, at most three quarters full
    InstanceTable *nextInTree; // of the tree's tables
    bool isInTree;             // among them
};

struct Object {
    Object *parent;
    Object *next;
    union {
        const Field *field; // when `described`
        const Name *name;   // otherwise: unknown members, instances, the root (its instance id)
    };
    union {
        bool boolean;
        int64_t integer;
        uint64_t unsignedInteger;
        double real;
        Span span; // Text, Binary, Raw; Later, whose bytes are the tree's text's
        PackedList *list;
        InstanceTable *table;
        Members members; // Object
    };
    Kind kind;
    bool described;
    bool bad : 1;         // not what the schema allows here
    bool isRoot : 1;      // the node is the first member of a Tree
    bool maybeBinary : 1; // a Text of an unknown name in a document, where binary values are texts too
    uint32_t present;     // Object: marks of its members, and of some that it had
};
static_assert(sizeof(Object) == 48); // documents of nothing but small values are mostly these

struct Tree {
    Object root; // first: a root handle is its tree's address
    Arena arena;
    const Shape *shape = nullptr;
    InstanceTable *tables = nullptr;    // those that have, or had, an index
    bool suspect = false;               // some node was bad once
    bool hasUnknown = false;            // some object had a member without a field once
    std::shared_ptr<const Buffer> text; // that its Later nodes are in
    Address address;

    explicit Tree(Address newAddress);
    ~Tree();
    Tree(const Tree &) = delete;
    Tree &operator=(const Tree &) = delete;
};

/// Of an Object; null where nothing is known.
[[nodiscard]] inline const Shape *ShapeOf(const Object *object) {
    if (object->described) return object->field->shape;
    if (object->isRoot) return reinterpret_cast<const Tree *>(object)->shape;
    const Object *const list = object->parent;
    return list->kind == Kind::Instances && list->described ? list->field->shape : nullptr;
}

/// What a filter spec selects by.
struct FilterSpec {
    std::string key, group, component, instance;
};

// Walking.

[[nodiscard]] inline bool HoldsObjects(const Object *node) {
    return node->kind == Kind::Object || node->kind == Kind::Instances || node->kind == Kind::Later;
}

[[nodiscard]] inline std::string_view NameOf(const Object *node) {
    return node->described ? std::string_view(node->field->name)
                           : std::string_view(node->name->text, node->name->size);
}
/// Null of a deleted node.
[[nodiscard]] inline Tree *TreeOf(Object *node) {
    while (!node->isRoot) {
        if (node->kind == Kind::Dead) return nullptr;
        node = node->parent;
    }
    return reinterpret_cast<Tree *>(node);
}
[[nodiscard]] inline Object *WithField(const Object *object, const Field *field) {
    if (!(object->present & field->mark)) return nullptr;
    Object *member = object->members.first;
    while (member && member->field != field) // a name is never at a field's address
        member = member->next;
    return member;
}
[[nodiscard]] Object *FindUndescribed(const Object *object, std::string_view name);
/// For writers: the member of a name, or null and the field that it will have, if the shape knows the name.
/// Where it does, every member of that name has its field.
struct Place {
    Object *member;
    const Field *field;
};
[[nodiscard]] inline Place FindPlace(const Object *object, const char *name) {
    const Shape *const shape = ShapeOf(object);
    const Field *const field = shape ? shape->FindAgain(name) : nullptr;
    return {field ? WithField(object, field) : FindUndescribed(object, name), field};
}
[[nodiscard]] inline Object *FindMember(Object *object, const char *name) {
    return FindPlace(object, name).member;
}
[[nodiscard]] Object *FindMember(Object *object, std::string_view name);
[[nodiscard]] Object *FindInstance(Object *list, std::string_view id);
[[nodiscard]] Object *FirstChild(const Object *container); // of an Object or Instances
/// "settings/vlan/vlan_id", with the ids of instances in brackets.
[[nodiscard]] std::string PathOf(const Object *node);

/// Of a name or id, seeded once a process.
[[nodiscard]] uint64_t HashName(std::string_view name);

// Changing. All may throw std::bad_alloc, with the tree as it was.

/// A node of no place yet, of the kind Null.
inline Object *NewNode(Arena &arena, Object *parent) {
    auto *const node = static_cast<Object *>(arena.Allocate(sizeof(Object)));
    node->parent = parent;
    node->next = nullptr;
    node->integer = 0;
    node->kind = Kind::Null;
    node->described = false;
    node->bad = false;
    node->isRoot = false;
    node->maybeBinary = false;
    node->present = 0;
    return node;
}
inline void LinkMember(Object *object, Object *member) {
    object->present |= member->described ? member->field->mark : kUndescribedMark;
    (object->members.last ? object->members.last->next : object->members.first) = member;
    object->members.last = member;
}
/// AddMember of a field that the shape has.
inline Object *AddDescribed(Tree *tree, Object *object, const Field *field) {
    Object *const member = NewNode(tree->arena, object);
    member->described = true;
    member->field = field;
    LinkMember(object, member);
    return member;
}
/// A new last member; `field` is the shape's field of that name, if any. Its kind is Null until it is given
/// another.
Object *AddMember(Tree *tree, Object *object, const Field *field, std::string_view name);
/// A new last instance, an empty Object. The id is not there yet.
Object *AddInstance(Tree *tree, Object *list, std::string_view id);
inline void MakeObject(Object *node) {
    node->kind = Kind::Object;
    node->members = {nullptr, nullptr};
    node->present = 0;
}
void MakeInstances(Tree *tree, Object *node);
void RemoveChild(Object *container, Object *child);
void RemoveAllChildren(Object *container);

/// Turns Raw or Later content that somebody asks for into nodes. False when it is not what it would have to
/// be.
bool Expand(Tree *tree, Object *node);
/// Makes the content of an undescribed Object a list of instances. False when some of it is not an object.
bool TreatAsInstances(Tree *tree, Object *node);

// Packed lists.

PackedList *NewList(Tree *tree);
void AppendText(Tree *tree, PackedList *list, std::string_view text);
/// Appends a text of that size, which the caller writes with its NUL.
char *AppendRoom(Tree *tree, PackedList *list, std::size_t size);
void AppendInteger(Tree *tree, PackedList *list, int64_t value);
[[nodiscard]] int64_t IntegerAt(const PackedList *list, std::size_t index);

// Judging.

[[nodiscard]] inline bool TextFits(const Field *field, std::size_t size) {
    return size <= field->maxBytes;
}
[[nodiscard]] inline bool IntegerFits(const Field *field, int64_t value) {
    return value >= field->minimum && value <= field->maximum;
}
/// Whether the schema does not allow the node's content.
[[nodiscard]] bool IsBad(const Object *node);
/// Sets the node's mark by its field and content.
inline void Judge(Tree *tree, Object *node) {
    const FieldType type = node->described ? node->field->type : FieldType::Any;
    if (type == FieldType::Bool && node->kind == Kind::Bool)
        node->bad = false;
    else if (type == FieldType::Integer && node->kind == Kind::Integer)
        node->bad = !IntegerFits(node->field, node->integer);
    else if (type == FieldType::Text && node->kind == Kind::Text)
        node->bad = !TextFits(node->field, node->span.size);
    else
        node->bad = IsBad(node);
    if (node->bad) tree->suspect = true;
}
/// The first node that the schema does not allow, in document order; null when all is well.
[[nodiscard]] const Object *FindViolation(Tree *tree);
/// Why it is not allowed, for a message.
[[nodiscard]] std::string Describe(const Object *bad);

/// Runs `work` and turns what it throws into a status: no exception leaves an exported function.
template <typename Work> int32_t Guarded(Work &&work) noexcept {
    try {
        return work();
    } catch (const std::bad_alloc &) {
        return NO_MEMORY;
    } catch (...) {
        return FAILED;
    }
}

} // namespace configstore

#endif
