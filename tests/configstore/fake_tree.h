/* SPDX-License-Identifier: Apache-2.0 */
#ifndef TESTS_CONFIGSTORE_FAKE_TREE_H
#define TESTS_CONFIGSTORE_FAKE_TREE_H

// Shared by the two halves of the store double: the tree's nodes, and the start of every call.

#include <algorithm>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include "platform/configstore.h"

// Out-of-memory tests must not fail the double's own allocations.
extern "C" void fault_suspend() __attribute__((weak));
extern "C" void fault_resume() __attribute__((weak));

namespace configstore {

// One node of a tree: an object with members, or a plain value. `items` are the elements of a list.
struct Object {
    enum class Kind { Bool, Number, Text, Bytes, Object, EmptyList, Texts, Numbers, Instances };
    Kind kind = Kind::Object;
    bool flag = false;
    int64_t number = 0;
    std::string text; // the value of a text or binary
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

} // namespace configstore

namespace fake_store {

using Kind = configstore::Object::Kind;

/// Unreleased handles, arrays and texts.
extern int g_open;
/// The number of the last generated id.
extern uint32_t g_nextId;

/// Counts the call. Returns the status it must fail with, or 0.
int32_t Enter(const char *name);

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

inline std::string Str(const char *text) {
    return text ? text : "";
}
inline char *HandOut(const std::string &text) {
    ++g_open;
    auto *copy =
        static_cast<char *>(std::malloc(text.size() + 1)); // not strdup: sanitizers count it otherwise
    std::memcpy(copy, text.c_str(), text.size() + 1);
    return copy;
}
inline configstore::Object **HandOut(const std::vector<configstore::Object *> &objects, int32_t *count) {
    ++g_open;
    auto **array = new configstore::Object *[objects.size() + 1];
    std::copy(objects.begin(), objects.end(), array);
    *count = static_cast<int32_t>(objects.size());
    return array;
}

} // namespace fake_store

/// The first line of every call that returns a status.
#define ENTER                                                                                                \
    const fake_store::Suspended suspended;                                                                   \
    if (const int32_t staged = fake_store::Enter(__func__)) return staged

#endif
