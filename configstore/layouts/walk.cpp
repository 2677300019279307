/* SPDX-License-Identifier: Apache-2.0 */
// The walk over a value by its record (walk.h).

#include "configstore/layouts/walk.h"

#include <algorithm>
#include <cstdio>
#include <vector>

#include <arpa/inet.h>

namespace dvs::layout {
namespace {

uint64_t NumberOf(std::span<const uint8_t> bytes) {
    uint64_t number = 0;
    std::memcpy(&number, bytes.data(), std::min(bytes.size(), sizeof number));
    return number;
}

// A field that says how many elements of a later part belong to its record.
struct Share {
    uint64_t count;
    const Field *field;
    const layout::Record *record;
    std::span<const uint8_t> fields; // of the record
};

// One walk: what is left of the value, and the kShare fields so far.
class Walker {
public:
    Walker(std::span<const uint8_t> value, const std::function<void(const Item &)> &visit)
        : value_(value), visit_(visit) {}

    bool Record(const layout::Record &record, const std::string &prefix) {
        const std::size_t start = at_;
        for (const Field &field : record.fields) {
            if (!One(field, prefix)) return false;
        }
        const auto fields = value_.subspan(start, at_ - start);
        for (const Field &field : record.fields) {
            if (field.kind == Kind::kShare)
                shares_.push_back({FieldOf(record, fields, field.name), &field, &record, fields});
        }
        return std::all_of(record.parts.begin(), record.parts.end(),
                           [&](const Part &part) { return Elements(record, part, fields, prefix); });
    }

    [[nodiscard]] std::span<const uint8_t> Rest() const { return value_.subspan(at_); }
    [[nodiscard]] std::size_t at() const { return at_; }
    Fault fault;

private:
    bool Fail(const std::string &what) {
        fault = {true, static_cast<uint32_t>(value_.size()), what};
        return false;
    }

    bool One(const Field &field, const std::string &prefix) {
        const std::size_t width = field.width ? field.width : Rest().size();
        if (Rest().size() < width) return Fail("ends inside " + prefix + field.name);
        const auto bytes = value_.subspan(at_, width);
        visit_({prefix + field.name, static_cast<uint32_t>(at_), bytes, &field});
        at_ += width;
        return true;
    }

    static uint64_t FieldOf(const layout::Record &record, std::span<const uint8_t> fields, const char *name) {
        const Field *field = Find(record, name);
        return NumberOf(fields.subspan(field->offset, field->width));
    }

    uint64_t Count(const layout::Record &record, const Part &part, std::span<const uint8_t> fields) const {
        if (part.gate && !(FieldOf(record, fields, part.gateField) & part.gate)) return 0;
        switch (part.countBy) {
        case CountBy::kFixed:
            return part.count;
        case CountBy::kField:
            return FieldOf(record, fields, part.field);
        case CountBy::kShare: {
            uint64_t count = 0;
            for (const Share &share : shares_)
                count += share.count;
            return count;
        }
        case CountBy::kRest:
            break;
        }
        return Rest().size() / part.element->size;
    }

    bool Elements(const layout::Record &record, const Part &part, std::span<const uint8_t> fields,
                  const std::string &prefix) {
        const uint64_t count = Count(record, part, fields);
        if (count > Rest().size() / part.element->size) {
            return Fail(prefix + part.name + " is said to have " + std::to_string(count) + " elements, " +
                        std::to_string(Rest().size()) + " bytes are left for them");
        }
        std::size_t share = 0;
        uint64_t left = share < shares_.size() ? shares_[share].count : 0;
        for (uint64_t i = 0; i < count; ++i) {
            const layout::Record *element = part.element;
            if (!part.variants.empty()) {
                while (left == 0)
                    left = shares_[++share].count;
                --left;
                element = &ElementOf(part, shares_[share]);
            }
            if (!Record(*element, prefix + part.name + "[" + std::to_string(i) + "].")) return false;
        }
        return true;
    }

    static const layout::Record &ElementOf(const Part &part, const Share &share) {
        for (const Variant &variant : part.variants) {
            if (std::string_view(variant.share) == share.field->name &&
                FieldOf(*share.record, share.fields, variant.field) == variant.value)
                return *variant.element;
        }
        return *part.element;
    }

