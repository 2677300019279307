/* SPDX-License-Identifier: Apache-2.0 */
// Judges the content of nodes by the schema's descriptors (node.h). The judgement is made when a value is set
// and kept as a mark on its node; the store asks for the marks when an object is written.

#include <cstring>

#include "platform/embedded/configstore/node.h"

namespace configstore {

namespace {

bool ElementsFit(const Field *field, const Object *node) {
    const PackedList *const list = node->list;
    if (field->type == FieldType::IntegerList) {
        for (std::size_t i = 0; i < list->count; i++) {
            if (!IntegerFits(field, IntegerAt(list, i))) return false;
        }
        return true;
    }
    for (const char *at = list->data; at != list->data + list->size; at += std::strlen(at) + 1) {
        if (!TextFits(field, std::strlen(at))) return false;
    }
    return true;
}

bool Fits(const Field *field, const Object *node) {
    const bool emptyList = node->kind == Kind::EmptyList;
    switch (field->type) {
    case FieldType::Any:
        return true;
    case FieldType::Bool:
        return node->kind == Kind::Bool;
    case FieldType::Integer:
        return node->kind == Kind::Integer && IntegerFits(field, node->integer);
    case FieldType::Text:
        return node->kind == Kind::Text && TextFits(field, node->span.size);
    case FieldType::Binary:
        return node->kind == Kind::Binary;
    case FieldType::TextList:
        return emptyList || (node->kind == Kind::TextList && ElementsFit(field, node));
    case FieldType::IntegerList:
        return emptyList || (node->kind == Kind::IntegerList && ElementsFit(field, node));
    case FieldType::Object:
        return node->kind == Kind::Object;
    case FieldType::Instances:
        return node->kind == Kind::Instances;
    }
    return false;
}

const char *Wanted(FieldType type) {
    switch (type) {
    case FieldType::Any:
        return "anything";
    case FieldType::Bool:
        return "true or false";
    case FieldType::Integer:
        return "a whole number";
    case FieldType::Text:
        return "a text";
    case FieldType::Binary:
        return "base64";
    case FieldType::TextList:
        return "a list of texts";
    case FieldType::IntegerList:
        return "a list of whole numbers";
    case FieldType::Object:
        return "an object";
    case FieldType::Instances:
        return "a list of instances";
    }
    return "";
}

const Object *FindBelow(const Object *node) {
    if (node->bad) return node;
    if (node->kind != Kind::Object && node->kind != Kind::Instances) return nullptr;
    for (const Object *child = FirstChild(node); child; child = child->next) {
        if (const Object *bad = FindBelow(child)) return bad;
    }
    return nullptr;
}

} // namespace

bool IsBad(const Object *node) {
    if (node->described) return !Fits(node->field, node);
    // An instance has to be an object; what an unknown member is, nobody knows.
    return !node->isRoot && node->parent->kind == Kind::Instances && node->kind != Kind::Object;
}

const Object *FindViolation(Tree *tree) {
    if (!tree->suspect) return nullptr;
    const Object *const bad = FindBelow(&tree->root);
    if (!bad) tree->suspect = false;
    return bad;
}

std::string Describe(const Object *bad) {
    if (!bad->described) return "an instance must be an object";
    const Field &field = *bad->field;
    if (field.type == FieldType::Integer && bad->kind == Kind::Integer)
        return std::to_string(bad->integer) + " is not between " + std::to_string(field.minimum) + " and " +
               std::to_string(field.maximum);
    if (field.type == FieldType::Text && bad->kind == Kind::Text)
        return "a text of " + std::to_string(bad->span.size) + " bytes, at most " +
               std::to_string(field.maxBytes) + " are allowed";
    if (field.type == FieldType::TextList && bad->kind == Kind::TextList)
        return "a text in the list has more than " + std::to_string(field.maxBytes) + " bytes";
    if (field.type == FieldType::IntegerList && bad->kind == Kind::IntegerList)
        return "a number in the list is not between " + std::to_string(field.minimum) + " and " +
               std::to_string(field.maximum);
    return std::string("it must be ") + Wanted(field.type);
}

} // namespace configstore
