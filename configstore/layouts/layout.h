/* SPDX-License-Identifier: Apache-2.0 */
#ifndef CONFIGSTORE_LAYOUTS_LAYOUT_H
#define CONFIGSTORE_LAYOUTS_LAYOUT_H

// Binary records as data. A property's value is described once, by a table of fields and of the counted parts
// behind them; the table is what the converters take their offsets from (checked while they are compiled),
// and what the annotated hexdump, the display of raw bytes, docs/properties.md, the tests' random values and
// the fuzz targets read. Adding a field is adding one row. All numbers are little-endian; nothing is aligned.
//
// Lowest layer of configstore/: leans on nothing but the standard library.

#include <cstdint>
#include <cstring>
#include <span>
#include <string_view>

namespace dvs::layout {

enum class Kind : uint8_t {
    kUnsigned, // a number
    kSigned,   // a number in two's complement
    kBool,     // a number of which only "zero or not" matters
    kFlags,    // a number whose bits the domain names
    kEnum,     // a number whose values the domain names
    kMagic,    // a number that is always the same
    kCount,    // how many elements a part of this record has, or how many of its slots are in use
    kShare,    // how many elements of a part of the enclosing record belong to this one
    kText,     // NUL-terminated text in a slot of fixed size, or up to the value's end when the width is 0
    kLiteral,  // a text that takes one of a few stated values; no terminator is needed to tell them apart
    kIpv4,     // four bytes, network order
    kAddress,  // IPv4 in the first four bytes or IPv6 in all sixteen
    kTagged,   // an address behind a word whose first byte tells its kind, 0 for IPv4: 20 bytes
    kOpaque,   // bytes this library does not look into, up to the value's end
    kReserved, // carried as zero
};

struct Flag {
    uint32_t bit;
    const char *name;
    const char *meaning;
};

// The values a number may take: an exported enumeration table (its index is the value, an empty slot no
// value), or named bits.
struct Domain {
    const char *name;
    const char *const *texts;
    uint32_t textCount;
    std::span<const Flag> flags;
};

/// The slots of an enumeration table, as they are now: the tables are exported data.
inline std::span<const char *const> Texts(const Domain &domain) {
    return {domain.texts, domain.textCount};
}

struct Field {
    const char *name;
    uint32_t offset; // bytes from the start of the record
    uint32_t width;  // bytes; 0: up to the value's end
    Kind kind;
    const Domain *domain; // of an enumeration, of flags or of a literal, else null
    const char *meaning;
};

enum class CountBy : uint8_t {
    kFixed, // always `count` elements
    kField, // as many as the record's field `field` says
    kShare, // as many as the kShare fields of the elements before this part say together
    kRest,  // as many whole ones as are left in the value
};

struct Record;

// What some of the elements of a kShare part are instead: those that the field `share` counted, of an element
// whose field `field` has `value`. As large as the part's own element.
struct Variant {
    const char *share;
    const char *field;
    uint32_t value;
    const Record *element;
};

// Elements that follow a record's fields. `gate` (a mask of the field `gateField`) being clear means that
// there are none, whatever the count says.
struct Part {
    const char *name;
    const Record *element;
    CountBy countBy;
    uint32_t count;
    const char *field;
    const char *gateField;
    uint32_t gate;
    const char *meaning;
    std::span<const Variant> variants = {};
};

struct Record {
    const char *name;
    uint32_t size; // of the fields; the parts come behind it
    std::span<const Field> fields;
    std::span<const Part> parts;
};

constexpr const Field *Find(const Record &record, std::string_view name) {
    for (const Field &field : record.fields) {
        if (name == field.name) return &field;
    }
    return nullptr;
}

// Whether the rows of a record stand one behind the other without gap or overlap, fill its size, have names
// of their own, widths that fit their kinds, and parts that refer to fields there are.
consteval bool IsSound(const Record &record) {
    uint32_t end = 0;
    for (const Field &field : record.fields) {
        if (field.offset != end || Find(record, field.name) != &field) return false;
        const bool number = field.kind <= Kind::kShare;
        if (number && field.width != 1 && field.width != 2 && field.width != 4 && field.width != 8)
            return false;
        if (field.width == 0 && &field != &record.fields.back()) return false;
        const bool named =
            field.kind == Kind::kEnum || field.kind == Kind::kFlags || field.kind == Kind::kLiteral;
        if (named != (field.domain != nullptr)) return false;
        end += field.width;
    }
    for (const Part &part : record.parts) {
        if (part.countBy == CountBy::kField && !(part.field && Find(record, part.field))) return false;
        if (part.gate && !(part.gateField && Find(record, part.gateField))) return false;
    }
    return end == record.size;
}

// Where a number of type T stands in a record.
template <typename T> struct Slot {
    uint32_t offset;
    constexpr uint32_t End() const { return offset + sizeof(T); }
};

// Where a run of bytes (a text, an address) stands in a record.
struct Area {
    uint32_t offset, size;
};

// The place of a field by its name. A name the record lacks, or a type of another width than the row's, does
// not compile.
template <typename T> consteval Slot<T> At(const Record &record, std::string_view name) {
    const Field *field = Find(record, name);
    if (!field || field->width != sizeof(T)) throw "no such field of this width";
    return {field->offset};
}

consteval Area AreaOf(const Record &record, std::string_view name) {
    const Field *field = Find(record, name);
    if (!field) throw "no such field";
    return {field->offset, field->width};
}

// Copy helpers: a number out of and into bytes that the caller has checked to be there.
template <typename T> T Get(std::span<const uint8_t> bytes, Slot<T> slot) {
    T value;
    std::memcpy(&value, bytes.subspan(slot.offset, sizeof value).data(), sizeof value);
    return value;
}

template <typename T> void Put(std::span<uint8_t> bytes, Slot<T> slot, std::type_identity_t<T> value) {
    std::memcpy(bytes.subspan(slot.offset, sizeof value).data(), &value, sizeof value);
}

} // namespace dvs::layout

#endif
