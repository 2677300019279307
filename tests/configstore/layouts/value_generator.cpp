/* SPDX-License-Identifier: Apache-2.0 */
// Random values by their records (value_generator.h).

#include "configstore/layouts/value_generator.h"

#include <algorithm>
#include <cstring>

#include "configstore/layouts/walk.h"

namespace value_generator {

using dvs::layout::CountBy;
using dvs::layout::Field;
using dvs::layout::Kind;
using dvs::layout::Part;

namespace {

constexpr uint64_t kAbsurd[] = {0,          1,          2,          31,         32,         33,
                                0x7f,       0xff,       0x7fff,     0xffff,     0x01000000, 0x15555555,
                                0x7fffffff, 0x80000000, 0xfffffffe, 0xffffffff, UINT64_MAX};
constexpr uint64_t kMostElements = 4;
constexpr uint32_t kMagic = 0xFACEBEEF;

void PutNumber(std::vector<uint8_t> *bytes, std::size_t at, std::size_t width, uint64_t number) {
    std::memcpy(bytes->data() + at, &number, width);
}
uint64_t GetNumber(const std::vector<uint8_t> &bytes, std::size_t at, std::size_t width) {
    uint64_t number = 0;
    std::memcpy(&number, bytes.data() + at, width);
    return number;
}

} // namespace

std::string Generator::Text(std::size_t most) {
    std::string text(Below(OneIn(4) ? most + 1 : std::min<std::size_t>(most, 12) + 1), ' ');
    for (char &c : text)
        c = static_cast<char>('!' + Below(94));
    return text;
}

std::vector<uint8_t> Generator::Noise(std::size_t size) {
    std::vector<uint8_t> bytes(size);
    for (uint8_t &byte : bytes)
        byte = static_cast<uint8_t>(OneIn(3) ? 0 : Below(256));
    return bytes;
}

uint64_t Generator::Number(const Field &field) {
    const uint64_t any = OneIn(4) ? kAbsurd[Below(std::size(kAbsurd))] : random_();
    switch (field.kind) {
    case Kind::kBool:
        return Below(2);
    case Kind::kEnum: {
        uint64_t value = Below(field.domain->textCount);
        while (!field.domain->texts[value])
            value = Below(field.domain->textCount);
        return value;
    }
    case Kind::kFlags: {
        uint64_t bits = 0;
        for (const auto &flag : field.domain->flags)
            bits |= OneIn(2) ? flag.bit : 0;
        return bits;
    }
    case Kind::kMagic:
        return kMagic;
    case Kind::kCount:
    case Kind::kShare:
        return Below(kMostElements);
    case Kind::kReserved:
        return 0;
    default:
        return any;
    }
}

void Generator::Fields(const dvs::layout::Record &record, std::vector<uint8_t> *out) {
    for (const Field &field : record.fields) {
        const std::size_t at = out->size();
        if (field.kind == Kind::kText || field.kind == Kind::kLiteral) {
            const std::string text = field.kind == Kind::kLiteral
                                         ? field.domain->texts[Below(field.domain->textCount)]
                                         : Text(field.width ? field.width - 1 : 100);
            out->insert(out->end(), text.begin(), text.end());
            out->resize(at + (field.width ? field.width : text.size() + 1));
        } else if (field.kind == Kind::kOpaque || field.kind == Kind::kAddress ||
                   field.kind == Kind::kTagged || field.kind == Kind::kIpv4) {
            const auto bytes = Noise(field.width ? field.width : Below(40));
            out->insert(out->end(), bytes.begin(), bytes.end());
        } else {
            out->resize(at + field.width);
            if (field.kind != Kind::kReserved) PutNumber(out, at, field.width, Number(field));
        }
    }
}

void Generator::Record(const dvs::layout::Record &record, std::vector<uint8_t> *out,
                       std::vector<Share> *shares) {
    const std::size_t start = out->size();
    Fields(record, out);
    for (const Field &field : record.fields) {
        if (field.kind == Kind::kShare)
            shares->push_back({GetNumber(*out, start + field.offset, field.width), &field, &record, start});
    }
    for (const Part &part : record.parts) {
        if (part.countBy == CountBy::kShare) {
            Shared(part, *shares, out);
            continue;
        }
        uint64_t count = part.countBy == CountBy::kFixed ? part.count : Below(kMostElements);
        if (part.gate) {
            const Field *gate = Find(record, part.gateField);
            if (!(GetNumber(*out, start + gate->offset, gate->width) & part.gate)) count = 0;
        }
        if (part.countBy == CountBy::kField) {
            const Field *field = Find(record, part.field);
            PutNumber(out, start + field->offset, field->width, count);
        }
        for (uint64_t i = 0; i < count; ++i)
            Record(*part.element, out, shares);
    }
}

void Generator::Shared(const Part &part, const std::vector<Share> &shares, std::vector<uint8_t> *out) {
    for (const Share &share : shares) {
        const dvs::layout::Record *element = part.element;
        for (const auto &variant : part.variants) {
            const Field *field = Find(*share.record, variant.field);
            if (std::string_view(variant.share) == share.field->name &&
                GetNumber(*out, share.start + field->offset, field->width) == variant.value)
                element = variant.element;
        }
        for (uint64_t i = 0; i < share.count; ++i)
            Fields(*element, out);
    }
}

std::vector<uint8_t> Generator::Sound(const dvs::layout::Record &record) {
    std::vector<uint8_t> value;
    std::vector<Share> shares;
    Record(record, &value, &shares);
    return value;
}

void Generator::Lie(const dvs::layout::Record &record, std::vector<uint8_t> *value) {
    if (OneIn(4) || value->empty()) {
        const std::size_t size = value->size();
        if (OneIn(2)) {
            value->resize(Below(size + 1));
        } else {
            const auto more = Noise(Below(9));
            value->insert(value->end(), more.begin(), more.end());
        }
        return;
    }
    std::vector<dvs::layout::Item> items;
    (void)Walk(record, *value, [&](const dvs::layout::Item &item) { items.push_back(item); });
    if (items.empty()) return;
    // Items are views into the value, which keeps its size from here on.
    const auto &item = items[Below(items.size())];
    const bool isNumber = item.field && item.field->kind <= Kind::kShare;
    if (isNumber) {
        PutNumber(value, item.offset, item.field->width,
                  OneIn(2) ? kAbsurd[Below(std::size(kAbsurd))] : Below(40));
    } else {
        for (std::size_t i = 0; i < item.bytes.size(); ++i)
            (*value)[item.offset + i] = static_cast<uint8_t>('A' + Below(26));
    }
}

std::vector<uint8_t> Generator::Lying(const dvs::layout::Record &record) {
    std::vector<uint8_t> value = Sound(record);
    for (uint64_t lies = 1 + Below(3); lies; --lies)
        Lie(record, &value);
    return value;
}

std::vector<std::size_t> SizesOf(const dvs::layout::Record &record) {
    std::vector<std::size_t> sizes = {0};
    for (const Field &field : record.fields)
        sizes.push_back(field.offset + field.width);
    for (const Part &part : record.parts) {
        const auto elements = SizesOf(*part.element);
        const std::size_t most = part.countBy == CountBy::kFixed ? part.count : 3;
        for (std::size_t i = 0; i < most; ++i) {
            for (const std::size_t size : elements)
                sizes.push_back(record.size + i * part.element->size + size);
        }
    }
    std::sort(sizes.begin(), sizes.end());
    sizes.erase(std::unique(sizes.begin(), sizes.end()), sizes.end());
    return sizes;
}

} // namespace value_generator
