/* SPDX-License-Identifier: Apache-2.0 */
// The read-only cursor of buffer_view.h. Its checks are in the order of the deserializer's
// (buffer_reader.cpp); a test compares the two on damaged buffers.

#include "dvsdata/buffer_view.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>

namespace dvs::data {
namespace {

struct FaultRow {
    const char *text;
    HYP_ReturnStatus status;
    const char *numbers; // format of found and expected
};

// In the order of FaultKind.
constexpr std::array<FaultRow, 9> kFaults{{
    {"no fault", HYP_OK, ""},
    {"fewer bytes than a header and an end marker", HYP_BAD_PARAM, " (%u bytes, at least %u needed)"},
    {"total length in the header is too small", HYP_BAD_PARAM, " (%u, at least %u needed)"},
    {"total length in the header exceeds the buffer", HYP_BAD_PARAM, " (%u, the buffer has %u bytes)"},
    {"unknown format version", HYP_BAD_PARAM, " (%u instead of %u)"},
    {"checksum does not match", HYP_BAD_CHECKSUM, " (0x%x stored, 0x%x computed)"},
    {"entry runs past the end of its buffer", HYP_BAD_PARAM, " (size %u, %u bytes left)"},
    {"entry size and value length do not fit each other", HYP_BAD_PARAM, " (value length %u, entry size %u)"},
    {"end marker is missing", HYP_BAD_PARAM, " (%u bytes left, %u needed)"},
}};

const FaultRow &Row(FaultKind kind) {
    return kFaults[static_cast<std::size_t>(kind)];
}

Fault CheckHeader(Bytes bytes, const HeaderView &header, std::size_t base) {
    const auto size = static_cast<std::uint32_t>(bytes.size());
    if (bytes.size() < kMinBufferSize)
        return {FaultKind::TooShort, base + bytes.size(), size, kMinBufferSize};
    const std::size_t length = base + kTotalLengthOffset;
    if (header.totalLength < kMinBufferSize)
        return {FaultKind::LengthTooSmall, length, header.totalLength, kMinBufferSize};
    if (header.totalLength > bytes.size())
        return {FaultKind::LengthTooLarge, length, header.totalLength, size};
    if (header.version != kFormatVersion)
        return {FaultKind::Version, base + kVersionOffset, header.version, kFormatVersion};
    return {};
}

} // namespace

const char *Fault::Text() const {
    return Row(kind).text;
}

HYP_ReturnStatus Fault::Status() const {
    return Row(kind).status;
}

bool Fault::Describe(std::span<char> out) const {
    if (out.empty()) return false;
    int length = std::snprintf(out.data(), out.size(), "%s", Text());
    const auto used = static_cast<std::size_t>(length);
    if (used < out.size()) {
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wformat-nonliteral" // One of the rows above.
        length += std::snprintf(out.data() + used, out.size() - used, Row(kind).numbers, found, expected);
#pragma GCC diagnostic pop
    }
    return static_cast<std::size_t>(length) < out.size();
}

std::string_view EntryView::Name() const {
    const auto *const text = reinterpret_cast<const char *>(nameField.data());
    return {text, ::strnlen(text, nameField.empty() ? 0 : kMaxNameLen)};
}

BufferView::BufferView(Bytes bytes, std::size_t baseOffset) : bytes_(bytes), base_(baseOffset) {
    std::uint8_t fields[kHeaderSize] = {};
    if (!bytes.empty()) std::memcpy(fields, bytes.data(), std::min<std::size_t>(bytes.size(), kHeaderSize));
    header_ = {Load32(fields + kTotalLengthOffset), Load32(fields + kChecksumOffset),
               Load16(fields + kVersionOffset), Load16(fields + kReservedOffset)};
    headerFault_ = CheckHeader(bytes, header_, base_);
    if (headerFault_.kind == FaultKind::None || headerFault_.kind == FaultKind::Version) {
        bytes_ = bytes.first(header_.totalLength);
        computedChecksum_ = Checksum(bytes_);
        if (headerFault_.kind == FaultKind::None && computedChecksum_ != header_.checksum)
            headerFault_ = {FaultKind::Checksum, base_ + kChecksumOffset, header_.checksum,
                            computedChecksum_};
    }
    walking_ = headerFault_.kind == FaultKind::None;
    fault_ = headerFault_;
}

bool BufferView::WalkAnyway() {
    walking_ = headerFault_.kind == FaultKind::None || headerFault_.kind == FaultKind::Version ||
               headerFault_.kind == FaultKind::Checksum;
    return walking_;
}

void BufferView::Rewind() {
    offset_ = kHeaderSize;
    atEnd_ = false;
    fault_ = headerFault_;
    if (headerFault_.kind == FaultKind::None) walking_ = true;
}

bool BufferView::Stop(FaultKind kind, std::size_t offset, std::uint32_t found, std::uint32_t expected) {
    if (fault_.kind == FaultKind::None) fault_ = {kind, base_ + offset, found, expected};
    walking_ = false;
    return false;
}

bool BufferView::Next(EntryView *entry) {
    if (!walking_) return false;
    // `offset_` never passes the end: each entry's size is checked against the remaining bytes before the
    // step.
    const auto remaining = static_cast<std::uint32_t>(bytes_.size() - offset_);
    if (remaining < kMarkerSize) return Stop(FaultKind::NoMarker, offset_, remaining, kMarkerSize);
    const Bytes rest = bytes_.subspan(offset_);
    const std::uint32_t size = Load32(rest.data() + kEntrySizeOffset);
    if (size == 0) {
        atEnd_ = true;
        walking_ = false;
        return false;
    }
    if (size > remaining) return Stop(FaultKind::EntryTooLarge, offset_, size, remaining);
    const std::uint32_t dataLen = remaining >= kEntryFixedSize ? Load32(rest.data() + kDataLenOffset) : 0;
    if (dataLen > size || size - dataLen < kMinEntryRoom)
        return Stop(FaultKind::EntryLengths, offset_, dataLen, size);

    entry->offset = base_ + offset_;
    entry->size = size;
    entry->propType = Load32(rest.data() + kPropTypeOffset);
    entry->nameField = rest.subspan(kNameOffset, kNameSize);
    entry->value = rest.subspan(kEntryFixedSize, dataLen);
    entry->padding = rest.subspan(kEntryFixedSize + dataLen, size - kEntryFixedSize - dataLen);
    offset_ += size;
    return true;
}

Fault VerifyBuffer(Bytes bytes, std::size_t baseOffset) {
    BufferView view(bytes, baseOffset);
    EntryView entry;
    while (view.Next(&entry)) {
    }
    return view.FirstFault();
}

} // namespace dvs::data