    std::span<const uint8_t> value_;
    const std::function<void(const Item &)> &visit_;
    std::size_t at_ = 0;
    std::vector<Share> shares_;
};

std::string Hex(std::span<const uint8_t> bytes) {
    constexpr std::size_t kMost = 32;
    std::string text;
    char digits[4];
    for (const uint8_t byte : bytes.first(std::min(bytes.size(), kMost))) {
        std::snprintf(digits, sizeof digits, text.empty() ? "%02x" : " %02x", byte);
        text += digits;
    }
    return bytes.size() > kMost ? text + " ..." : text;
}

std::string Quoted(std::span<const uint8_t> bytes) {
    std::string text = "\"";
    for (const uint8_t byte : bytes) {
        if (byte == 0) return text + "\"";
        const bool plain = byte >= 0x20 && byte < 0x7f && byte != '"' && byte != '\\';
        char escape[8];
        std::snprintf(escape, sizeof escape, plain ? "%c" : "\\x%02x", byte);
        text += escape;
    }
    return text + "\" without NUL";
}

std::string SignedText(std::span<const uint8_t> bytes) {
    const std::size_t unused = 64 - 8 * bytes.size();
    return std::to_string(static_cast<int64_t>(NumberOf(bytes) << unused) >> unused);
}

std::string FlagsText(uint64_t number, const Domain &domain) {
    char text[24];
    std::snprintf(text, sizeof text, "0x%llx", static_cast<unsigned long long>(number));
    std::string result = text;
    for (const Flag &flag : domain.flags) {
        if (number & flag.bit) result += std::string(" ") + flag.name;
    }
    return result;
}

const char *EnumTextOf(uint64_t number, const Domain &domain) {
    return number < domain.textCount ? domain.texts[number] : nullptr;
}

std::string AddressText(int family, std::span<const uint8_t> bytes) {
    char text[INET6_ADDRSTRLEN] = {};
    (void)inet_ntop(family, bytes.data(), text, sizeof text); // large enough for both families
    return text;
}

std::string TextOfAddress(std::span<const uint8_t> bytes) {
    const auto rest = bytes.subspan(4);
    const bool isIpv4 = std::all_of(rest.begin(), rest.end(), [](uint8_t byte) { return byte == 0; });
    return isIpv4 ? AddressText(AF_INET, bytes) : AddressText(AF_INET6, bytes);
}

std::string TextOfTagged(std::span<const uint8_t> bytes) {
    return AddressText(bytes[0] ? AF_INET6 : AF_INET, bytes.subspan(4));
}

} // namespace

Fault Walk(const Record &record, std::span<const uint8_t> value,
           const std::function<void(const Item &)> &visit) {
    Walker walker(value, visit);
    if (walker.Record(record, "") && !walker.Rest().empty()) {
        visit({"(behind the record)", static_cast<uint32_t>(walker.at()), walker.Rest(), nullptr});
    }
    return walker.fault;
}

Fault Check(const Record &record, std::span<const uint8_t> value) {
    Fault unnamed;
    const Fault fault = Walk(record, value, [&](const Item &item) {
        if (unnamed.found || !item.field || item.field->kind != Kind::kEnum) return;
        const uint64_t number = NumberOf(item.bytes);
        if (!EnumTextOf(number, *item.field->domain)) {
            unnamed = {true, item.offset,
                       item.path + " is " + std::to_string(number) + ", which has no name"};
        }
    });
    return fault.found ? fault : unnamed;
}

std::string TextOf(const Item &item) {
    if (!item.field) return Hex(item.bytes);
    switch (item.field->kind) {
    case Kind::kSigned:
        return SignedText(item.bytes);
    case Kind::kBool:
        return NumberOf(item.bytes) ? "true" : "false";
    case Kind::kFlags:
        return FlagsText(NumberOf(item.bytes), *item.field->domain);
    case Kind::kEnum: {
        const char *name = EnumTextOf(NumberOf(item.bytes), *item.field->domain);
        return std::to_string(NumberOf(item.bytes)) + " " + (name ? name : "(no name)");
    }
    case Kind::kMagic:
        return FlagsText(NumberOf(item.bytes), {});
    case Kind::kText:
    case Kind::kLiteral:
        return Quoted(item.bytes);
    case Kind::kIpv4:
        return AddressText(AF_INET, item.bytes);
    case Kind::kAddress:
        return TextOfAddress(item.bytes);
    case Kind::kTagged:
        return TextOfTagged(item.bytes);
    case Kind::kOpaque:
    case Kind::kReserved:
        return Hex(item.bytes);
    case Kind::kUnsigned:
    case Kind::kCount:
    case Kind::kShare:
        break;
    }
    return std::to_string(NumberOf(item.bytes));
}

} // namespace dvs::layout
