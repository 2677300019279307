/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_STORE_FORM_H
#define CONFIGSTORE_LAYOUTS_STORE_FORM_H

// The typed form of a property: the named, typed fields that the config store and people have in place of the
// bytes, below the leaf of the property's row. Each field says where it is in the binary record, so one codec
// (form/typed/) converts every property. The forms also give docs/properties.md, `dvsctl props` and the JSON
// Schema of the store. A form is defined beside its record, in the header of the family.

#include <cstdint>
#include <span>
#include <string_view>

#include "configstore/layouts/layout.h"

namespace dvs::layout {

enum class Form : uint8_t {
    kNone, // no typed form: the rows that take every unmapped key
    kBool,
    kUint16,
    kUint32,
    kInt,
    kLong,
    kText,
    kTexts,     // list of texts
    kInts,      // list of numbers
    kObject,    // singleton sub-object with members
    kInstances, // list of instances with members
};

// What a text or number must be beyond its form. The store does not check it; the codec does.
enum class Rule : uint8_t {
    kNone,
    kIpv4,    // an IPv4 address
    kAddress, // an IPv4 or IPv6 address
    kVlan,    // a VLAN id, 0 to 4095
    kSlot,    // a uint32 as decimal text
    kBits,    // a multiple of 8, not negative: the record has bytes
    kUnset,   // any uint32; the largest one means the same as an absent field
};

// How a field is kept in the record.
enum class Keep : uint8_t {
    kNowhere,  // not in the record; an object's members have places of their own
    kField,    // as the record's field: a number, truth value, text, address or enumeration
    kBits,     // truth value: set while the bits of `mask` are set
    kNotBits,  // truth value: set while the bits of `mask` are clear
    kLiteral,  // truth value: the bytes `whenTrue` or `whenFalse`; no bytes mean no property
    kExactly,  // truth value: the number `mask`; any other number is false and is written as 0
    kDecimal,  // text: the number in decimal digits
    kTrue,     // truth value: always true, not in the record
    kElements, // list: the elements of `part`
    kSlots,    // list of texts: `count` slots of `part`, behind those that the field `after` counts
    kVersion,  // text of a switch version
    kGroup,    // object: absent while all of its fields are 0 in the record; sets `whenSet` in `field`
    kPorts,    // object: one group of a mirror session's ports; `field` has the connectee types
};

// What a number without a name in the enumeration becomes.
enum class Unnamed : uint8_t {
    kDamage, // the value is damaged
    kAbsent, // the field is absent
    kFirst,  // the same as 0
};

struct Place {
    Keep keep = Keep::kNowhere;
    const Field *field = nullptr; // of a list: the text or number of an element
    uint32_t mask = 0;
    uint32_t whenSet = 0; // of kBits and kNotBits: bits that are written; 0: `mask`
    uint32_t scale = 1;   // the field times this is the typed number
    Unnamed unnamed = Unnamed::kDamage;
    const Field *isIpv6 = nullptr; // of an address of 16 bytes
    const Part *part = nullptr;
    const Field *count = nullptr; // of kSlots, and of kPorts: how many elements
    const Field *after = nullptr;
    const Field *index = nullptr; // of an element: its number, from 0
    const Record *record = nullptr;
    std::string_view whenTrue = {}, whenFalse = {};
    // The field is there while the bits `condition` of `flags` are `value`; writing it sets those bits.
    const Field *flags = nullptr;
    uint32_t condition = 0, value = 0;
};

struct StoreField {
    const char *name; // of a member; null for a leaf, which has the last path name of its row
    Form form;
    Place place;
    const char *unit;     // of a number; may be empty
    uint32_t maxText;     // longest text in bytes that fits; 0: no limit
    const Domain *domain; // texts that are known; null: any
    const char *id;       // of instances: the member that is the instance id; null: ids mean nothing
    std::span<const StoreField> members; // of objects and of instances
    const char *meaning;
    Rule rule = Rule::kNone; // of a list: of its elements
    bool isNeeded = false;   // where its object is written, this member must be
};

// Constructors of places. A name that the record lacks does not compile.

consteval const Field *FieldOf(const Record &record, std::string_view name) {
    const Field *field = Find(record, name);
    if (!field) throw "no such field";
    return field;
}
consteval const Part *PartOf(const Record &record, std::string_view name) {
    for (const Part &part : record.parts) {
        if (name == part.name) return &part;
    }
    throw "no such part";
}
consteval uint32_t BitsOf(const Field &field, std::string_view name) {
    for (const Flag &flag : field.domain->flags) {
        if (name == flag.name) return flag.bit;
    }
    throw "no such flag";
}

consteval Place In(const Record &record, std::string_view field, Unnamed unnamed = Unnamed::kDamage) {
    return {.keep = Keep::kField, .field = FieldOf(record, field), .unnamed = unnamed};
}
consteval Place Scaled(const Record &record, std::string_view field, uint32_t scale) {
    return {.keep = Keep::kField, .field = FieldOf(record, field), .scale = scale};
}
consteval Place AddressIn(const Record &record, std::string_view field, std::string_view isIpv6) {
    return {.keep = Keep::kField, .field = FieldOf(record, field), .isIpv6 = FieldOf(record, isIpv6)};
}
consteval Place Bits(const Record &record, std::string_view field, std::string_view flag) {
    const Field *flags = FieldOf(record, field);
    return {.keep = Keep::kBits, .field = flags, .mask = BitsOf(*flags, flag)};
}
consteval Place NotBits(const Record &record, std::string_view field, std::string_view flag,
                        uint32_t whenSet = 0) {
    const Field *flags = FieldOf(record, field);
    return {.keep = Keep::kNotBits, .field = flags, .mask = BitsOf(*flags, flag), .whenSet = whenSet};
}
consteval Place Literal(const Record &record, std::string_view whenTrue, std::string_view whenFalse) {
    return {.keep = Keep::kLiteral,
            .field = &record.fields.front(),
            .whenTrue = whenTrue,
            .whenFalse = whenFalse};
}
consteval Place Exactly(const Record &record, std::string_view field, uint32_t number) {
    return {.keep = Keep::kExactly, .field = FieldOf(record, field), .mask = number};
}
consteval Place Decimal(const Record &record, std::string_view field) {
    return {.keep = Keep::kDecimal, .field = FieldOf(record, field)};
}
/// Instances: every member has its place in the element.
consteval Place Elements(const Record &record, std::string_view part) {
    return {.keep = Keep::kElements, .part = PartOf(record, part), .record = &record};
}
/// A list of texts, each in the field `field` of its element.
consteval Place Elements(const Record &record, std::string_view part, std::string_view field,
                         std::string_view index = "") {
    const Part *found = PartOf(record, part);
    return {.keep = Keep::kElements,
            .field = FieldOf(*found->element, field),
            .part = found,
            .index = index.empty() ? nullptr : FieldOf(*found->element, index),
            .record = &record};
}
consteval Place Slots(const Record &record, std::string_view part, std::string_view field,
                      std::string_view count, std::string_view after = "") {
    const Part *found = PartOf(record, part);
    return {.keep = Keep::kSlots,
            .field = FieldOf(*found->element, field),
            .part = found,
            .count = FieldOf(record, count),
            .after = after.empty() ? nullptr : FieldOf(record, after),
            .record = &record};
}
consteval Place GroupIn(const Record &record, std::string_view field, std::string_view flag) {
    const Field *flags = FieldOf(record, field);
    return {.keep = Keep::kGroup, .field = flags, .whenSet = BitsOf(*flags, flag)};
}
/// `place` while the bits `condition` of the flags are `value`.
consteval Place While(Place place, const Record &record, std::string_view flags, uint32_t condition,
                      uint32_t value) {
    place.flags = FieldOf(record, flags);
    place.condition = condition;
    place.value = value;
    return place;
}

} // namespace dvs::layout

#endif
